#include "PreferencesFixture.h"

#include <sys/stat.h>

using namespace PreferencesTest;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

class LoadPreferencesTest : public PreferencesFixture
{
protected:
    std::string Default(int number) const { return folder.Path(std::to_string(number)); }
    std::string MakeFolder(const std::string& name) const
    {
        std::filesystem::create_directories(folder.Path(name));
        return folder.Path(name);
    }
    std::string LoadingSystem() const { return "Config 4 Loading preferences " + SystemFile(); }
    std::string LoadingUser() const { return "Config 4 Loading preferences " + UserFile(); }
};

TEST_F(LoadPreferencesTest, WithoutFilesTheDefaultsStandUnchecked)
{
    Load();

    EXPECT_EQ(TextOf("Preferences.System.SharedDataFolder"), Default(11));
    EXPECT_EQ(TextOf("Preferences.System.UserDataFolder"), Default(6));
    EXPECT_EQ(TextOf("Preferences.System.Directory.Default"), Default(14));
    EXPECT_EQ(TextOf("Preferences.User.FolderSubjects"), Default(15));
    EXPECT_EQ(TextOf("Preferences.User.FolderSubjectCalTemplates"), Default(19));
    EXPECT_EQ(TextOf("Preferences.User.FolderSkins"), Default(20));
    EXPECT_EQ(TextOf("Preferences.User.FolderProps"), Default(16));
    EXPECT_EQ(TextOf("Preferences.User.FolderPropMeshes"), Default(17));
    EXPECT_EQ(TextOf("Preferences.User.FolderClusters"), Default(21));
    EXPECT_EQ(TextOf("Preferences.User.FolderObjects"), Default(18));
    EXPECT_EQ(SwitchOf("Preferences.User.AltToSelect"), "true");
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(LoadPreferencesTest, AsksTheHostInOrder)
{
    Load();

    EXPECT_THAT(host.Asked, ElementsAre(11, 6, 14, 26, 0, 15, 19, 20, 16, 17, 21, 18, 27));
}

TEST_F(LoadPreferencesTest, WithoutAPlaceNoFileIsRead)
{
    host.Others = {{26, ""}, {27, ""}};
    const std::filesystem::path before = std::filesystem::current_path();
    std::filesystem::current_path(folder.Path());
    TestSupport::WriteFile("System.Prefs", "<");
    TestSupport::WriteFile("User.Prefs", "<");

    Load();

    std::filesystem::current_path(before);
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(LoadPreferencesTest, AFolderInTheFilesPlaceCountsAsMissing)
{
    std::filesystem::create_directories(SystemFile());
    std::filesystem::create_directories(UserFile());

    Load();

    EXPECT_THAT(Logged(), IsEmpty());
    EXPECT_EQ(TextOf("Preferences.System.SharedDataFolder"), Default(11));
}

TEST_F(LoadPreferencesTest, AFileOverridesTheDefaults)
{
    const std::string shared = MakeFolder("shared");
    const std::string user = MakeFolder("user");
    const std::string capture = folder.Path("a/b/capture");
    WritePreferences(SystemFile(), "System",
                     "<Node name='Directory'>" + StringItem("Default", capture) + "</Node>" +
                         StringItem("SharedDataFolder", shared) +
                         StringItem("UserDataFolder", user) + StringItem("Other", "kept"));

    Load();

    EXPECT_EQ(TextOf("Preferences.System.SharedDataFolder"), shared);
    EXPECT_EQ(TextOf("Preferences.System.UserDataFolder"), user);
    EXPECT_EQ(TextOf("Preferences.System.Directory.Default"), capture);
    EXPECT_TRUE(std::filesystem::is_directory(capture));
    EXPECT_EQ(TextOf("Preferences.System.Other"), "kept");
    EXPECT_THAT(Logged(), ElementsAre(LoadingSystem()));
}

TEST_F(LoadPreferencesTest, FoldersThatAreNotThereAreReplacedAndLogged)
{
    TestSupport::WriteFile(folder.Path("file"), "");
    const std::string below = folder.Path("file/below");
    WritePreferences(SystemFile(), "System",
                     "<Node name='Directory'>" + StringItem("Default", below) + "</Node>" +
                         StringItem("SharedDataFolder", folder.Path("file")) +
                         StringItem("UserDataFolder", folder.Path("missing")));

    Load();

    EXPECT_EQ(TextOf("Preferences.System.SharedDataFolder"), Default(11));
    EXPECT_EQ(TextOf("Preferences.System.UserDataFolder"), Default(6));
    EXPECT_EQ(TextOf("Preferences.System.Directory.Default"), Default(14));
    EXPECT_THAT(
        Logged(),
        ElementsAre(
            LoadingSystem(),
            "Preferences 2 Shared data root folder '" + folder.Path("file") + "' not accessible.",
            "Preferences 2 Using default folder for Shared data: '" + Default(11) + "'.",
            "Preferences 2 User data root folder '" + folder.Path("missing") + "' not accessible.",
            "Preferences 2 Using default folder for User data: '" + Default(6) + "'.",
            StartsWith("UtilsFileSystem 2 Unable to create path " + below + ": "),
            "Preferences 2 Capture folder '" + below + "' not accessible.",
            "Preferences 2 Using default folder: '" + Default(14) + "'."));
    EXPECT_THAT(host.Asked, ElementsAre(11, 6, 14, 26, 14, 0, 15, 19, 20, 16, 17, 21, 18, 27));
}

TEST_F(LoadPreferencesTest, AnEmptyCaptureFolderIsNotMade)
{
    MakeFolder("11");
    MakeFolder("6");
    WritePreferences(SystemFile(), "System",
                     "<Node name='Directory'>" + StringItem("Default", "") + "</Node>");

    Load();

    EXPECT_THAT(Logged(),
                ElementsAre(LoadingSystem(), "Preferences 2 Capture folder '' not accessible.",
                            "Preferences 2 Using default folder: '" + Default(14) + "'."));
}

TEST_F(LoadPreferencesTest, DefaultsAreCheckedOnceTheirFileWasRead)
{
    MakeFolder("11");
    TestSupport::WriteFile(SystemFile(), "");

    Load();

    EXPECT_THAT(
        Logged(),
        ElementsAre(LoadingSystem(),
                    "Preferences 2 User data root folder '" + Default(6) + "' not accessible.",
                    "Preferences 2 Using default folder for User data: '" + Default(6) + "'."));
    EXPECT_TRUE(std::filesystem::is_directory(Default(14)));
}

TEST_F(LoadPreferencesTest, AMalformedFileIsLoggedAndTheNextOneRead)
{
    TestSupport::WriteFile(SystemFile(), "<Configuration");
    WritePreferences(UserFile(), "User", StringItem("Other", "kept"));
    host.Features = {};

    Load();

    EXPECT_THAT(Logged(), ElementsAre(LoadingSystem(),
                                      "Config 2 Error loading preferences " + SystemFile() +
                                          ", failed parsing xml file contents.",
                                      LoadingUser()));
    EXPECT_EQ(TextOf("Preferences.System.SharedDataFolder"), Default(11));
    EXPECT_EQ(TextOf("Preferences.User.Other"), "kept");
}

TEST_F(LoadPreferencesTest, AMalformedUserFileLeavesTheDefaultsUnchecked)
{
    TestSupport::WriteFile(UserFile(), "<Configuration><Node></Configuration");

    Load();

    EXPECT_THAT(Logged(),
                ElementsAre(LoadingUser(), "Config 2 Error loading preferences " + UserFile() +
                                               ", failed parsing xml file contents."));
    EXPECT_EQ(TextOf("Preferences.User.FolderProps"), Default(16));
}

TEST_F(LoadPreferencesTest, WhatIsNoRegularFileIsUnreadable)
{
    ASSERT_EQ(mkfifo(UserFile().c_str(), 0600), 0);

    Load();

    EXPECT_THAT(Logged(),
                ElementsAre(LoadingUser(), "Config 2 Error loading preferences " + UserFile() +
                                               ", failed parsing xml file contents."));
}

TEST_F(LoadPreferencesTest, AFileThatIsTooGreatIsUnreadable)
{
    TestSupport::WriteFile(UserFile(), "");
    std::filesystem::resize_file(UserFile(), GreatestPreferenceFile + 1);

    Load();

    EXPECT_EQ(Logged().size(), 2U);
    EXPECT_THAT(Logged()[1], StartsWith("Config 2 Error loading preferences "));
}

TEST_F(LoadPreferencesTest, MessagesOfAFileAreLoggedAndTheRestIsLoaded)
{
    for (const int number : {15, 16, 17, 18, 19, 20, 21}) {
        MakeFolder(std::to_string(number));
    }
    WritePreferences(UserFile(), "User", "<Item/>" + StringItem("Other", "kept"));

    Load();

    EXPECT_EQ(TextOf("Preferences.User.Other"), "kept");
    EXPECT_THAT(Logged(),
                ElementsAre(LoadingUser(),
                            "DataStore 2 Item element missing required attribute name",
                            "DataStore 2 Encountered 'Item' with invalid 'name' attribute. (Parent "
                            "XPath=\"/Configuration/Node[@name='Preferences']/"
                            "Node[@name='User']\")"));
}

TEST_F(LoadPreferencesTest, AFileOfAnotherVersionGivesNothingButALegacySwitchAndItsChecks)
{
    host.Features = {4};
    TestSupport::WriteFile(UserFile(),
                           "<Configuration version='2.1'><Node name='Preferences'><Node "
                           "name='User'>" +
                               StringItem("Other", "new") + StringItem("AltToSelect", "false") +
                               "</Node></Node></Configuration>");

    Load();

    EXPECT_FALSE(Exists("Preferences.User.Other"));
    EXPECT_EQ(SwitchOf("Preferences.User.AltToSelect"), "false");
    EXPECT_THAT(
        Logged(),
        ElementsAre(LoadingUser(), StartsWith("DataStore 3 "),
                    "DataStore 2 Cannot load Quorix configuration file with version 2.1, maximum "
                    "supported version is 2.0",
                    "Preferences 2 Objects folder '" + Default(18) + "' not accessible.",
                    "Preferences 2 Using default folder for Objects: '" + Default(18) + "'."));
}

TEST_F(LoadPreferencesTest, UserFoldersAreCheckedInOrder)
{
    MakeFolder("19");
    WritePreferences(UserFile(), "User",
                     StringItem("FolderPropMeshes", "/nowhere") +
                         StringItem("FolderSkins", MakeFolder("skins")));

    Load();

    const auto missing = [&](const std::string& name, int number) {
        return "Preferences 2 " + name + " folder '" + Default(number) + "' not accessible.";
    };
    const auto otherwise = [&](const std::string& name, int number) {
        return "Preferences 2 Using default folder for " + name + ": '" + Default(number) + "'.";
    };
    EXPECT_THAT(Logged(),
                ElementsAre(LoadingUser(), missing("Subjects", 15), otherwise("Subjects", 15),
                            missing("Props", 16), otherwise("Props", 16),
                            "Preferences 2 Props folder '/nowhere' not accessible.",
                            otherwise("Props", 17), missing("Labeling Clusters", 21),
                            otherwise("Labeling Clusters", 21), missing("Objects", 18),
                            otherwise("Objects", 18)));
    EXPECT_EQ(TextOf("Preferences.User.FolderPropMeshes"), Default(17));
    EXPECT_EQ(TextOf("Preferences.User.FolderSkins"), folder.Path("skins"));
}

TEST_F(LoadPreferencesTest, AFeatureThatIsAbsentHasNoDefaultsAndNoChecks)
{
    host.Features = {3, 7};
    MakeFolder("21");
    WritePreferences(UserFile(), "User", StringItem("FolderProps", "/nowhere"));

    Load();

    EXPECT_EQ(TextOf("Preferences.User.FolderProps"), "/nowhere");
    EXPECT_FALSE(Exists("Preferences.User.FolderPropMeshes"));
    EXPECT_EQ(TextOf("Preferences.User.FolderClusters"), Default(21));
    EXPECT_THAT(host.Asked, ElementsAre(11, 6, 14, 26, 0, 21, 27));
    EXPECT_THAT(Logged(), ElementsAre(LoadingUser()));
}

TEST_F(LoadPreferencesTest, AltToSelectMayBeABool)
{
    host.Features = {};
    WritePreferences(UserFile(), "User",
                     "<Item name='AltToSelect' format='{\"Type\":\"Bool\"}' "
                     "value-verified='false'/>");

    Load();

    EXPECT_EQ(SwitchOf("Preferences.User.AltToSelect"), "false");
}

TEST_F(LoadPreferencesTest, AltToSelectMayBeALegacyString)
{
    host.Features = {};

    WritePreferences(UserFile(), "User", StringItem("AltToSelect", "false"));
    Load();
    EXPECT_EQ(SwitchOf("Preferences.User.AltToSelect"), "false");

    WritePreferences(UserFile(), "User", StringItem("AltToSelect", "no"));
    Load();
    EXPECT_EQ(SwitchOf("Preferences.User.AltToSelect"), "true");
}

TEST_F(LoadPreferencesTest, AKeyOfAnotherTypeKeepsItsDefault)
{
    MakeFolder("11");
    MakeFolder("6");
    WritePreferences(SystemFile(), "System",
                     "<Item name='SharedDataFolder' format='{\"Type\":\"Bool\"}' "
                     "value-verified='true'/>");

    Load();

    EXPECT_EQ(TextOf("Preferences.System.SharedDataFolder"), Default(11));
    EXPECT_THAT(Logged(), ElementsAre(LoadingSystem()));
}

TEST_F(LoadPreferencesTest, APathWithAZeroIsNoFolder)
{
    MakeFolder("11");
    MakeFolder("6");
    WritePreferences(SystemFile(), "System",
                     StringItem("SharedDataFolder", folder.Path() + "&#0;"));

    Load();

    EXPECT_EQ(TextOf("Preferences.System.SharedDataFolder"), Default(11));
    EXPECT_EQ(Logged().size(), 3U);
}

TEST_F(LoadPreferencesTest, KeysAreWrittenAndReadOneByOne)
{
    SetSystemFolder(store, "Key", "a");
    SetUserFolder(store, "Key", "b");
    SetBool(store, "Switch", false);

    EXPECT_EQ(GetSystemFolder(store, "Key"), "a");
    EXPECT_EQ(GetUserFolder(store, "Key"), "b");
    EXPECT_EQ(TextOf("Preferences.System.Key"), "a");
    EXPECT_EQ(TextOf("Preferences.User.Key"), "b");
    EXPECT_EQ(SwitchOf("Preferences.User.Switch"), "false");
    EXPECT_EQ(GetUserFolder(store, "Switch"), "");
    EXPECT_EQ(GetSystemFolder(store, "Missing"), "");
}

} // namespace
