#include "ConfigurationFile.h"
#include "Program.h"

#include <gtest/gtest.h>

#include <boost/filesystem.hpp>
#include <sys/stat.h>

#include <fstream>
#include <sstream>

namespace {

using namespace QuorixConfig;

const char* const oldText = R"(<?xml version="1.0" encoding="UTF-8" standalone="no"?>
<Configuration version="2.0">
  <Node name="Rig">
    <Item name="Delay" format='{"Type":"Int16"}' value-proposed="7" value-verified="-3"/>
    <Item name="Gone" format='{"Type":"Bool"}' value-verified="true"/>
    <Item name="Mode" format='{"Type":"Enum8","EnumValues":[["On",1],["Off",2]]}' value-verified='"Off"'/>
    <Item name="Name" format='{"Type":"String"}' value-verified='"Studio"'/>
  </Node>
</Configuration>
)";

const char* const currentText = R"(<?xml version="1.0" encoding="UTF-8" standalone="no"?>
<Configuration version="2.0">
  <Node name="Rig">
    <Item name="Delay" format='{"Type":"Int32"}' value-verified="0"/>
    <Item name="Mode" format='{"Type":"Enum8","EnumValues":[["Off",0],["On",1]]}' value-verified='"On"'/>
    <Item name="Name" format='{"Type":"UInt8"}' value-verified='1'/>
    <Item name="New" format='{"Type":"Bool"}' value-verified="true"/>
  </Node>
</Configuration>
)";

const char* const expectedOutput = "warning: Rig.Delay: Type changed from Int16 to Int32.\n"
                                   "error: Rig.Gone: There is no current schema.\n"
                                   "warning: Rig.Mode: Enum was modified\n"
                                   "error: Rig.Name: Type changed from String to UInt8.\n"
                                   "2 carried over, 2 left out\n";

/// Works in a folder of its own, with an old and a current file in it.
class MigrateCommand : public testing::Test
{
protected:
    MigrateCommand()
        : folder(boost::filesystem::temp_directory_path() / boost::filesystem::unique_path())
    {
        boost::filesystem::create_directories(folder);
        Write("old", oldText);
        Write("current", currentText);
    }

    ~MigrateCommand() override
    {
        boost::system::error_code ignored;
        boost::filesystem::remove_all(folder, ignored);
    }

    std::string PathOf(const std::string& name) const { return (folder / name).string(); }

    void Write(const std::string& name, const std::string& text) const
    {
        std::ofstream(PathOf(name), std::ios::binary) << text;
    }

    std::string Read(const std::string& name) const
    {
        std::ifstream file(PathOf(name), std::ios::binary);
        std::ostringstream text;
        text << file.rdbuf();
        return text.str();
    }

    bool Exists(const std::string& name) const
    {
        return boost::filesystem::exists(boost::filesystem::symlink_status(PathOf(name)));
    }

    /// Runs the subcommand with names of files in the folder, and with options.
    int Run(const std::vector<std::string>& words)
    {
        std::vector<std::string> arguments{"quorix-config", "migrate"};
        for (const std::string& word : words) {
            arguments.push_back(word.rfind("--", 0) == 0 ? word : PathOf(word));
        }
        std::vector<const char*> pointers;
        for (const std::string& argument : arguments) {
            pointers.push_back(argument.c_str());
        }
        output.str("");
        errors.str("");
        return RunProgram(static_cast<int>(pointers.size()), pointers.data(), output, errors);
    }

    const boost::filesystem::path folder;
    std::ostringstream output;
    std::ostringstream errors;
};

} // namespace

TEST_F(MigrateCommand, WritesWhatCanBeCarriedOverAndTellsOfTheRest)
{
    EXPECT_EQ(1, Run({"old", "current", "new"}));

    EXPECT_EQ(expectedOutput, output.str());
    EXPECT_EQ("", errors.str());
    EXPECT_EQ("<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"no\"?>\n"
              "<Configuration version=\"2.0\">\n"
              "\t<Node name=\"Rig\">\n"
              "\t\t<Item name=\"Delay\" format='{\"Type\":\"Int32\"}' value-proposed=\"7\" "
              "value-verified=\"-3\"/>\n"
              "\t\t<Item name=\"Mode\" format='{\"Type\":\"Enum8\",\"EnumValues\":"
              "[[\"Off\",0],[\"On\",1]]}' value-verified='\"Off\"'/>\n"
              "\t</Node>\n"
              "</Configuration>\n\n",
              Read("new"));
    EXPECT_EQ(oldText, Read("old"));
    EXPECT_EQ(currentText, Read("current"));
}

TEST_F(MigrateCommand, EndsWellIfEverythingWasCarriedOver)
{
    EXPECT_EQ(0, Run({"old", "old", "new"}));
    EXPECT_EQ("4 carried over, 0 left out\n", output.str());
    EXPECT_EQ(LoadFile(PathOf("old")).Items, LoadFile(PathOf("new")).Items);
}

