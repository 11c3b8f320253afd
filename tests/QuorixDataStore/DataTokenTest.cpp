#include "QuorixDataStore/DataToken.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <unordered_set>
#include <utility>
#include <vector>

namespace {

TEST(DataToken, OfAPathHasNoNumbersYet)
{
    const VDataToken token(VDataPath("A.B"));

    EXPECT_TRUE(token.IsValid());
    EXPECT_EQ(VDataPath("A.B"), token.GetPath());
    EXPECT_EQ(0u, token.GetNumbers().StoreIdentifier);
    EXPECT_EQ(0u, token.GetNumbers().ItemIdentifier);
}

TEST(DataToken, OfAnEmptyOrWildcardPathIsEmpty)
{
    for (const char* text : {"", "*", "A.*", "A.*.C"}) {
        const VDataToken token{VDataPath(text)};
        EXPECT_FALSE(token.IsValid()) << text;
        EXPECT_EQ(0u, token.GetPath().Count()) << text;

        const VDataToken numbered(VDataPath(text), 1, 2);
        EXPECT_FALSE(numbered.IsValid()) << text;
        EXPECT_EQ(0u, numbered.GetNumbers().ItemIdentifier) << text;
    }
}

TEST(DataToken, TakesThePathOver)
{
    VDataPath path("A.B");

    const VDataToken token(std::move(path));

    EXPECT_EQ("A.B", token.GetPath().Text());
}

TEST(DataToken, CopiesAndMovesWithItsNumbers)
{
    const VDataToken token(VDataPath("A"), 7, 8);

    VDataToken copy(token);
    VDataToken assigned;
    assigned = copy;
    VDataToken moved(std::move(copy));

    EXPECT_EQ(8u, assigned.GetNumbers().ItemIdentifier);
    EXPECT_EQ(7u, moved.GetNumbers().StoreIdentifier);
    EXPECT_EQ("A", moved.GetPath().Text());
}

TEST(DataToken, OrdersAndHashesAsItsPath)
{
    const VDataToken a(VDataPath("A"), 9, 9);
    const VDataToken b(VDataPath("B"), 1, 1);

    EXPECT_LT(a, b);
    EXPECT_EQ(a, VDataToken(VDataPath("A")));
    EXPECT_NE(a, b);
    EXPECT_EQ(std::hash<VDataToken>()(a), std::hash<VDataPath>()(VDataPath("A")));
}

TEST(DataToken, NumbersNeverTearBetweenThreads)
{
    const VDataToken token(VDataPath("A"));
    std::atomic<bool> stop{false};
    std::atomic<bool> torn{false};
    std::vector<std::thread> threads;
    for (std::uint64_t writer = 1; writer <= 2; ++writer) {
        threads.emplace_back([&token, writer] {
            for (std::uint64_t round = 0; round < 20000; ++round) {
                token.SetNumbers({round * 2 + writer, round * 2 + writer, writer == 1});
            }
        });
    }
    for (int reader = 0; reader < 2; ++reader) {
        threads.emplace_back([&] {
            while (!stop) {
                const VDataTokenNumbers numbers = token.GetNumbers();
                const bool whole = numbers.StoreIdentifier == numbers.ItemIdentifier &&
                                   (numbers.StoreIdentifier == 0 ||
                                    numbers.OfPath == (numbers.ItemIdentifier % 2 == 1));
                torn = torn || !whole;
            }
        });
    }

    threads[0].join();
    threads[1].join();
    stop = true;
    threads[2].join();
    threads[3].join();

    EXPECT_FALSE(torn);
}

} // namespace
