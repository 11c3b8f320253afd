#include "RunningHost.h"
#include "support/TestListener.h"

#include <gmock/gmock.h>

#include <fstream>
#include <string>
#include <unistd.h>

// What the host says where devices cannot reach it. The plug-in itself is silent about it.

using testing::HasSubstr;
using testing::Not;
using TestSupport::Connect;
using TestSupport::VRawClient;
using TestSupport::VRunningHost;

namespace {

/// Runs the host without the privilege of low ports.
const std::vector<std::string> withoutPrivilege = {"setpriv", "--bounding-set=-net_bind_service",
                                                   "--inh-caps=-net_bind_service"};

/// Sets from which port on this network asks for no privilege.
void SetUnprivilegedPortStart(int port)
{
    std::ofstream("/proc/sys/net/ipv4/ip_unprivileged_port_start") << port;
}

} // namespace

TEST(HostPort, ATakenPortIsToldWithWhoHoldsIt)
{
    TestSupport::VTestListener other(TestSupport::VTestListener::listening, 803);

    VRunningHost host;
    TestSupport::ExpectOrderlyEnd(host);

    EXPECT_THAT(host.Errors(),
                HasSubstr("TCP port 803 is taken: process " + std::to_string(getpid()) + " ("));
    EXPECT_THAT(host.Errors(), HasSubstr("No device can connect to this host."));
    EXPECT_THAT(host.Errors(), Not(HasSubstr("Devices can connect")));
}

TEST(HostPort, AMissingPrivilegeIsToldWithTheWaysToGetIt)
{
    VRunningHost host({"--headless", "--console"}, withoutPrivilege);

    EXPECT_EQ("ok", host.Command("fire Event.X"));
    TestSupport::ExpectOrderlyEnd(host);

    EXPECT_THAT(host.Errors(), HasSubstr("This user may not listen on TCP port 803"));
    EXPECT_THAT(host.Errors(), HasSubstr("sysctl -w net.ipv4.ip_unprivileged_port_start=803"));
    EXPECT_THAT(host.Errors(), HasSubstr("setcap cap_net_bind_service=+ep"));
}

TEST(HostPort, WithoutPrivilegeItListensWhereTheSystemAllowsIt)
{
    SetUnprivilegedPortStart(803);
    {
        VRunningHost host({"--headless", "--console"}, withoutPrivilege);

        TestSupport::ExpectAnswersTheNextGoodFrame();
        TestSupport::ExpectOrderlyEnd(host);
        EXPECT_THAT(host.Errors(), HasSubstr("Devices can connect to TCP port 803"));
    }
    SetUnprivilegedPortStart(1024);
}

TEST(HostPort, ALoopbackInterfaceThatIsDownIsTold)
{
    VRunningHost host({"--headless", "--console"}, {"unshare", "-n"});
    TestSupport::ExpectOrderlyEnd(host);

    EXPECT_THAT(host.Errors(), HasSubstr("The plug-in listens on TCP port 803, but a connection to "
                                         "127.0.0.1 fails: Network is unreachable"));
    EXPECT_THAT(host.Errors(), HasSubstr("ip link set lo up"));
}

TEST(HostPort, TheChecksOwnConnectionLeavesNothingBehind)
{
    VRunningHost host;
    TestSupport::ExpectAnswersTheNextGoodFrame();

    EXPECT_TRUE(TestSupport::ComesTrue([] {
        for (const QuorixHost::VSocketRow& row : QuorixHost::ReadSocketTables()) {
            if (row.localPort == 803 && row.inode != 0 &&
                row.state != QuorixHost::socketStateListening) {
                return false;
            }
        }
        return true;
    }));
}
