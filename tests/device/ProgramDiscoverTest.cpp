#include "device/ChildProgram.h"
#include "device/DiscoverySupport.h"

#include <gmock/gmock.h>

#include <unistd.h>

namespace {

using testing::AllOf;
using testing::HasSubstr;
using TestSupport::VHostProcess;

/// Discovers until there is somebody, as a host that has just started is not seen at once.
VOutcome DiscoverUntilSeen(const std::vector<std::string>& arguments)
{
    const auto deadline = std::chrono::steady_clock::now() + TestSupport::hostLimit;
    VOutcome outcome = RunProgram(arguments);
    while (outcome.ExitCode == 3 && std::chrono::steady_clock::now() < deadline) {
        outcome = RunProgram(arguments);
    }
    return outcome;
}

std::string OwnServiceName()
{
    char hostName[256] = "";
    gethostname(hostName, sizeof hostName - 1);
    return std::string("Quorix on ") + hostName;
}

class ProgramDiscover : public VQuietNetwork
{
};

TEST_F(ProgramDiscover, ListsAHostForPeople)
{
    const VAdvertiser advertiser("Quorix on studio", "studio.local", "127.0.0.5");

    const VOutcome outcome = RunProgram({"discover"});

    EXPECT_EQ("Quorix on studio\n  host: studio.local\n  addresses: 127.0.0.5\n  interface: lo\n"
              "  advertised port: 810 (the port to connect to is 803)\n",
              outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST_F(ProgramDiscover, ListsEachHostAsOneJsonLine)
{
    const VAdvertiser first("A \"b\"", "one.local", "127.0.0.5");
    const VAdvertiser second("C", "two.local", "127.0.0.6");

    const VOutcome outcome = RunProgram({"--json", "--port", "1803", "discover"});

    EXPECT_EQ(R"({"name":"A \"b\"","host":"one.local","interface":"lo","addresses":["127.0.0.5"],)"
              R"("advertisedPort":810,"port":1803})"
              "\n"
              R"({"name":"C","host":"two.local","interface":"lo","addresses":["127.0.0.6"],)"
              R"("advertisedPort":810,"port":1803})"
              "\n",
              outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST_F(ProgramDiscover, MakesANameHarmlessForTheTerminal)
{
    const VAdvertiser advertiser("Stage\x1B[31m");

    EXPECT_THAT(RunProgram({"discover"}).Output, HasSubstr("Stage\\x1B[31m\n"));
}

TEST_F(ProgramDiscover, SaysThatNobodyIsThere)
{
    const VOutcome outcome = RunProgram({"discover"});

    EXPECT_EQ("", outcome.Output);
    EXPECT_EQ("korva-control: no host advertises itself; doctor tells more\n", outcome.Errors);
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST_F(ProgramDiscover, FindsARealHostAndEveryCommandTakesItsName)
{
    VHostProcess host;
    ASSERT_TRUE(host.WaitReady()) << host.Errors();

    const VOutcome discovered = DiscoverUntilSeen({"--json", "discover"});

    EXPECT_THAT(discovered.Output, AllOf(HasSubstr("{\"name\":\"" + OwnServiceName() + "\","),
                                         HasSubstr("\"addresses\":[\"127.0.0.1\""),
                                         HasSubstr("\"advertisedPort\":810,\"port\":803}")));
    const VOutcome information = RunProgram({"--host", OwnServiceName(), "info"});
    EXPECT_EQ("Control stream 1.0 at " + OwnServiceName() + ":803\n", information.Output);
    EXPECT_EQ(0, information.ExitCode) << information.Errors;
}

TEST_F(ProgramDiscover, ANameThatNobodyBearsIsNoConnection)
{
    const VOutcome outcome = RunProgram({"--host", "Quorix on nowhere", "info"});

    EXPECT_EQ("korva-control: no host advertises itself as 'Quorix on nowhere'\n", outcome.Errors);
    EXPECT_EQ(3, outcome.ExitCode);
}

} // namespace
