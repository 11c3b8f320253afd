#include "PreferencesFixture.h"
#include "support/ChildProcess.h"
#include "support/TracedProcess.h"

#include <sys/stat.h>

using namespace PreferencesTest;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using TestSupport::ContentOf;

namespace {

const std::string head = "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"no\"?>\n";
const std::string emptyFile = head + "<Configuration version=\"2.0\"/>\n\n";

class SavePreferencesTest : public PreferencesFixture
{
protected:
    void Save() { SavePreferences(store, host); }

    void Put(const char* path, const VDataValue& value, std::uint32_t flags = 0)
    {
        VDataVerifyWriter writer(store);
        const VDataToken token{VDataPath(path)};
        EXPECT_TRUE(writer.SetValue(token, value));
        EXPECT_TRUE(writer.SetFlags(token, flags));
    }
};

TEST_F(SavePreferencesTest, EachFileHoldsItsOwnSubTree)
{
    Put("Preferences.System.SharedDataFolder", MakeStringValue("/shared"));
    Put("Preferences.User.AltToSelect", MakeBoolValue(false));
    Put("Preferences.Other", MakeBoolValue(true));
    Put("Preferences.User", MakeBoolValue(true));
    Put("System.Other", MakeBoolValue(true));

    Save();

    EXPECT_EQ(ContentOf(SystemFile()),
              head + "<Configuration version=\"2.0\">\n"
                     "\t<Node name=\"Preferences\">\n"
                     "\t\t<Node name=\"System\">\n"
                     "\t\t\t<Item name=\"SharedDataFolder\" format='{\"Type\":\"String\"}' "
                     "value-verified='\"/shared\"'/>\n"
                     "\t\t</Node>\n"
                     "\t</Node>\n"
                     "</Configuration>\n\n");
    EXPECT_EQ(ContentOf(UserFile()),
              head + "<Configuration version=\"2.0\">\n"
                     "\t<Node name=\"Preferences\">\n"
                     "\t\t<Node name=\"User\">\n"
                     "\t\t\t<Item name=\"AltToSelect\" format='{\"Type\":\"Bool\"}' "
                     "value-verified=\"false\"/>\n"
                     "\t\t</Node>\n"
                     "\t</Node>\n"
                     "</Configuration>\n\n");
    EXPECT_THAT(host.Asked, ElementsAre(26, 27));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(SavePreferencesTest, AnEmptySubTreeGivesAFileAllTheSame)
{
    Save();

    EXPECT_EQ(ContentOf(SystemFile()), emptyFile);
    EXPECT_EQ(ContentOf(UserFile()), emptyFile);
}

TEST_F(SavePreferencesTest, ItemsAtAnyDepthAreSaved)
{
    SetCaptureFolder(store, "/captures");
    Put("Preferences.System.A.B.C", MakeBoolValue(true));

    Save();

    EXPECT_THAT(ContentOf(SystemFile()), HasSubstr("\t\t\t<Node name=\"Directory\">\n"
                                                   "\t\t\t\t<Item name=\"Default\" "));
    EXPECT_THAT(ContentOf(SystemFile()), HasSubstr("\t\t\t\t<Node name=\"B\">\n"
                                                   "\t\t\t\t\t<Item name=\"C\" "));
}

TEST_F(SavePreferencesTest, AFileThatWouldNotBeReadAgainLeavesTheOldOne)
{
    Put("Preferences.User.A", MakeStringValue("old"));
    Save();
    const std::string old = ContentOf(UserFile());

    Put("Preferences.User.A", MakeStringValue(std::string(GreatestPreferenceFile, 'n')));
    Put("Preferences.System.A", MakeBoolValue(true));
    Save();

    EXPECT_TRUE(ContentOf(UserFile()) == old); // too long to be shown
    EXPECT_THAT(ContentOf(SystemFile()), HasSubstr("\"A\""));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(SavePreferencesTest, ReadOnlyItemsStayOut)
{
    Put("Preferences.User.A", MakeBoolValue(true), EDataValueFlags::ReadOnly);
    Put("Preferences.User.B", MakeBoolValue(true), EDataValueFlags::NotSerialized);

    Save();

    EXPECT_THAT(ContentOf(UserFile()), Not(HasSubstr("\"A\"")));
    EXPECT_THAT(ContentOf(UserFile()), HasSubstr("\"B\""));
}

TEST_F(SavePreferencesTest, BothValuesOfAnItemAreSaved)
{
    {
        VDataVerifyWriter writer(store);
        const VDataToken token{VDataPath("Preferences.User.A")};
        writer.SetFlags(token, EDataValueFlags::VerifyRequired);
        writer.SetProposedValue(token, MakeBoolValue(true));
        writer.SetVerifiedValue(token, MakeBoolValue(false));
    }

    Save();

    EXPECT_THAT(ContentOf(UserFile()),
                HasSubstr("value-proposed=\"true\" value-verified=\"false\""));
}

TEST_F(SavePreferencesTest, WithoutAPlaceNothingIsWritten)
{
    host.Others = {{26, ""}};
    Put("Preferences.User.A", MakeBoolValue(true));
    const std::filesystem::path before = std::filesystem::current_path();
    std::filesystem::current_path(folder.Path());

    Save();

    std::filesystem::current_path(before);
    EXPECT_EQ(ContentOf(SystemFile()), "(no file)");
    EXPECT_FALSE(std::filesystem::exists(folder.Path("System.Prefs"))); // nor where the host runs
    EXPECT_THAT(ContentOf(UserFile()), HasSubstr("\"A\""));
}

TEST_F(SavePreferencesTest, AFolderThatIsMissingOrAFileIsPassedOver)
{
    TestSupport::WriteFile(folder.Path("file"), "content");
    host.Others = {{26, folder.Path("missing")}, {27, folder.Path("file")}};

    Save();

    EXPECT_FALSE(std::filesystem::exists(folder.Path("missing")));
    EXPECT_EQ(ContentOf(folder.Path("file")), "content");
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(SavePreferencesTest, AFolderInTheFilesPlaceStays)
{
    std::filesystem::create_directories(UserFile());

    Save();

    EXPECT_TRUE(std::filesystem::is_directory(UserFile()));
    EXPECT_EQ(ContentOf(SystemFile()), emptyFile);
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(SavePreferencesTest, WhatIsSavedIsLoadedAgain)
{
    host.Features = {};
    Load();
    std::filesystem::create_directories(folder.Path("elsewhere"));
    SetSystemFolder(store, PreferenceKey::SharedDataFolder, folder.Path("elsewhere"));
    SetSystemFolder(store, PreferenceKey::UserDataFolder, folder.Path("elsewhere"));
    SetBool(store, PreferenceKey::AltToSelect, false);
    Put("Preferences.User.Custom", MakeStringValue("a\tb\n\"<&>'\xE4\xB8\x80"));
    Save();
    VDataStore second;

    LoadPreferences(second, host);
    const std::string firstFile = ContentOf(UserFile());
    SavePreferences(second, host);

    EXPECT_EQ(GetSystemFolder(second, PreferenceKey::SharedDataFolder), folder.Path("elsewhere"));
    EXPECT_EQ(GetUserFolder(second, "Custom"), "a\tb\n\"<&>'\xE4\xB8\x80");
    EXPECT_EQ(ContentOf(UserFile()), firstFile);
}

TEST_F(SavePreferencesTest, AKillAtAnyStepLeavesWholeFiles)
{
    host.Features = {};
    Put("Preferences.User.A", MakeStringValue(std::string(300, 'o')));
    Save();
    const std::string oldUser = ContentOf(UserFile());
    const std::string oldSystem = ContentOf(SystemFile());
    Put("Preferences.User.A", MakeStringValue(std::string(400, 'n')));
    Put("Preferences.System.A", MakeBoolValue(true));
    Save();
    const std::string newUser = ContentOf(UserFile());
    const std::string newSystem = ContentOf(SystemFile());
    ASSERT_NE(oldUser, newUser);

    const std::size_t kills = TestSupport::KillAtEachStep(
        [&] {
            TestSupport::WriteFile(UserFile(), oldUser);
            TestSupport::WriteFile(SystemFile(), oldSystem);
        },
        [&] { Save(); },
        [&] {
            const std::string user = ContentOf(UserFile());
            const std::string system = ContentOf(SystemFile());
            EXPECT_TRUE(user == oldUser || user == newUser) << user.size();
            EXPECT_TRUE(system == oldSystem || system == newSystem) << system.size();
        });

    EXPECT_GT(kills, 20U);
}

TEST_F(SavePreferencesTest, AFullDiskLeavesTheOldFiles)
{
    const int code = TestSupport::RunOnSmallDisk(folder.Path(), "size=64k", [&] {
        std::filesystem::create_directories(folder.Path("26"));
        std::filesystem::create_directories(folder.Path("27"));
        Save();
        Put("Preferences.User.A", MakeStringValue(std::string(100000, 'n')));
        Put("Preferences.System.A", MakeBoolValue(true));
        Save();
        const bool kept = ContentOf(UserFile()) == emptyFile &&
                          ContentOf(SystemFile()).find("\"A\"") != std::string::npos;
        return kept && Logged().empty() ? 0 : 1;
    });

    if (code == TestSupport::notAllowed) {
        GTEST_SKIP() << "the kernel forbids namespaces here";
    }
    EXPECT_EQ(code, 0);
}

TEST_F(SavePreferencesTest, WithoutPermissionTheOldFilesStay)
{
    Save();
    chmod(UserFile().c_str(), 0444);
    chmod(folder.Path("26").c_str(), 0000);
    Put("Preferences.User.A", MakeBoolValue(true));
    Put("Preferences.System.A", MakeBoolValue(true));

    const int code = TestSupport::RunWithoutPrivileges([&] {
        Save();
        return Logged().empty() ? 0 : 1;
    });

    chmod(folder.Path("26").c_str(), 0755);
    if (code == TestSupport::notAllowed) {
        GTEST_SKIP() << "the kernel forbids namespaces here";
    }
    EXPECT_EQ(code, 0);
    EXPECT_EQ(ContentOf(UserFile()), emptyFile);
    EXPECT_EQ(ContentOf(SystemFile()), emptyFile);
}

TEST_F(SavePreferencesTest, AFileThatMayNotBeReadCountsAsUnreadable)
{
    Save();
    chmod(UserFile().c_str(), 0000);
    host.Features = {};
    std::filesystem::remove(SystemFile());

    const int code = TestSupport::RunWithoutPrivileges([&] {
        Load();
        const Texts expected{"Config 4 Loading preferences " + UserFile(),
                             "Config 2 Error loading preferences " + UserFile() +
                                 ", failed parsing xml file contents."};
        return Logged() == expected ? 0 : 1;
    });

    if (code == TestSupport::notAllowed) {
        GTEST_SKIP() << "the kernel forbids namespaces here";
    }
    EXPECT_EQ(code, 0);
}

} // namespace
