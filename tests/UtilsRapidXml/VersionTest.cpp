#include "UtilsRapidXml/IVersion.h"

#include <gtest/gtest.h>

#include <sstream>

using namespace UtilsRapidXml;

namespace {

const IVersion unset;
const IVersion v1{1, 0};
const IVersion v2{2, 0};
const IVersion v3{3, 0};

struct VVersionCase
{
    const char* Text;
    IVersion Version;
};

// clang-format off
const VVersionCase versionCases[] = {
    {"2.0",          {2, 0}},
    {"0.0",          {0, 0}},
    {"10.25",        {10, 25}},
    {"02.00",        {2, 0}},
    {"2147483647.1", {2147483647, 1}},
    {"2147483648.1", unset},
    {"",             unset},
    {"2",            unset},
    {"2.",           unset},
    {".0",           unset},
    {"2.0.0",        unset},
    {" 2.0",         unset},
    {"2.0 ",         unset},
    {"-2.0",         unset},
    {"2.-1",         unset},
    {"+2.0",         unset},
    {"2,0",          unset},
    {"two",          unset},
};
// clang-format on

TEST(Version, IsReadWholeOrNotAtAll)
{
    for (const VVersionCase& row : versionCases) {
        EXPECT_EQ(ParseVersion(row.Text).value_or(unset), row.Version) << row.Text;
    }
}

TEST(Version, IsOrderedByItsMajorPartFirst)
{
    EXPECT_TRUE((IVersion{1, 9}) < (IVersion{2, 0}));
    EXPECT_TRUE((IVersion{2, 0}) < (IVersion{2, 1}));
    EXPECT_FALSE((IVersion{2, 1}) < (IVersion{2, 1}));
    EXPECT_TRUE((IVersion{2, 1}) != (IVersion{2, 0}));
}

TEST(Version, AnUnsetOneHasNoText)
{
    EXPECT_EQ(VersionText(v2), "2.0");
    EXPECT_EQ(VersionText(unset), "");
    EXPECT_EQ(VersionText({-1, 3}), "");
    EXPECT_EQ(VersionText({3, -1}), "");
}

TEST(Version, AnUnsetOnePrintsNothing)
{
    std::ostringstream text;

    text << v2 << '|' << unset << '|' << IVersion{3, -1};

    EXPECT_EQ(text.str(), "2.0||");
}

TEST(Version, EachLimitCountsOnItsOwn)
{
    EXPECT_TRUE(IsSupported(v2, unset, unset));
    EXPECT_TRUE(IsSupported(v2, v2, v2));
    EXPECT_FALSE(IsSupported(v2, v3, unset));
    EXPECT_FALSE(IsSupported(v2, unset, v1));
    EXPECT_TRUE(IsSupported(unset, v3, v1));
}

} // namespace
