#include "ControlStreamClient/SendQueue.h"

#include <gtest/gtest.h>

namespace {

using ControlStream::VSendQueue;
using namespace std::string_literals;

std::string BytesOf(const VSendQueue& queue)
{
    return {queue.Data(), queue.Size()};
}

TEST(SendQueue, HoldsFramesAsOneRunOfBytes)
{
    VSendQueue queue;
    EXPECT_TRUE(queue.IsEmpty());

    queue.Add("ab");
    queue.Add("");

    EXPECT_FALSE(queue.IsEmpty());
    EXPECT_EQ("\x02\0\0\0"
              "ab\0\0\0\0"s,
              BytesOf(queue));
}

TEST(SendQueue, GoesOnBehindWhatHasLeft)
{
    VSendQueue queue;
    queue.Add("abc");

    queue.Advance(5);

    EXPECT_EQ("bc", BytesOf(queue));
    queue.Advance(2);
    EXPECT_TRUE(queue.IsEmpty());
}

TEST(SendQueue, TakesBackWholeFramesOnly)
{
    VSendQueue queue;
    queue.Add("a");
    queue.Add("bc");
    queue.Add("d");

    queue.Advance(5);
    EXPECT_TRUE(VSendQueue(queue).DropUnsent()) << "one frame has left whole";
    queue.Advance(1);
    EXPECT_FALSE(queue.DropUnsent()) << "the second has begun to leave";

    EXPECT_EQ("\0\0\0bc"s, BytesOf(queue));
    queue.Advance(5);
    EXPECT_TRUE(queue.IsEmpty());
    EXPECT_TRUE(queue.DropUnsent());
}

TEST(SendQueue, KeepsItsPlaceWhenItCutsOffWhatHasLeft)
{
    VSendQueue queue;
    queue.Add(std::string(70000, 'x'));
    queue.Add("second");
    queue.Add("third");

    queue.Advance(70004); // more than is worth keeping

    EXPECT_TRUE(VSendQueue(queue).DropUnsent());
    queue.Advance(7);
    EXPECT_FALSE(queue.DropUnsent());
    EXPECT_EQ("ond", BytesOf(queue));
}

} // namespace
