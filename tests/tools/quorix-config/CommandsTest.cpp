#include "ProgramRun.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include <fstream>

using ConfigTest::RunTool;
using ConfigTest::VRun;
using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;
using TestSupport::VTemporaryFolder;
using TestSupport::WriteFile;

namespace {

const std::string content = R"(<?xml version="1.0" encoding="UTF-8" standalone="no"?>
<Configuration version="2.0">
  <Node name="Preferences">
    <Node name="User">
      <Item name="AltToSelect" format='{"Type":"Bool"}' value-verified="true"/>
      <Item name="Both" format='{"Type":"UInt8"}' value-proposed="1" value-verified="2"/>
      <Item name="Asked" format='{"Type":"UInt8"}' value-proposed="3"/>
      <Item name="Text" format='{"Type":"String"}' value-verified='"a \"b\"\t"'/>
    </Node>
    <Node name="System">
      <Item name="List" format='{"Type":"List","SubSchemas":[["",{"Type":"UInt8"}]]}' value-verified="[1,2]"/>
    </Node>
  </Node>
</Configuration>
)";

class QuorixConfigTest : public testing::Test
{
protected:
    QuorixConfigTest() { WriteFile(path, content); }

    const VTemporaryFolder folder;
    const std::string path = folder.Path("file.prefs");
};

TEST_F(QuorixConfigTest, ChecksAGoodFile)
{
    const VRun run = RunTool({"check", path});

    EXPECT_EQ(run.Code, 0);
    EXPECT_EQ(run.Output, "5 items, 0 errors, 0 warnings\n");
    EXPECT_EQ(run.Errors, "");
}

TEST_F(QuorixConfigTest, ChecksABadFileWithEveryMessage)
{
    WriteFile(path, "<Configuration version='2.0'><Node name='A' x=''><Item name='B' "
                    "format='{\"Type\":\"Bool\"}' value-verified='yes'/><Item name='C' "
                    "format='{\"Type\":\"Bool\"}' value-verified='true'/></Node></Configuration>");

    const VRun run = RunTool({"check", path});

    EXPECT_EQ(run.Code, 1);
    EXPECT_EQ(run.Output,
              "warning: Ignoring unrecognised attribute: /Configuration/Node/x\n"
              "error: Encountered 'Item' with invalid 'value-verified' attribute value 'yes', "
              "(Element XPath=\"/Configuration/Node[@name='A']/Node[@name='B']\")\n"
              "1 items, 1 errors, 1 warnings\n");
}

TEST_F(QuorixConfigTest, WarningsAloneAreNoFailure)
{
    WriteFile(path, "<Configuration version='2.0' x=''><Node name='A'/></Configuration>");

    EXPECT_EQ(RunTool({"check", path}).Code, 0);
}

TEST_F(QuorixConfigTest, MessagesCannotDriveATerminal)
{
    WriteFile(path, "<Configuration version='2.0'><Node name='\x1B[2J'><Node/></Node>"
                    "</Configuration>");

    EXPECT_THAT(RunTool({"check", path}).Output, HasSubstr("Node[@name='\\x1B[2J']"));
}

TEST_F(QuorixConfigTest, MessagesCannotDriveATerminalByItsEightBitControls)
{
    WriteFile(path, "<Configuration version='2.0'><Node name='\xC2\x9B\xC2\xA0\xC3\x9B\xC2'><Node/>"
                    "</Node></Configuration>");

    EXPECT_THAT(RunTool({"check", path}).Output,
                HasSubstr("Node[@name='\\xC2\\x9B\xC2\xA0\xC3\x9B\xC2']"));
}

TEST_F(QuorixConfigTest, OutputThatCannotBeWrittenIsAFailure)
{
    std::ofstream full("/dev/full");
    std::ostringstream errors;
    const char* const arguments[] = {"quorix-config", "list", path.c_str()};

    EXPECT_EQ(QuorixConfig::RunProgram(3, arguments, full, errors), 1);
    EXPECT_EQ(errors.str(), "quorix-config: The output cannot be written\n");
}

