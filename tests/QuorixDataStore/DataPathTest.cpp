#include "QuorixDataStore/DataPath.h"

#include <gtest/gtest.h>

#include <map>
#include <set>
#include <string>
#include <unordered_set>
#include <utility>
#include <vector>

namespace {

std::vector<std::string> Components(const VDataPath& path)
{
    std::vector<std::string> components;
    for (std::size_t index = 0; index < path.Count(); ++index) {
        components.emplace_back(path.Component(index));
    }
    return components;
}

using Texts = std::vector<std::string>;

TEST(DataPath, EmptyPathHasNoComponentsAndTheEmptyText)
{
    const VDataPath path;

    EXPECT_TRUE(path.Empty());
    EXPECT_EQ(0u, path.Count());
    EXPECT_EQ("", path.Text());
    EXPECT_EQ("", path.Last());
    EXPECT_FALSE(path.HasWildcard());
}

TEST(DataPath, SplittingDropsEmptyPieces)
{
    for (const char* text : {"A.B", "A..B", ".A.B", "A.B.", "...A...B..."}) {
        EXPECT_EQ((Texts{"A", "B"}), Components(VDataPath(text))) << text;
    }
    for (const char* text : {"", ".", "..."}) {
        EXPECT_TRUE(VDataPath(text).Empty()) << text;
    }
}

TEST(DataPath, AssigningATextClearsThePath)
{
    VDataPath path("A.*.C");

    path = "X.Y";

    EXPECT_EQ((Texts{"X", "Y"}), Components(path));
    EXPECT_FALSE(path.HasWildcard());
}

TEST(DataPath, MayBeAssignedAPartOfItself)
{
    VDataPath path{"A.B", "C"};

    path = path.Component(0);

    EXPECT_EQ((Texts{"A", "B"}), Components(path));
}

TEST(DataPath, ListsKeepEmptyAndDottedComponents)
{
    const VDataPath path{"A", "", "b.c"};

    EXPECT_EQ((Texts{"A", "", "b.c"}), Components(path));
    EXPECT_EQ("A..b.c", path.Text());
    EXPECT_EQ(path, VDataPath(Texts{"A", "", "b.c"}));
    EXPECT_NE(path, VDataPath("A.b.c"));
}

TEST(DataPath, AppendsToAParent)
{
    EXPECT_EQ("Device.qx:17", VDataPath(VDataPath("Device"), "qx:17").Text());
    EXPECT_EQ("qx:17", VDataPath(VDataPath(), std::string("qx:17")).Text());
    EXPECT_TRUE(VDataPath(VDataPath("A"), "*").HasWildcard());
}

TEST(DataPath, CopiesAreIndependent)
{
    VDataPath original("A.B");
    VDataPath copy(original);
    VDataPath assigned;
    assigned = original;

    original.Append("C");
    copy.Replace(0, "X");
    assigned.RemoveLast();

    EXPECT_EQ("A.B.C", original.Text());
    EXPECT_EQ("X.B", copy.Text());
    EXPECT_EQ("A", assigned.Text());
}

TEST(DataPath, MovedFromPathIsEmpty)
{
    VDataPath original("A.B");

    VDataPath moved(std::move(original));
    original = VDataPath("C"); // a moved-from path may be used again
    VDataPath second;
    second = std::move(original);

    EXPECT_EQ("A.B", moved.Text());
    EXPECT_EQ("C", second.Text());
}

TEST(DataPath, AssigningToItselfKeepsThePath)
{
    VDataPath path("A.B");
    VDataPath& same = path;

    path = same;
    EXPECT_EQ("A.B", path.Text());
    path = std::move(same);
    EXPECT_EQ("A.B", path.Text());
}

TEST(DataPath, TenComponentsAreNoLimit)
{
    VDataPath path;
    std::string text;
    for (int index = 0; index < 100; ++index) {
        path.Append("C" + std::to_string(index));
        text += (index == 0 ? "C" : ".C") + std::to_string(index);
    }

    EXPECT_EQ(100u, path.Count());
    EXPECT_EQ(text, path.Text());
    EXPECT_EQ(path, VDataPath(text));
}

TEST(DataPath, AppendsItsOwnComponentsAndItself)
{
    VDataPath path("A.B");

    path.Append(path.Component(0));
    path.Append(path);

    EXPECT_EQ("A.B.A.A.B.A", path.Text());
}

TEST(DataPath, AppendingAPathJoinsTheWildcards)
{
    VDataPath path("A");
    path.Append(VDataPath("B"));
    EXPECT_FALSE(path.HasWildcard());

    path.Append(VDataPath("*.C"));
    EXPECT_TRUE(path.HasWildcard());

    path.Append(VDataPath("D"));
    path.Append(VDataPath());
    EXPECT_TRUE(path.HasWildcard());
    EXPECT_EQ("A.B.*.C.D", path.Text());
}

TEST(DataPath, WildcardIsAComponentOfOneStar)
{
    EXPECT_TRUE(VDataPath("*").HasWildcard());
    EXPECT_EQ(1u, VDataPath("*").Count());
    EXPECT_TRUE(VDataPath("A.*.C").HasWildcard());
    EXPECT_FALSE(VDataPath("A.**.C").HasWildcard());
    EXPECT_FALSE(VDataPath("A*.*B").HasWildcard());
}

TEST(DataPath, ReplacingKeepsTheWildcardExact)
{
    VDataPath path("A.*.C");

    path.Replace(2, "D");
    EXPECT_TRUE(path.HasWildcard());
    EXPECT_EQ("A.*.D", path.Text());

    path.Replace(1, "B");
    EXPECT_FALSE(path.HasWildcard());
    EXPECT_EQ("A.B.D", path.Text());

    path.Replace(0, "*");
    EXPECT_TRUE(path.HasWildcard());
}

TEST(DataPath, CuttingKeepsTheWildcardExact)
{
    VDataPath path("A.*.C.*");

    path.RemoveLast();
    EXPECT_TRUE(path.HasWildcard());
    path.Resize(2);
    EXPECT_TRUE(path.HasWildcard());
    path.Resize(1);
    EXPECT_FALSE(path.HasWildcard());
    path.RemoveLast();
    EXPECT_TRUE(path.Empty());
}

TEST(DataPath, ResizingExtendsByEmptyComponents)
{
    VDataPath path("A");

    path.Resize(3);

    EXPECT_EQ((Texts{"A", "", ""}), Components(path));
}

TEST(DataPath, LastComponent)
{
    EXPECT_EQ("C", VDataPath("A.B.C").Last());
    EXPECT_EQ("A", VDataPath("A").Last());
}

TEST(DataPath, EqualityHasNoWildcards)
{
    EXPECT_EQ(VDataPath("A.*"), VDataPath("A.*"));
    EXPECT_NE(VDataPath("A.*"), VDataPath("A.B"));
    EXPECT_EQ(VDataPath(), VDataPath(""));
    EXPECT_NE(VDataPath(), VDataPath("A"));
    EXPECT_NE((VDataPath{"a", "b.c"}), (VDataPath{"a.b", "c"}));
    EXPECT_NE((VDataPath{""}), VDataPath());
}

TEST(DataPath, OrdersByBytesAndPrefixesFirst)
{
    // clang-format off
    const std::vector<VDataPath> ascending = {
        VDataPath(),
        VDataPath("*"),
        VDataPath("A"),
        VDataPath("A.A"),
        VDataPath("A.B"),
        VDataPath{"A-B"},       // '-' is less than '.', and still the component decides
        VDataPath("AA"),
        VDataPath("AA.A"),
        VDataPath("a"),
        VDataPath{"\xC3\xA9"},  // bytes are unsigned here
    };
    // clang-format on
    for (std::size_t left = 0; left < ascending.size(); ++left) {
        for (std::size_t right = 0; right < ascending.size(); ++right) {
            EXPECT_EQ(left < right, ascending[left] < ascending[right])
                << ascending[left].Text() << " and " << ascending[right].Text();
        }
    }
}

TEST(DataPath, HasAQuickHashOfItsTextAlone)
{
    VDataPath appended("A.Long");
    appended.Append("Component"); // with room to spare, and a block of its own

    EXPECT_EQ(VDataPath("A.Long.Component").QuickHash(), appended.QuickHash());
    EXPECT_EQ(0u, VDataPath().QuickHash());
    std::set<std::size_t> hashes;
    for (int camera = 0; camera < 1000; ++camera) {
        hashes.insert(VDataPath("Device.qx:" + std::to_string(camera) + ".Settings.StrobeIntensity")
                          .QuickHash());
    }
    EXPECT_EQ(1000u, hashes.size());
}

TEST(DataPath, HashFoldsSignedBytesAndThenComponents)
{
    EXPECT_EQ(0u, VDataPath().Hash());
    EXPECT_EQ(0x9e3779b9u, (VDataPath{""}).Hash());
    EXPECT_EQ(0x13c6ef3b3u, VDataPath("A").Hash());
    EXPECT_EQ(0x519b296ed3u, VDataPath("A.B").Hash());
    EXPECT_EQ(0x519b296e14u, VDataPath("B.A").Hash());
    EXPECT_EQ(0xd53465917194e5beu, VDataPath("Device.qx:17.Settings.StrobeIntensity").Hash());
    EXPECT_EQ(0x296bcc35d8u, (VDataPath{"\xFF\x80"}).Hash());
    EXPECT_EQ(0xeb0c48da4c8152e8u, (VDataPath{"Control", "a.b"}).Hash());
}

TEST(DataPath, LivesInUnorderedContainers)
{
    const std::unordered_set<VDataPath> paths{VDataPath("A.B"), VDataPath("A"), VDataPath("A.B")};

    EXPECT_EQ(2u, paths.size());
    EXPECT_EQ(1u, paths.count(VDataPath("A")));
}

struct VMatchCase
{
    const char* left;
    const char* right;
    bool matches;
};

TEST(DataPath, MatchesWithWildcards)
{
    // clang-format off
    const VMatchCase matchCases[] = {
        {"",        "",      false},
        {"",        "*",     false},
        {"*",       "",      false},
        {"A",       "A",     true},
        {"A",       "B",     false},
        {"A.*",     "A.B",   true},
        {"A.*",     "A.B.C", true},
        {"A.*",     "A",     false},
        {"A.B",     "A.C.D", false},
        {"A.B",     "A.B.C", false},
        {"A.*.C",   "A.X.C", true},
        {"A.*.C",   "A.X.D", false},
        {"A.*.C",   "A.C",   false},
        {"A.*.C",   "A.X.Y.C", false},
        {"*",       "A.B.C", true},
        {"A.*.*",   "A.B",   false},
        {"A.*.*",   "A.B.C.D", true},
        {"A.*",     "*.B",   true},
        {"A.*",     "*",     true},
        {"*.B.*",   "A.B.C.D", true},
    };
    // clang-format on
    for (const VMatchCase& match : matchCases) {
        EXPECT_EQ(match.matches, VDataPath(match.left).Matches(VDataPath(match.right)))
            << match.left << " and " << match.right;
        EXPECT_EQ(match.matches, VDataPath(match.right).Matches(VDataPath(match.left)))
            << match.right << " and " << match.left;
    }
}

TEST(DataPath, StartsWithKnowsNoWildcards)
{
    EXPECT_TRUE(VDataPath("A.B").StartsWith(VDataPath("A")));
    EXPECT_TRUE(VDataPath("A.B").StartsWith(VDataPath("A.B")));
    EXPECT_TRUE(VDataPath("A.B").StartsWith(VDataPath()));
    EXPECT_FALSE(VDataPath("A.B").StartsWith(VDataPath("A.B.C")));
    EXPECT_FALSE(VDataPath("A.B").StartsWith(VDataPath("*")));
    EXPECT_FALSE(VDataPath("AB.C").StartsWith(VDataPath("A")));
}

TEST(DataPath, WithoutWildcardsDropsStars)
{
    EXPECT_EQ(VDataPath("A.C"), VDataPath("A.*.C.*").WithoutWildcards());
    EXPECT_EQ(VDataPath(), VDataPath("*.*").WithoutWildcards());
    EXPECT_EQ(VDataPath("A.B"), VDataPath("A.B").WithoutWildcards());
    EXPECT_FALSE(VDataPath("A.*").WithoutWildcards().HasWildcard());
}

TEST(DataPath, CommonPrefixIsTheLongestSharedRun)
{
    EXPECT_EQ(VDataPath("A.B"), VDataPath("A.B.C").CommonPrefix(VDataPath("A.B.D")));
    EXPECT_EQ(VDataPath("A.B"), VDataPath("A.B").CommonPrefix(VDataPath("A.B.D")));
    EXPECT_EQ(VDataPath(), VDataPath("A").CommonPrefix(VDataPath("B.A")));
    EXPECT_EQ(VDataPath("A"), VDataPath("A.*").CommonPrefix(VDataPath("A.B")));
    EXPECT_EQ(VDataPath("A.*"), VDataPath("A.*.X").CommonPrefix(VDataPath("A.*.Y")));
}

TEST(DataPath, LeftPartBeyondTheCountIsEmpty)
{
    const VDataPath path("A.*.C");

    EXPECT_EQ(VDataPath(), path.Left(0));
    EXPECT_EQ(VDataPath("A"), path.Left(1));
    EXPECT_FALSE(path.Left(1).HasWildcard());
    EXPECT_EQ(path, path.Left(3));
    EXPECT_EQ(VDataPath(), path.Left(4));
}

TEST(DataPath, SubRangeThatIsNoneIsEmpty)
{
    const VDataPath path("A.B.*.D");

    EXPECT_EQ(VDataPath("B.*"), path.SubRange(1, 3));
    EXPECT_TRUE(path.SubRange(1, 3).HasWildcard());
    EXPECT_FALSE(path.SubRange(0, 2).HasWildcard());
    EXPECT_EQ(path, path.SubRange(0, 4));
    EXPECT_EQ(VDataPath(), path.SubRange(2, 2));
    EXPECT_EQ(VDataPath(), path.SubRange(3, 2));
    EXPECT_EQ(VDataPath(), path.SubRange(4, 4));
    EXPECT_EQ(VDataPath(), path.SubRange(2, 5));
}

TEST(DataPath, ShrinkingChangesNothingToBeSeen)
{
    VDataPath path;
    for (int index = 0; index < 7; ++index) {
        path.Append("component");
    }
    const VDataPath copy(path);

    path.ShrinkToFit();

    EXPECT_EQ(copy, path);
    EXPECT_EQ(copy.Text(), path.Text());
}

TEST(DataPathDeathTest, IndexOutOfRangeIsAFault)
{
#ifdef NDEBUG
    EXPECT_EQ("", VDataPath("A").Component(1));
#else
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    EXPECT_DEATH(VDataPath("A").Component(1), "");
#endif
}

} // namespace
