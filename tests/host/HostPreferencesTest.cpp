#include "HostFolders.h"
#include "RunningHost.h"
#include "cameras/WireDevice.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>

#include <cstdlib>
#include <filesystem>
#include <optional>
#include <stdexcept>

// What a host keeps from one run to the next.

using QuorixHost::DefaultDataFolder;
using QuorixHost::VHostFolders;
using testing::HasSubstr;
using testing::Not;
using TestSupport::ContentOf;
using TestSupport::VHostProcess;
using TestSupport::VTemporaryFolder;

namespace {

namespace fs = std::filesystem;

/// Gives a variable of the environment another value for its own lifetime, or none.
class VVariable
{
public:
    VVariable(const char* name, const char* value) : name(name)
    {
        const char* const found = std::getenv(name);
        if (found != nullptr) {
            previous = found;
        }
        Set(value);
    }
    ~VVariable() { Set(previous ? previous->c_str() : nullptr); }

    VVariable(const VVariable&) = delete;
    VVariable& operator=(const VVariable&) = delete;

private:
    void Set(const char* value) const
    {
        if (value != nullptr) {
            setenv(name, value, 1);
        } else {
            unsetenv(name);
        }
    }

    const char* const name;
    std::optional<std::string> previous;
};

/// Runs a host once, from its start to its orderly end. @return what it wrote to standard error
std::string RunOnce(const std::string& dataFolder)
{
    VHostProcess host({"--headless", "--console", "--data", dataFolder});
    EXPECT_TRUE(host.WaitReady()) << host.Errors();
    EXPECT_EQ(host.Command("quit"), "ok");
    EXPECT_EQ(host.WaitExit().value_or(-1), 0) << host.Errors();
    return host.Errors();
}

/// Sends a device's request to be let in. @return the reply
std::string Authorize(CameraTest::VWireDevice& device, const std::string& id)
{
    return device.Run("System.Authorize", {{"DeviceId", id}, {"DeviceName", "Device"}});
}

/// Has a new device ask, and the operator answer once the dialog is open.
void AskAndAnswer(VHostProcess& host, const std::string& id, const std::string& answer,
                  const std::string& status)
{
    CameraTest::VWireDevice device;
    // The device before this one has not beaten for as long as it takes to let another one in.
    EXPECT_EQ(host.Command("clock +4000"), "ok");
    EXPECT_THAT(Authorize(device, id), HasSubstr("<Value>Pending</Value>"));
    EXPECT_TRUE(TestSupport::ComesTrue(
        [&] { return host.Command("state").find("\"dialog\":null") == std::string::npos; }));
    EXPECT_EQ(host.Command(answer), "ok");
    EXPECT_THAT(device.NextEvent(), HasSubstr("<Value>" + status + "</Value>"));
}

std::string UserPreferences(const std::string& items)
{
    return "<Configuration version=\"2.0\"><Node name=\"Preferences\"><Node name=\"User\">" +
           items + "</Node></Node></Configuration>";
}

} // namespace

TEST(HostFolders, EveryNumberHasAFolderOfItsOwn)
{
    const VTemporaryFolder temporary;
    VHostFolders folders(temporary.Path("new/data"));
    std::set<std::string> paths;

    for (const int number : {6, 11, 14, 15, 16, 17, 18, 19, 20, 21, 26, 27}) {
        paths.insert(folders.GetFolder(number));
        EXPECT_TRUE(fs::is_directory(folders.GetFolder(number))) << number;
    }

    EXPECT_EQ(paths.size(), 12U);
    EXPECT_EQ(folders.GetFolder(1), "");
    EXPECT_EQ(folders.GetFeatures(), (std::set<int>{1, 2, 3, 4}));
}

TEST(HostFolders, APlaceThatCannotBeUsedIsRefused)
{
    const VTemporaryFolder temporary;
    TestSupport::WriteFile(temporary.Path("file"), "");

    EXPECT_THROW(VHostFolders(temporary.Path("file")), std::runtime_error);
    EXPECT_THROW(VHostFolders(temporary.Path("file/below")), std::runtime_error);
}

TEST(HostFolders, AFileInTheWayOfOneOfThemIsRefused)
{
    const VTemporaryFolder temporary;
    TestSupport::WriteFile(temporary.Path("User"), "");

    EXPECT_THROW(VHostFolders(temporary.Path()), std::runtime_error);
}

TEST(HostFolders, TheDefaultFollowsTheUsersDataFolder)
{
    {
        const VVariable data("XDG_DATA_HOME", "/data/of/user");
        EXPECT_EQ(DefaultDataFolder(), "/data/of/user/quorix");
    }
    for (const char* const ignored : {static_cast<const char*>(nullptr), "", "relative"}) {
        const VVariable data("XDG_DATA_HOME", ignored);
        const VVariable home("HOME", "/home/user");
        EXPECT_EQ(DefaultDataFolder(), "/home/user/.local/share/quorix");
    }
    const VVariable data("XDG_DATA_HOME", nullptr);
    const VVariable home("HOME", nullptr);
    EXPECT_EQ(DefaultDataFolder(), "");
}

TEST(HostPreferences, AreWrittenAtTheEnd)
{
    const VTemporaryFolder temporary;

    RunOnce(temporary.Path());

    const std::string system = ContentOf(temporary.Path("System/System.Prefs"));
    const std::string user = ContentOf(temporary.Path("User/User.Prefs"));
    EXPECT_THAT(system, HasSubstr("<Item name=\"SharedDataFolder\" format='{\"Type\":\"String\"}' "
                                  "value-verified='\"" +
                                  temporary.Path("SharedData") + "\"'/>"));
    EXPECT_THAT(system, Not(HasSubstr("AltToSelect")));
    EXPECT_THAT(user, HasSubstr("<Item name=\"AltToSelect\" format='{\"Type\":\"Bool\"}' "
                                "value-verified=\"true\"/>"));
    EXPECT_THAT(user, HasSubstr("FolderPropMeshes"));
    EXPECT_THAT(user, Not(HasSubstr("Device")));
}

