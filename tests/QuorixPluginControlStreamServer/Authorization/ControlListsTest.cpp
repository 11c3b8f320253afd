#include "QuorixPluginControlStreamServer/Authorization/ControlLists.h"

#include <gtest/gtest.h>

#include <string>

namespace {

VControlDevices ReadAllowed(const std::string& text)
{
    VControlDevices devices;
    ControlLists::Read(text, true, devices);
    return devices;
}

/// What becomes of devices that are stored and read again.
VControlDevices WrittenAndRead(const VControlDevices& devices)
{
    VControlDevices read;
    ControlLists::Read(ControlLists::Write(devices, true), true, read);
    ControlLists::Read(ControlLists::Write(devices, false), false, read);
    return read;
}

struct VReadCase
{
    const char* name;
    std::string text;
    VControlDevices devices;
};

// clang-format off
const VReadCase readCases[] = {
    {"Nothing",                 "",              {}},
    {"One",                     "a;A",           {{"a", {true, "A"}}}},
    {"Two",                     "a;A\nb;B",      {{"a", {true, "A"}}, {"b", {true, "B"}}}},
    {"SplitAtTheFirst",         "a;A;x;y",       {{"a", {true, "A;x;y"}}}},
    {"WithoutSemicolon",        "a;A\nb\nc;C",   {{"a", {true, "A"}}, {"c", {true, "C"}}}},
    {"EmptyEntries",            "\n\na;A\n\n",   {{"a", {true, "A"}}}},
    {"EmptyName",               "a;",            {{"a", {true, ""}}}},
    {"EmptyId",                 ";A",            {{"", {true, "A"}}}},
    {"OnlyASemicolon",          ";",             {{"", {true, ""}}}},
    {"TheLaterOfOneId",         "a;A\na;B",      {{"a", {true, "B"}}}},
    {"BlanksBelongToIt",        " a ; A ",       {{" a ", {true, " A "}}}},
    {"CarriageReturnsBelongToIt", "a;A\r\nb;B",  {{"a", {true, "A\r"}}, {"b", {true, "B"}}}},
};
// clang-format on

class ControlListsRead : public testing::TestWithParam<VReadCase>
{
};

} // namespace

TEST_P(ControlListsRead, GivesTheDevices)
{
    EXPECT_EQ(GetParam().devices, ReadAllowed(GetParam().text));
}

INSTANTIATE_TEST_SUITE_P(Cases, ControlListsRead, testing::ValuesIn(readCases),
                         [](const auto& test) { return test.param.name; });

TEST(ControlLists, TheListThatIsReadLaterWins)
{
    VControlDevices devices;
    ControlLists::Read("a;A\nb;B", true, devices);
    ControlLists::Read("b;X\nc;C", false, devices);

    const VControlDevices expected = {{"a", {true, "A"}}, {"b", {false, "X"}}, {"c", {false, "C"}}};
    EXPECT_EQ(expected, devices);
}

TEST(ControlLists, AreWrittenInTheOrderOfTheIdsBytes)
{
    const VControlDevices devices = {{"b", {true, "B"}},
                                     {"a", {true, "A"}},
                                     {"x", {false, "X"}},
                                     {"B", {true, "big"}},
                                     {"\xC3\xA9", {true, "accent"}},
                                     {"w", {false, "W"}}};

    EXPECT_EQ("B;big\na;A\nb;B\n\xC3\xA9;accent", ControlLists::Write(devices, true));
    EXPECT_EQ("w;W\nx;X", ControlLists::Write(devices, false));
}

TEST(ControlLists, OfNobodyAreEmpty)
{
    EXPECT_EQ("", ControlLists::Write({}, true));
    EXPECT_EQ("", ControlLists::Write({{"a", {true, "A"}}}, false));
}

TEST(ControlLists, AnEmptyIdReadsBack)
{
    const VControlDevices devices = {{"", {true, "Name"}}, {"a", {true, "A"}}};

    EXPECT_EQ(";Name\na;A", ControlLists::Write(devices, true));
    EXPECT_EQ(devices, WrittenAndRead(devices));
}

TEST(ControlLists, ANameKeepsItsSemicolons)
{
    const VControlDevices devices = {{"a", {true, "A;b;"}}};

    EXPECT_EQ(devices, WrittenAndRead(devices));
}

TEST(ControlLists, NoNameCanAddADevice)
{
    const VControlDevices devices = {{"a", {true, "Foo\nvictim;y"}}, {"b", {false, "x\r\n\nz;q"}}};

    const VControlDevices expected = {{"a", {true, "Foo victim;y"}}, {"b", {false, "x   z;q"}}};
    EXPECT_EQ(expected, WrittenAndRead(devices));
}

TEST(ControlLists, NoIdCanAddADevice)
{
    const VControlDevices devices = {{"a\nvictim", {true, "A"}},
                                     {"victim;x", {true, "B"}},
                                     {"\n", {true, "C"}},
                                     {"good", {true, "G"}}};

    const VControlDevices expected = {{"good", {true, "G"}}};
    EXPECT_EQ(expected, WrittenAndRead(devices));
    EXPECT_EQ("good;G", ControlLists::Write(devices, true));
}

TEST(ControlLists, NoZeroReachesTheText)
{
    using namespace std::string_literals;
    const VControlDevices devices = {
        {"a", {true, "x\0y"s}}, {"b\0"s, {true, "B"}}, {"c", {true, "C"}}};

    EXPECT_EQ("a;x y\nc;C", ControlLists::Write(devices, true)); // a file would do without it
}

TEST(ControlLists, NoDeviceFillsTheFile)
{
    const std::string longest(65534, 'x'); // by one more it would be left out
    const VControlDevices devices = {{"a", {false, longest}},
                                     {"b", {false, longest + "x"}},
                                     {"c", {false, "C"}},
                                     {longest + "xx", {false, ""}}};

    EXPECT_EQ("a;" + longest + "\nc;C", ControlLists::Write(devices, false));
}
