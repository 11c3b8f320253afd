#include "QuorixVersion.h"
#include "RunningHost.h"

#include <gmock/gmock.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <string>

// The host's command line and console, driven from outside.

using namespace std::string_literals;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;
using TestSupport::Connect;
using TestSupport::VHostProcess;
using TestSupport::VRawClient;
using TestSupport::VRunningHost;

namespace {

namespace fs = std::filesystem;

/// A folder that goes with the test.
class VTemporaryFolder
{
public:
    VTemporaryFolder()
    {
        std::string name = testing::TempDir() + "quorix-XXXXXX";
        path = mkdtemp(name.data());
    }
    ~VTemporaryFolder() { fs::remove_all(path); }
    VTemporaryFolder(const VTemporaryFolder&) = delete;
    VTemporaryFolder& operator=(const VTemporaryFolder&) = delete;

    fs::path path;
};

/// Runs the host to its end. @return its exit code, -1 where it did not end
int ExitCodeOf(VHostProcess& host)
{
    return host.WaitExit().value_or(-1);
}

} // namespace

TEST(HostConsole, AnswersEachCommandWithOneLine)
{
    VRunningHost host;

    EXPECT_EQ("ok", host.Command("fire Event.X"));
    EXPECT_THAT(host.Command("state"), StartsWith(R"(ok {"cameras":[{)"));
    EXPECT_EQ("error: unknown command 'bogus'", host.Command("bogus"));
    EXPECT_EQ("error: expected a command", host.Command(""));
    EXPECT_EQ("error: expected NAME=VALUE, not 'x'", host.Command("fire Event.X x"));
    EXPECT_EQ("error: the line is not valid UTF-8", host.Command("fire \xff"));
    EXPECT_EQ("error: the line holds a control character", host.Command("state\0"s));
    EXPECT_EQ("error: the line is longer than 1048576 bytes",
              host.Command(std::string(5'000'000, 'x')));
    EXPECT_EQ("ok", host.Command("quit"));
    EXPECT_EQ(0, ExitCodeOf(host)) << host.Errors();
    EXPECT_EQ(std::nullopt, host.ReadLine());
}

TEST(HostConsole, FirePublishesToEveryDevice)
{
    VRunningHost host;
    VRawClient first = Connect();
    VRawClient second = Connect();
    first.Request("<ServerInformation/>");
    second.Request("<ServerInformation/>");

    EXPECT_EQ("ok", host.Command("fire Event.X b=\"1 < 2\" a=\xF0\x9F\x98\x80"));

    const std::string event =
        TestSupport::declaration +
        "<Event><Name>Event.X</Name><Parameters>"
        "<Parameter><Name>a</Name><Value>\xF0\x9F\x98\x80</Value></Parameter>"
        "<Parameter><Name>b</Name><Value>1 &lt; 2</Value></Parameter></Parameters></Event>";
    EXPECT_EQ(event, first.ReadFrame());
    EXPECT_EQ(event, second.ReadFrame());
}

TEST(HostConsole, TakesNoLineBehindQuit)
{
    VRunningHost host;

    host.SendBytes("quit\nstate\n");

    EXPECT_EQ("ok", host.ReadLine());
    EXPECT_EQ(0, ExitCodeOf(host));
    EXPECT_EQ(std::nullopt, host.ReadLine());
}

TEST(HostConsole, TheEndOfTheInputEndsTheConsoleAndNotTheHost)
{
    VRunningHost host;

    host.SendBytes("state"); // a last line without an end counts
    host.CloseInput();

    EXPECT_THAT(host.ReadLine().value_or(""), StartsWith(R"(ok {"cameras":[{)"));
    EXPECT_TRUE(host.WaitForError("The console's input has ended"));
    TestSupport::ExpectAnswersTheNextGoodFrame();
    host.Signal(SIGTERM);
    EXPECT_EQ(0, ExitCodeOf(host)) << host.Errors();
}

TEST(HostConsole, WithoutItNothingIsRead)
{
    VHostProcess host({"--headless"});
    host.SendBytes("quit\n");

    EXPECT_TRUE(host.WaitForError("Devices can connect to TCP port 803"));
    TestSupport::ExpectAnswersTheNextGoodFrame();
    host.Signal(SIGINT);

    EXPECT_EQ(0, ExitCodeOf(host)) << host.Errors();
    EXPECT_EQ(std::nullopt, host.ReadLine());
}

TEST(HostOptions, HelpAndVersionEndWith0)
{
    VHostProcess version({"--version"});
    EXPECT_EQ(0, ExitCodeOf(version));
    EXPECT_EQ("quorix-host " QUORIX_VERSION, version.ReadLine());

    VHostProcess help({"--help"});
    EXPECT_EQ(0, ExitCodeOf(help));
    EXPECT_NE(std::nullopt, help.ReadLine());
    EXPECT_EQ("", help.Errors());
}

