#include "ProgramRun.h"
#include "support/ChildProcess.h"
#include "support/TemporaryFolder.h"
#include "support/TracedProcess.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <sys/stat.h>

using ConfigTest::RunTool;
using ConfigTest::VRun;
using testing::HasSubstr;
using TestSupport::ContentOf;
using TestSupport::VTemporaryFolder;
using TestSupport::WriteFile;

namespace {

const std::string head = "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"no\"?>\n";

/// A file as it is printed, with a comment, an unknown attribute and a number of many digits.
const std::string before =
    head + "<!--kept-->\n"
           "<Configuration version=\"2.0\" own=\"kept\">\n"
           "\t<Node name=\"A\">\n"
           "\t\t<Item name=\"Real\" format='{\"Type\":\"Float64\"}' "
           "value-verified=\"0.1000000000000000055\"/>\n"
           "\t\t<Item name=\"Both\" format='{\"Type\":\"UInt8\"}' value-proposed=\"1\" "
           "value-verified=\"2\"/>\n"
           "\t\t<Item name=\"Text\" format='{\"Type\":\"String\"}' value-verified='\"x\"'/>\n"
           "\t</Node>\n"
           "</Configuration>\n\n";

std::string Replaced(std::string text, const std::string& from, const std::string& to)
{
    const std::size_t at = text.find(from);
    return at == std::string::npos ? "(not found)" : text.replace(at, from.size(), to);
}

class QuorixConfigSetTest : public testing::Test
{
protected:
    QuorixConfigSetTest() { WriteFile(path, before); }

    /// Expects that a run fails with a reason and changes nothing.
    void ExpectRefusal(std::initializer_list<std::string> words, const std::string& reason)
    {
        const std::string content = ContentOf(path);
        const VRun run = RunTool(words);
        EXPECT_EQ(run.Code, 1);
        EXPECT_THAT(run.Errors, HasSubstr(path + ": error: " + reason));
        EXPECT_EQ(ContentOf(path), content);
        EXPECT_FALSE(std::filesystem::exists(path + ".bak"));
        EXPECT_EQ(folder.Count(), 1U);
    }