TEST_F(MigrateCommand, OnlyTellsInADryRun)
{
    EXPECT_EQ(1, Run({"old", "current", "new", "--dry-run"}));
    EXPECT_EQ(expectedOutput, output.str());
    EXPECT_FALSE(Exists("new"));

    EXPECT_EQ(1, Run({"old", "current", "--dry-run"}));
    EXPECT_EQ(expectedOutput, output.str());
    EXPECT_EQ(0, Run({"old", "old", "--dry-run"}));
}

TEST_F(MigrateCommand, NeedsAFileToWriteOtherwise)
{
    EXPECT_EQ(2, Run({"old", "current"}));
    EXPECT_EQ("quorix-config: NEW is missing (--dry-run needs none)\n", errors.str());
    EXPECT_EQ(2, Run({"old"}));
}

TEST_F(MigrateCommand, NeverWritesOverItsInputByWhateverName)
{
    boost::filesystem::create_symlink(PathOf("old"), PathOf("symlink"));
    boost::filesystem::create_hard_link(PathOf("old"), PathOf("hardlink"));
    const std::string roundabout = "../" + folder.filename().string() + "/old";
    for (const std::string& name : {std::string("old"), std::string("current"),
                                    std::string("symlink"), std::string("hardlink"), roundabout}) {
        EXPECT_EQ(1, Run({"old", "old", name})) << name;
        EXPECT_EQ(PathOf(name) + ": error: Nothing is written, since there may be a file already\n",
                  errors.str());
    }
    EXPECT_EQ(oldText, Read("old"));
    EXPECT_EQ(currentText, Read("current"));
}

TEST_F(MigrateCommand, LeavesAnyOtherFileAndFolderThatExists)
{
    Write("other", "precious");
    boost::filesystem::create_directory(PathOf("folder"));
    boost::filesystem::create_symlink(PathOf("nowhere"), PathOf("dangling"));

    for (const char* name : {"other", "folder", "dangling"}) {
        EXPECT_EQ(1, Run({"old", "old", name})) << name;
    }
    EXPECT_EQ("precious", Read("other"));
    EXPECT_FALSE(Exists("nowhere"));
}

TEST_F(MigrateCommand, WritesNothingWhereNothingWasCarriedOver)
{
    Write("empty", R"(<Configuration version="2.0"><Node name="X"/></Configuration>)");

    EXPECT_EQ(1, Run({"old", "empty", "new"}));
    EXPECT_EQ(PathOf("new") + ": error: Nothing is written, since nothing was carried over\n",
              errors.str());
    EXPECT_FALSE(Exists("new"));
}

TEST_F(MigrateCommand, RefusesAFileWithErrorsAndTellsThemAll)
{
    Write("broken", R"(<Configuration version="1.5"/>)");

    EXPECT_EQ(1, Run({"broken", "missing", "new"}));
    EXPECT_NE(std::string::npos, errors.str().find("version 1.5"));
    EXPECT_NE(std::string::npos, errors.str().find("There is no such file"));
    EXPECT_EQ(1, Run({"old", "broken", "new"}));
    EXPECT_FALSE(Exists("new"));
}

TEST_F(MigrateCommand, GivesTheNewFileTheModeOfTheOldOne)
{
    chmod(PathOf("old").c_str(), 0600);
    ASSERT_EQ(0, Run({"old", "old", "private"}));
    chmod(PathOf("old").c_str(), 0664);
    ASSERT_EQ(0, Run({"old", "old", "shared"}));

    struct stat status
    {
    };
    ASSERT_EQ(0, stat(PathOf("private").c_str(), &status));
    EXPECT_EQ(0600u, status.st_mode & 0777);
    ASSERT_EQ(0, stat(PathOf("shared").c_str(), &status));
    EXPECT_EQ(0664u, status.st_mode & 0777);
}

TEST_F(MigrateCommand, TellsThatAFileCannotBeWritten)
{
    EXPECT_EQ(1, Run({"old", "old", "no/such/folder"}));
    EXPECT_EQ(PathOf("no/such/folder") + ": error: The file cannot be written\n", errors.str());
}

TEST_F(MigrateCommand, PrintsNoControlCharactersOfNames)
{
    Write("coloured", "<Configuration version=\"2.0\"><Node name=\"\x1B[31m\"><Item name=\"X\" "
                      "format='{\"Type\":\"Bool\"}' value-verified=\"true\"/></Node>"
                      "</Configuration>");

    EXPECT_EQ(1, Run({"coloured", "old", "--dry-run"}));
    EXPECT_EQ(std::string::npos, output.str().find('\x1B'));
}