TEST_F(QuorixConfigTest, TellsWhyAFileCannotBeRead)
{
    WriteFile(folder.Path("broken"), "<Configuration");
    WriteFile(folder.Path("foreign"), "<Settings/>");

    EXPECT_THAT(RunTool({"check", folder.Path("missing")}).Output,
                StartsWith("error: There is no such file\n"));
    EXPECT_THAT(RunTool({"check", folder.Path()}).Output,
                StartsWith("error: The file is a folder\n"));
    EXPECT_THAT(RunTool({"check", folder.Path("broken")}).Output,
                StartsWith("error: The file is no XML, or its elements nest too deep\n"));
    EXPECT_THAT(RunTool({"check", folder.Path("foreign")}).Output,
                StartsWith("error: The file has no Configuration element\n"));
    EXPECT_THAT(RunTool({"check", "/dev/zero"}).Output,
                StartsWith("error: The file cannot be read, is no regular file or is too great"));
    for (const std::string command : {"check", "list"}) {
        EXPECT_EQ(RunTool({command, folder.Path("missing")}).Code, 1);
    }
}

TEST_F(QuorixConfigTest, GetsWhatAUserOfTheItemSees)
{
    EXPECT_EQ(RunTool({"get", path, "Preferences.User.AltToSelect"}).Output, "true\n");
    EXPECT_EQ(RunTool({"get", path, "Preferences.User.Both"}).Output, "1\n");
    EXPECT_EQ(RunTool({"get", path, "Preferences.User.Asked"}).Output, "3\n");
    EXPECT_EQ(RunTool({"get", path, "Preferences.User.Text"}).Output, "\"a \\\"b\\\"\\t\"\n");
    EXPECT_EQ(RunTool({"get", "--raw", path, "Preferences.User.Text"}).Output, "a \"b\"\t\n");
    EXPECT_EQ(RunTool({"get", path, "Preferences.System.List"}).Output, "[1,2]\n");
    EXPECT_EQ(RunTool({"get", path, "Preferences.User.Both"}).Code, 0);
}

TEST_F(QuorixConfigTest, GetsTheVerifiedValueWhereItIsAskedFor)
{
    EXPECT_EQ(RunTool({"get", "--verified", path, "Preferences.User.Both"}).Output, "2\n");

    const VRun missing = RunTool({"get", "--verified", path, "Preferences.User.Asked"});
    EXPECT_EQ(missing.Code, 1);
    EXPECT_EQ(missing.Errors, path + ": error: The item has no verified value\n");
}

TEST_F(QuorixConfigTest, TellsWhatIsNotThere)
{
    const VRun run = RunTool({"get", path, "Preferences.User"});

    EXPECT_EQ(run.Code, 1);
    EXPECT_EQ(run.Output, "");
    EXPECT_EQ(run.Errors, path + ": error: There is no item Preferences.User\n");
}

TEST_F(QuorixConfigTest, ListsATree)
{
    EXPECT_EQ(RunTool({"list", path}).Output, "Preferences\n"
                                              "  System\n"
                                              "    List: List = [1,2]\n"
                                              "  User\n"
                                              "    AltToSelect: Bool = true\n"
                                              "    Asked: UInt8 = 3, proposed only\n"
                                              "    Both: UInt8 = 1, verified = 2\n"
                                              "    Text: String = \"a \\\"b\\\"\\t\"\n");
}

TEST_F(QuorixConfigTest, ListsAPart)
{
    EXPECT_EQ(RunTool({"list", path, "Preferences.System"}).Output,
              "Preferences\n  System\n    List: List = [1,2]\n");
    EXPECT_EQ(RunTool({"list", path, "Preferences.User.Both"}).Output,
              "Preferences\n  User\n    Both: UInt8 = 1, verified = 2\n");

    const VRun none = RunTool({"list", path, "Pref"});
    EXPECT_EQ(none.Code, 1);
    EXPECT_EQ(none.Errors, path + ": error: There is nothing at or below Pref\n");
}

TEST_F(QuorixConfigTest, ListsAsJson)
{
    const VRun run = RunTool({"list", "--json", path, "Preferences.User.Both"});

    EXPECT_EQ(nlohmann::json::parse(run.Output), nlohmann::json::parse(R"([{
        "path": ["Preferences", "User", "Both"], "type": "UInt8",
        "format": "{\"Type\":\"UInt8\"}", "proposed": "1", "verified": "2"}])"));
}

TEST_F(QuorixConfigTest, JsonTakesNamesThatAreNoUtf8)
{
    WriteFile(path, "<Configuration version='2.0'><Node name='A\xFF'><Item name='B' "
                    "format='{\"Type\":\"Bool\"}' value-verified='true'/></Node></Configuration>");

    const nlohmann::json list = nlohmann::json::parse(RunTool({"list", "--json", path}).Output);

    EXPECT_EQ(list[0]["path"][0], "A\xEF\xBF\xBD");
}