    const VTemporaryFolder folder;
    const std::string path = folder.Path("file.prefs");
};

TEST_F(QuorixConfigSetTest, ChangesOneValueAndNothingElse)
{
    const VRun run = RunTool({"set", path, "A.Text", "\"<&'\\\"\\n\""});

    EXPECT_EQ(run.Code, 0) << run.Errors;
    EXPECT_EQ(ContentOf(path), Replaced(before, "'\"x\"'", "'\"&lt;&amp;&apos;\\\"\\n\"'"));
    EXPECT_EQ(ContentOf(path + ".bak"), before);
    EXPECT_EQ(RunTool({"get", path, "A.Text"}).Output, "\"<&'\\\"\\n\"\n");
}

TEST_F(QuorixConfigSetTest, ChangesWhatAUserOfTheItemSees)
{
    EXPECT_EQ(RunTool({"set", path, "A.Both", "7"}).Code, 0);
    EXPECT_EQ(ContentOf(path), Replaced(before, "value-proposed=\"1\"", "value-proposed=\"7\""));

    EXPECT_EQ(RunTool({"set", "--verified", path, "A.Both", " 8 "}).Code, 0);
    EXPECT_THAT(ContentOf(path), HasSubstr("value-proposed=\"7\" value-verified=\"8\""));
}

TEST_F(QuorixConfigSetTest, TakesARawText)
{
    EXPECT_EQ(RunTool({"set", "--raw", path, "A.Text", "a \"b\"\t"}).Code, 0);

    EXPECT_EQ(RunTool({"get", "--raw", path, "A.Text"}).Output, "a \"b\"\t\n");
    EXPECT_EQ(ContentOf(path), Replaced(before, "'\"x\"'", "'\"a \\\"b\\\"\\t\"'"));
}

TEST_F(QuorixConfigSetTest, AddsAnItemOfAFormat)
{
    EXPECT_EQ(RunTool({"set", path, "A.New", "5", "--format", "{\"Type\":\"UInt8\"}"}).Code, 0);
    EXPECT_EQ(RunTool({"set", path, "B.C.D", "true", "--format", "{\"Type\":\"Bool\"}"}).Code, 0);

    EXPECT_EQ(RunTool({"get", path, "A.New"}).Output, "5\n");
    EXPECT_EQ(RunTool({"get", path, "B.C.D"}).Output, "true\n");
    EXPECT_THAT(ContentOf(path), HasSubstr("\t<Node name=\"B\">\n\t\t<Node name=\"C\">\n"
                                           "\t\t\t<Item name=\"D\" format='{\"Type\":\"Bool\"}' "
                                           "value-verified=\"true\"/>\n"));
}

TEST_F(QuorixConfigSetTest, AnItemThatIsThereKeepsItsFormat)
{
    EXPECT_EQ(RunTool({"set", path, "A.Both", "9", "--format", "{\"Type\":\"String\"}"}).Code, 0);

    EXPECT_EQ(RunTool({"get", path, "A.Both"}).Output, "9\n");
    EXPECT_THAT(ContentOf(path), HasSubstr("name=\"Both\" format='{\"Type\":\"UInt8\"}'"));
}

TEST_F(QuorixConfigSetTest, RefusesWhatCannotBe)
{
    const std::string byte = "{\"Type\":\"UInt8\"}";

    ExpectRefusal({"set", path, "A.None", "1"}, "There is no item A.None (--format adds one)");
    ExpectRefusal({"set", path, "A.Both", "256"}, "This is no value of the item's format: 256");
    ExpectRefusal({"set", path, "A.Both", "1 2"}, "This is no value of the item's format: 1 2");
    ExpectRefusal({"set", path, "A.Both", ""}, "This is no value of the item's format: ");
    ExpectRefusal({"set", path, "A.Text", "x"}, "This is no value of the item's format: x");
    ExpectRefusal({"set", "--raw", path, "A.Both", "1"}, "Only a text may be given with --raw");
    ExpectRefusal({"set", path, "A.New", "1", "--format", "UInt8"}, "This is no format: UInt8");
    ExpectRefusal({"set", path, "A.New", "1", "--format", "{}"},
                  "This is no value of the item's format: 1");
    ExpectRefusal({"set", path, "New", "1", "--format", byte}, "No item can be at New");
    ExpectRefusal({"set", path, "A.*", "1", "--format", byte}, "No item can be at A.*");
}

TEST_F(QuorixConfigSetTest, WritesNothingWhereTheFileHasErrors)
{
    WriteFile(path, Replaced(before, "value-verified=\"2\"", "value-verified=\"x\""));

    ExpectRefusal({"set", path, "A.Text", "\"y\""},
                  "Nothing is written, since the file has errors");
}

TEST_F(QuorixConfigSetTest, WritesNothingThatWouldBeLost)
{
    // Printed, the zero would end the file for whoever reads it next.
    WriteFile(path, Replaced(before, "own=\"kept\"", "own=\"a&#0;b\""));

    ExpectRefusal({"set", path, "A.Text", "\"y\""},
                  "Nothing is written, since the file cannot be written anew without a loss");
}

TEST_F(QuorixConfigSetTest, ADeclarationHidesNoElementsFromTheEdit)
{
    // A load that skips the declaration takes it to end within the value, and all that follows for
    // a comment; the edit keeps the declaration and would see its way down every element.
    std::string elements;
    for (int level = 0; level < 100000; ++level) {
        elements += "<a>";
    }
    WriteFile(path, "<?xml a='?><!--'?>" + elements + "-->" + before);

    ExpectRefusal({"get", path, "A.None"}, "There is no item A.None");
    EXPECT_EQ(RunTool({"set", path, "A.Text", "\"y\""}).Code, 1);
}

TEST_F(QuorixConfigSetTest, ChangesTheItemThatCountsWhereThereAreTwo)
{
    WriteFile(path, "<Configuration version='2.0'><Node name='A'><Item name='B' "
                    "format='{\"Type\":\"UInt8\"}' value-verified='1'/></Node><Node name='A'><Item "
                    "name='B' format='{\"Type\":\"UInt8\"}' value-verified='2'/></Node>"
                    "</Configuration>");

    EXPECT_EQ(RunTool({"set", path, "A.B", "3"}).Code, 0);

    EXPECT_EQ(RunTool({"get", path, "A.B"}).Output, "3\n");
    EXPECT_THAT(ContentOf(path), HasSubstr("value-verified=\"1\""));
}

TEST_F(QuorixConfigSetTest, TheCopyHasTheModeOfTheFile)
{
    chmod(path.c_str(), 0640);

    EXPECT_EQ(RunTool({"set", path, "A.Both", "7"}).Code, 0);

    EXPECT_EQ(std::filesystem::status(path).permissions(), std::filesystem::perms(0640));
    EXPECT_EQ(std::filesystem::status(path + ".bak").permissions(), std::filesystem::perms(0640));
}

TEST_F(QuorixConfigSetTest, WithoutACopyNothingIsWritten)
{
    std::filesystem::create_directory(path + ".bak");

    const VRun run = RunTool({"set", path, "A.Both", "7"});

    EXPECT_EQ(run.Code, 1);
    EXPECT_THAT(run.Errors, HasSubstr(path + ": error: Nothing is written, since " + path +
                                      ".bak cannot be written\n"));
    EXPECT_EQ(ContentOf(path), before);
}

TEST_F(QuorixConfigSetTest, AFileThatMayNotBeWrittenStays)
{
    chmod(path.c_str(), 0444);

    const int code = TestSupport::RunWithoutPrivileges([&] {
        const VRun run = RunTool({"set", path, "A.Both", "7"});
        const std::string reason = path + ": error: The file cannot be written\n";
        return run.Code == 1 && run.Errors.find(reason) != std::string::npos ? 0 : 1;
    });

    if (code == TestSupport::notAllowed) {
        GTEST_SKIP() << "the kernel forbids namespaces here";
    }
    EXPECT_EQ(code, 0);
    EXPECT_EQ(ContentOf(path), before);
}

TEST_F(QuorixConfigSetTest, AKillAtAnyStepLeavesTheOldOrTheNewFile)
{
    const std::string after = Replaced(before, "value-proposed=\"1\"", "value-proposed=\"7\"");

    const std::size_t kills = TestSupport::KillAtEachStep(
        [&] {
            WriteFile(path, before);
            std::filesystem::remove(path + ".bak");
        },
        [&] {
            RunTool({"set", path, "A.Both", "7"});
        },
        [&] {
            const std::string found = ContentOf(path);
            const std::string copy = ContentOf(path + ".bak");
            EXPECT_TRUE(found == before || (found == after && copy == before)) << found;
            EXPECT_TRUE(copy == before || copy == "(no file)") << copy;
        });

    EXPECT_GT(kills, 20U);
}

} // namespace
