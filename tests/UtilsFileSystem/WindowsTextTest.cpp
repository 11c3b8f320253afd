#include "UtilsFileSystem/WindowsText.h"

#include "UtilsFileSystem/FileSystem.h"
#include "UtilsFileSystem/OperatingSystem.h"

#include <gtest/gtest.h>

#include <sys/utsname.h>

using namespace UtilsFileSystem;

namespace {

struct VPathCase
{
    const char* Name;
    const char* Text;
    bool Relative;
    const char* LongPath;
};

// clang-format off
const VPathCase pathCases[] = {
    {"Empty",                        "",                     true,  ""},
    {"OneCharacter",                 "a",                    true,  "a"},
    {"OneSeparator",                 "/",                    true,  "/"},
    {"RelativeKeepsItsSlashes",      "a/b/c.txt",            true,  "a/b/c.txt"},
    {"DriveAlone",                   "C:",                   true,  "C:"},
    {"DriveAndName",                 "C:name",               true,  "C:name"},
    {"DriveWithBackslash",           R"(C:\folder\x)",       false, R"(\\?\C:\folder\x)"},
    {"DriveWithSlashes",             "C:/folder/x",          false, R"(\\?\C:\folder\x)"},
    {"DriveRoot",                    "C:/",                  false, R"(\\?\C:\)"},
    {"AnyFirstCharacterIsADrive",    "1:/x",                 false, R"(\\?\1:\x)"},
    {"ColonElsewhere",               "ab:/x",                true,  "ab:/x"},
    {"Share",                        R"(\\server\share)",    false, R"(\\?\UNC\server\share)"},
    {"ShareWithSlashes",             "//server/share",       false, R"(\\?\UNC\server\share)"},
    {"MixedSeparators",              R"(\/server)",          false, R"(\\?\UNC\server)"},
    {"SingleLeadingBackslash",       R"(\folder)",           true,  R"(\folder)"},
    {"SingleLeadingSlash",           "/folder",              true,  "/folder"},
    {"SeparatorAndQuestionMark",     R"(\?x)",               false, R"(\\?\\?x)"},
    {"PrefixedGetsASecondPrefix",    R"(\\?\C:\x)",          false, R"(\\?\UNC\?\C:\x)"},
};
// clang-format on

class WindowsPathText : public testing::TestWithParam<VPathCase>
{
};

TEST_P(WindowsPathText, IsRelativeOrGetsItsPrefix)
{
    EXPECT_EQ(IsRelativePath(GetParam().Text), GetParam().Relative);
    EXPECT_EQ(MakeLongPathText(GetParam().Text), GetParam().LongPath);
}

INSTANTIATE_TEST_SUITE_P(Paths, WindowsPathText, testing::ValuesIn(pathCases),
                         [](const auto& named) { return std::string(named.param.Name); });

struct VNameCase
{
    unsigned Major;
    unsigned Minor;
    const char* Workstation;
    const char* Server;
};

// clang-format off
const VNameCase nameCases[] = {
    {5, 0, "Windows 2000 64Bit",            "Windows 2000 64Bit"},
    {5, 1, "Windows XP 64Bit",              "Windows XP 64Bit"},
    {5, 2, "Windows Server 2003 64Bit",     "Windows Server 2003 64Bit"},
    {6, 0, "Windows Vista 64Bit",           "Windows Server 2008 64Bit"},
    {6, 1, "Windows 7 64Bit",               "Windows Server 2008 R2 64Bit"},
    {6, 2, "Windows 8 64Bit",               "Windows Server 2012 64Bit"},
    {6, 3, "Unknown Windows Version 64Bit", "Unknown Windows Version 64Bit"},
    {4, 0, "Unknown Windows Version 64Bit", "Unknown Windows Version 64Bit"},
};
// clang-format on

TEST(WindowsName, FollowsTheTable)
{
    for (const VNameCase& row : nameCases) {
        const VWindowsVersion workstation{row.Major, row.Minor, true};
        const VWindowsVersion server{row.Major, row.Minor, false};
        EXPECT_EQ(GetWindowsName(&workstation), row.Workstation);
        EXPECT_EQ(GetWindowsName(&server), row.Server);
    }
}

TEST(WindowsName, IsThatOfAnEarlyVersionWhereNoneIsTold)
{
    EXPECT_EQ(GetWindowsName(nullptr), "Pre-Windows 2000 64Bit");
}

TEST(OperatingSystem, IsNamedWithItsRelease)
{
    utsname names{};
    ASSERT_EQ(uname(&names), 0);

    EXPECT_EQ(GetOperatingSystemName(),
              std::string(names.sysname) + " " + names.release + " 64Bit");
}

TEST(FileSystem, LeavesPathsAsTheyAreHere)
{
    EXPECT_EQ(MakeLongPath("/a/b").native(), "/a/b");
    EXPECT_EQ(MakeLongPath("C:/a").native(), "C:/a");
    EXPECT_EQ(MakeLongPath("").native(), "");
}

} // namespace