TEST_F(QuorixConfigTest, AFileWithErrorsIsNotUsed)
{
    WriteFile(path, "<Configuration version='2.0'><Node name='A'><Item name='B' "
                    "format='{\"Type\":\"Bool\"}' value-verified='true'/></Node><Node/>"
                    "</Configuration>");

    const VRun run = RunTool({"get", path, "A.B"});

    EXPECT_EQ(run.Code, 1);
    EXPECT_EQ(run.Output, "");
    EXPECT_THAT(run.Errors, HasSubstr(path + ": error: Node element missing required attribute "
                                             "name\n"));
}

TEST_F(QuorixConfigTest, FilesWithTheSameItemsDoNotDiffer)
{
    const std::string other = folder.Path("other");
    WriteFile(other, "<!-- other text -->" + content);

    const VRun run = RunTool({"diff", path, other});

    EXPECT_EQ(run.Code, 0);
    EXPECT_EQ(run.Output, "");
}

TEST_F(QuorixConfigTest, TellsWhereFilesDiffer)
{
    const auto item = [](const std::string& name, const std::string& attributes) {
        return "<Item name='" + name + "' " + attributes + "/>";
    };
    const auto file = [](const std::string& items) {
        return "<Configuration version='2.0'><Node name='A'>" + items + "</Node></Configuration>";
    };
    const std::string a = folder.Path("a"), b = folder.Path("b");
    const std::string byte = "format='{\"Type\":\"UInt8\"}' ";
    WriteFile(a, file(item("Same", byte + "value-verified='1'") +
                      item("Value", byte + "value-verified='1'") +
                      item("Proposed", byte + "value-verified='1'") +
                      item("Gone", byte + "value-verified='1'") +
                      item("Name", byte + "value-verified='1'")));
    WriteFile(b, file(item("Name", "format='{\"Type\":\"UInt8\",\"TypeName\":\"X\"}' "
                                   "value-verified='1'") +
                      item("Value", byte + "value-verified='2'") +
                      item("Proposed", byte + "value-proposed='1' value-verified='1'") +
                      item("New", byte + "value-verified='1'") +
                      item("Same", byte + "value-verified='1'")));

    const VRun run = RunTool({"diff", a, b});

    EXPECT_EQ(run.Code, 1);
    EXPECT_EQ(run.Output, "- A.Gone: UInt8 = 1\n"
                          "- A.Name: UInt8 = 1\n"
                          "-   format {\"Type\":\"UInt8\"}\n"
                          "+ A.Name: UInt8 = 1\n"
                          "+   format {\"Type\":\"UInt8\",\"TypeName\":\"X\"}\n"
                          "+ A.New: UInt8 = 1\n"
                          "- A.Proposed: UInt8 = 1\n"
                          "+ A.Proposed: UInt8 = 1, verified = 1\n"
                          "- A.Value: UInt8 = 1\n"
                          "+ A.Value: UInt8 = 2\n");
}

TEST_F(QuorixConfigTest, FilesThatCannotBeReadCannotBeCompared)
{
    const VRun run = RunTool({"diff", path, folder.Path("missing")});

    EXPECT_EQ(run.Code, 2);
    EXPECT_EQ(run.Errors, folder.Path("missing") + ": error: There is no such file\n");
}

TEST_F(QuorixConfigTest, WrongUsageEndsWith2)
{
    EXPECT_EQ(RunTool({}).Code, 2);
    EXPECT_EQ(RunTool({"unknown"}).Code, 2);
    EXPECT_EQ(RunTool({"check"}).Code, 2);
    EXPECT_EQ(RunTool({"get", path}).Code, 2);
    EXPECT_EQ(RunTool({"list", path, "--unknown"}).Code, 2);
    EXPECT_NE(RunTool({"set", path, "A"}).Errors, "");
}

TEST_F(QuorixConfigTest, TheHelpTellsOfTheFormatAndTheCodes)
{
    const VRun run = RunTool({"--help"});

    EXPECT_EQ(run.Code, 0);
    EXPECT_THAT(run.Output,
                AllOf(HasSubstr("Configuration: The root node of a Quorix configuration file.\n"),
                      HasSubstr("value-verified: The data items proposed value. If present, this "
                                "is the value used"),
                      HasSubstr("Exit codes: 0 done")));
    EXPECT_THAT(RunTool({"--version"}).Output, StartsWith("quorix-config "));
}

} // namespace