TEST(HostOptions, WrongUsageEndsWith2AndNamesTheOption)
{
    const std::vector<std::vector<std::string>> wrong = {
        {"--bogus"}, {"--cameras", "many"}, {"--log", "Host"}, {"--plugin"}};
    for (const std::vector<std::string>& arguments : wrong) {
        VHostProcess host(arguments);
        EXPECT_EQ(2, ExitCodeOf(host)) << arguments[0];
        EXPECT_EQ(std::nullopt, host.ReadLine());
        EXPECT_TRUE(host.WaitForError(arguments[0])) << host.Errors();
    }
}

TEST(HostOptions, CamerasAreNumberedFrom1)
{
    VRunningHost host({"--headless", "--console", "--cameras", "2"});
    VRawClient device = Connect();

    EXPECT_THAT(device.Request("<ExecuteCommand><Name>Host.Information</Name>"
                               "<Correlation>1</Correlation></ExecuteCommand>"),
                HasSubstr("<Parameter><Name>Cameras</Name><Value>1,2</Value></Parameter>"));
    EXPECT_THAT(host.Command("state"), AllOf(HasSubstr(R"("id":1})"), HasSubstr(R"("id":2})"),
                                             Not(HasSubstr(R"("id":3})"))));
}

TEST(HostOptions, LogLevelsCount)
{
    VRunningHost quiet({"--headless", "--console", "--log", "Host=2"});
    TestSupport::ExpectOrderlyEnd(quiet);
    EXPECT_EQ("", quiet.Errors());
}

TEST(HostOptions, WithoutADisplayAWindowEndsWith1)
{
    VHostProcess host({"--console"},
                      {"env", "-u", "DISPLAY", "-u", "WAYLAND_DISPLAY", "-u", "QT_QPA_PLATFORM"});

    EXPECT_EQ(1, host.WaitExit().value_or(-1));

    EXPECT_THAT(host.Errors(), HasSubstr("There is no display for a window"));
    EXPECT_THAT(host.Errors(), HasSubstr("--headless"));
}

TEST(HostOptions, WithADeadDisplayAWindowEndsWith1)
{
    VHostProcess host({"--console"}, {"env", "-u", "QT_QPA_PLATFORM", "DISPLAY=:7777"});

    EXPECT_EQ(1, host.WaitExit().value_or(-1));

    EXPECT_THAT(host.Errors(), HasSubstr("There is no display for a window"));
    EXPECT_THAT(host.Errors(), HasSubstr(":7777"));
}

TEST(HostOptions, AMissingPluginEndsWith1)
{
    VHostProcess host({"--headless", "--console", "--plugin", "/no/such/plugin.so"});

    EXPECT_EQ(1, ExitCodeOf(host));
    EXPECT_EQ(std::nullopt, host.ReadLine());
    EXPECT_TRUE(host.WaitForError("Cannot start: the plug-in cannot be loaded: /no/such/plugin.so"))
        << host.Errors();
}

TEST(HostOptions, TheDataFolderIsMade)
{
    const VTemporaryFolder temporary;
    const fs::path folder = temporary.path / "a" / "b";

    VRunningHost host({"--headless", "--console", "--data", folder.string()});

    EXPECT_TRUE(fs::is_directory(folder));
    TestSupport::ExpectOrderlyEnd(host);
}

TEST(HostOptions, ADataFolderThatCannotBeMadeEndsWith1)
{
    const VTemporaryFolder temporary;
    const fs::path file = temporary.path / "file";
    std::ofstream(file) << "text";

    VHostProcess host({"--headless", "--console", "--data", (file / "x").string()});

    EXPECT_EQ(1, ExitCodeOf(host));
    EXPECT_TRUE(host.WaitForError("the data folder " + (file / "x").string())) << host.Errors();
}

TEST(HostOptions, AnInstalledPluginIsFoundBesideTheProgram)
{
    const VTemporaryFolder temporary;
    const fs::path programs = temporary.path / "bin";
    const fs::path plugins = (programs / QUORIX_INSTALLED_PLUGIN_FOLDER).lexically_normal();
    fs::create_directories(programs);
    fs::create_directories(plugins);
    const fs::path program = programs / "quorix-host";
    fs::copy_file(VHostProcess::Program(), program);
    const fs::path plugin = plugins / fs::path(QUORIX_PLUGIN_LIBRARY).filename();
    fs::copy_file(QUORIX_PLUGIN_LIBRARY, plugin);

    VHostProcess installed({"--headless", "--console"}, {}, program.string());

    EXPECT_TRUE(installed.WaitReady()) << installed.Errors();
    TestSupport::ExpectOrderlyEnd(installed);
    EXPECT_THAT(installed.Errors(), HasSubstr("Loaded the plug-in " + plugin.string()));
}

TEST(HostOptions, TheLimitOfOpenFilesIsRaisedToTheHardOne)
{
    VRunningHost host({"--headless", "--console"}, {"prlimit", "--nofile=256:600"});

    std::ifstream limits("/proc/" + std::to_string(host.Pid()) + "/limits");
    const std::string text((std::istreambuf_iterator<char>(limits)), {});
    EXPECT_THAT(text, testing::ContainsRegex("Max open files +600 +600"));
    EXPECT_TRUE(host.WaitForError("Raised the limit of open files from 256 to 600"));
}