TEST(HostPreferences, AreLoadedAtTheStartAndKept)
{
    const VTemporaryFolder temporary;
    VHostFolders folders(temporary.Path());
    TestSupport::WriteFile(
        temporary.Path("User/User.Prefs"),
        UserPreferences("<Item name='AltToSelect' format='{\"Type\":\"Bool\"}' "
                        "value-verified='false'/><Item name='FolderSkins' "
                        "format='{\"Type\":\"String\"}' value-verified='\"/nowhere\"'/><Item "
                        "name='Own' format='{\"Type\":\"UInt8\"}' value-verified='7'/>"));

    const std::string errors = RunOnce(temporary.Path());

    const std::string user = ContentOf(temporary.Path("User/User.Prefs"));
    EXPECT_THAT(errors, HasSubstr("Loading preferences " + temporary.Path("User/User.Prefs")));
    EXPECT_THAT(errors, HasSubstr("Skins folder '/nowhere' not accessible."));
    EXPECT_THAT(user, HasSubstr("<Item name=\"AltToSelect\" format='{\"Type\":\"Bool\"}' "
                                "value-verified=\"false\"/>"));
    EXPECT_THAT(user, HasSubstr("<Item name=\"Own\" format='{\"Type\":\"UInt8\"}' "
                                "value-verified=\"7\"/>"));
    EXPECT_THAT(user, HasSubstr(temporary.Path("Skins")));
}

TEST(HostPreferences, AreTheSameAfterASecondRun)
{
    const VTemporaryFolder temporary;
    RunOnce(temporary.Path());
    const std::string system = ContentOf(temporary.Path("System/System.Prefs"));
    const std::string user = ContentOf(temporary.Path("User/User.Prefs"));

    RunOnce(temporary.Path());

    EXPECT_EQ(ContentOf(temporary.Path("System/System.Prefs")), system);
    EXPECT_EQ(ContentOf(temporary.Path("User/User.Prefs")), user);
}

TEST(HostPreferences, AFileThatCannotBeReadDoesNotStopTheHost)
{
    const VTemporaryFolder temporary;
    VHostFolders folders(temporary.Path());
    TestSupport::WriteFile(temporary.Path("System/System.Prefs"), "<Configuration");

    const std::string errors = RunOnce(temporary.Path());

    EXPECT_THAT(errors, HasSubstr("failed parsing xml file contents."));
}

TEST(HostPreferences, LieInTheUsersDataFolderByDefault)
{
    const VTemporaryFolder temporary;

    VHostProcess host({"--headless", "--console"}, {"env", "XDG_DATA_HOME=" + temporary.Path()});
    ASSERT_TRUE(host.WaitReady()) << host.Errors();
    host.Command("quit");
    ASSERT_EQ(host.WaitExit().value_or(-1), 0);

    EXPECT_TRUE(fs::is_regular_file(temporary.Path("quorix/User/User.Prefs")));
}

TEST(HostPreferences, AHostWithoutAPlaceForThemRunsWithoutThem)
{
    VHostProcess host({"--headless", "--console"}, {"env", "XDG_DATA_HOME=/proc/none"});

    ASSERT_TRUE(host.WaitReady()) << host.Errors();
    host.Command("quit");

    EXPECT_EQ(host.WaitExit().value_or(-1), 0);
    EXPECT_THAT(host.Errors(), HasSubstr("Preferences are not kept: the data folder "
                                         "/proc/none/quorix cannot be made or written to"));
}

TEST(HostPreferences, AHostWithoutAHomeRunsWithoutThem)
{
    VHostProcess host({"--headless", "--console"},
                      {"env", "--unset=HOME", "--unset=XDG_DATA_HOME"});

    ASSERT_TRUE(host.WaitReady()) << host.Errors();
    host.Command("quit");

    EXPECT_EQ(host.WaitExit().value_or(-1), 0);
    EXPECT_THAT(host.Errors(), HasSubstr("There is no home folder: preferences are not kept"));
}

TEST(HostPreferences, AnOperatorsChoicesSurviveARestart)
{
    const VTemporaryFolder temporary;
    const std::vector<std::string> options{"--console", "--data", temporary.Path()};
    {
        TestSupport::VRunningHost host(options, {"env", "QT_QPA_PLATFORM=offscreen"});
        AskAndAnswer(host, "tablet", "answer allow remember", "Authorized");
        AskAndAnswer(host, "stranger", "answer deny remember", "Failed");
        TestSupport::ExpectOrderlyEnd(host);
    }
    const std::string user = ContentOf(temporary.Path("User/User.Prefs"));

    TestSupport::VRunningHost host({"--headless", "--console", "--data", temporary.Path()});
    CameraTest::VWireDevice device;

    EXPECT_THAT(Authorize(device, "stranger"), HasSubstr("<Value>Failed</Value>"));
    EXPECT_THAT(Authorize(device, "tablet"), HasSubstr("<Value>Authorized</Value>"));
    TestSupport::ExpectOrderlyEnd(host);
    EXPECT_EQ(ContentOf(temporary.Path("User/User.Prefs")), user);
    EXPECT_THAT(user, HasSubstr("<Item name=\"AllowedControls\" "));
    EXPECT_THAT(user, HasSubstr("<Item name=\"BannedControls\" "));
}
