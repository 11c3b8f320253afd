#include "Options.h"

#include "QuorixVersion.h"

#include <gmock/gmock.h>

#include <sstream>
#include <string>
#include <vector>

using testing::HasSubstr;
using testing::IsEmpty;

namespace {

/// A command line with what it printed.
struct VParsed
{
    explicit VParsed(std::vector<const char*> arguments)
    {
        arguments.insert(arguments.begin(), "quorix-host");
        line = QuorixHost::ParseCommandLine(static_cast<int>(arguments.size()), arguments.data(),
                                            output, errors);
    }

    std::ostringstream output;
    std::ostringstream errors;
    QuorixHost::VCommandLine line;
};

} // namespace

TEST(Options, HaveDefaults)
{
    const VParsed parsed({});

    ASSERT_TRUE(parsed.line.options);
    EXPECT_EQ("", parsed.line.options->plugin);
    EXPECT_EQ(4U, parsed.line.options->cameras);
    EXPECT_FALSE(parsed.line.options->headless);
    EXPECT_EQ("", parsed.line.options->dataFolder);
    EXPECT_FALSE(parsed.line.options->console);
    EXPECT_THAT(parsed.line.options->logLevels, IsEmpty());
}

TEST(Options, AreAllTaken)
{
    const VParsed parsed(
        {"--plugin", "a.so", "--cameras=0", "--headless", "--data", "d", "--console"});

    ASSERT_TRUE(parsed.line.options);
    EXPECT_EQ("a.so", parsed.line.options->plugin);
    EXPECT_EQ(0U, parsed.line.options->cameras);
    EXPECT_TRUE(parsed.line.options->headless);
    EXPECT_EQ("d", parsed.line.options->dataFolder);
    EXPECT_TRUE(parsed.line.options->console);
}

TEST(Options, LogLevelsAreRepeatableAndSplitAtTheLastEqualsSign)
{
    const VParsed parsed({"--log", "Host=6", "--log=Qt Korva=2", "--log", "a=b=0"});

    ASSERT_TRUE(parsed.line.options);
    using VLevel = std::pair<std::string, int>;
    EXPECT_THAT(parsed.line.options->logLevels,
                testing::ElementsAre(VLevel("Host", 6), VLevel("Qt Korva", 2), VLevel("a=b", 0)));
}

TEST(Options, HelpAndVersionGoToTheOutputAndEndWith0)
{
    const VParsed help({"--help"});
    EXPECT_FALSE(help.line.options);
    EXPECT_EQ(0, help.line.exitCode);
    for (const char* const option : {"--plugin", "--cameras", "--headless", "--data", "--log",
                                     "--console", "--version", "--help"}) {
        EXPECT_THAT(help.output.str(), HasSubstr(option));
    }
    EXPECT_EQ("", help.errors.str());

    const VParsed version({"--version"});
    EXPECT_FALSE(version.line.options);
    EXPECT_EQ(0, version.line.exitCode);
    EXPECT_EQ("quorix-host " QUORIX_VERSION "\n", version.output.str());
}

TEST(Options, HelpTellsEveryConsoleCommand)
{
    const VParsed help({"--help"});

    for (const char* const command :
         {"set CLASS ID PARAMETER VALUE", "get CLASS ID PARAMETER", "mode N NUMBER",
          "select [N,N,...]", "add N", "remove N", "notify CLASS ID PARAMETER COUNT",
          "fire EVENT [NAME=VALUE]...", "state", "locks", "quit"}) {
        EXPECT_THAT(help.output.str(), HasSubstr("\n  " + std::string(command) + "  "));
    }
}

TEST(Options, WhatIsWrongIsNamedAndEndsWith2)
{
    struct VCase
    {
        std::vector<const char*> arguments;
        const char* named;
    };
    // clang-format off
    const VCase cases[] = {
        {{"--bogus"},                 "--bogus"},
        {{"extra"},                   "extra"},
        {{"--plugin"},                "--plugin"},
        {{"--plugin", ""},            "--plugin"},
        {{"--data="},                 "--data"},
        {{"--cameras", "x"},          "--cameras"},
        {{"--cameras", "-1"},         "--cameras"},
        {{"--cameras", "1001"},       "--cameras"},
        {{"--cameras", "4.5"},        "--cameras"},
        {{"--cameras", "99999999999999999999"}, "--cameras"},
        {{"--cameras=1", "--cameras=2"}, "--cameras"},
        {{"--headless=yes"},          "headless"},
        {{"--log"},                   "--log"},
        {{"--log", "Host"},           "Host"},
        {{"--log", "=4"},             "=4"},
        {{"--log", "Host="},          "Host="},
        {{"--log", "Host=x"},         "Host=x"},
        {{"--log", "Host=4x"},        "Host=4x"},
        {{"--log", "Host=-1"},        "Host=-1"},
        {{"--log", "Host=10"},        "Host=10"},
        {{"--log", "a=4", "b=4"},     "b=4"},
    };
    // clang-format on

    for (const VCase& wrong : cases) {
        const VParsed parsed(wrong.arguments);
        EXPECT_FALSE(parsed.line.options) << wrong.named;
        EXPECT_EQ(2, parsed.line.exitCode) << wrong.named;
        EXPECT_EQ("", parsed.output.str()) << wrong.named;
        EXPECT_THAT(parsed.errors.str(), HasSubstr(wrong.named));
    }
}
