#include "FakeHost/Faults.h"
#include "ControlStreamClient/AsyncClient.h"
#include "FakeHost/FakeHost.h"
#include "FakeHost/SimulatedContent.h"
#include "device/ClientSupport.h"
#include "device/FullListener.h"
#include "device/SocketFacts.h"

#include <optional>
#include <thread>

#include <gmock/gmock.h>

namespace {

using namespace ControlStream;
using namespace std::chrono_literals;
using FakeHost::VFaults;
using testing::HasSubstr;
using testing::StartsWith;

/// A fake host behind a proxy whose first connections are faulty.
class VFaultyHost
{
public:
    explicit VFaultyHost(const VFaults& faults)
        : host(FakeHost::MakeSimulatedContent(2, {}), 0),
          proxy(0, FakeHost::LoopbackAddress(host.Port()), [faults](unsigned connection) {
              return FakeHost::MakeFaultFilter(faults, connection);
          })
    {
    }

    std::uint16_t Port() const { return proxy.Port(); }

private:
    FakeHost::VFakeHost host;
    FakeHost::VByteProxy proxy;
};

VFaults Faulty(unsigned connections = 1)
{
    VFaults faults;
    faults.Connections = connections;
    return faults;
}

VAsyncOptions OptionsFor(const VFaultyHost& host, std::chrono::milliseconds limit)
{
    VAsyncOptions options;
    options.Port = host.Port();
    options.TimeLimit = Patient;
    options.ConnectLimit = limit;
    options.BackOff = VBackOffOptions{1ms, 10ms, 0.0};
    return options;
}

/// What the blocking client gets from a faulty connection, and that the next one is as good as new.
struct VFaultCase
{
    const char* Name;
    VFaults Faults;
    std::chrono::milliseconds Limit;
    EErrorKind Kind;
    std::string Text; // the beginning of it
};

class Fault : public testing::TestWithParam<VFaultCase>
{
};

TEST_P(Fault, GivesTheRightErrorAndTheClientRecovers)
{
    const VFaultCase& fault = GetParam();
    VFaultyHost host(fault.Faults);
    VClient client(WithLimit(fault.Limit));
    client.Connect("127.0.0.1", host.Port(), Patient);

    const auto start = std::chrono::steady_clock::now();
    const VThrown thrown = ThrownBy([&] { client.GetCommands(); });
    const auto took = std::chrono::steady_clock::now() - start;

    EXPECT_EQ(fault.Kind, thrown.Kind) << thrown;
    EXPECT_THAT(thrown.Text, StartsWith(fault.Text));
    EXPECT_LT(took, Patient);
    client.SetTimeLimit(Patient);
    client.Connect("127.0.0.1", host.Port(), Patient);
    EXPECT_EQ("Host.Information", client.GetCommands().front());
}

const VFaults delayed = [] {
    VFaults faults = Faulty();
    faults.Delay = 1h;
    return faults;
}();
const VFaults cutInHeader = [] {
    VFaults faults = Faulty();
    faults.CutAfter = 3;
    return faults;
}();
const VFaults cutInText = [] {
    VFaults faults = Faulty();
    faults.CutAfter = 100;
    return faults;
}();
const VFaults cutAtOnce = [] {
    VFaults faults = Faulty();
    faults.CutAfter = 0;
    return faults;
}();
const VFaults silent = [] {
    VFaults faults = Faulty();
    faults.NeverReplies = true;
    return faults;
}();
const VFaults deaf = [] {
    VFaults faults = Faulty();
    faults.NeverReads = true;
    return faults;
}();
const VFaults noisy = [] {
    VFaults faults = Faulty();
    faults.GarbageAfter = 0;
    return faults;
}();
const VFaults noisyInText = [] {
    VFaults faults = Faulty();
    faults.GarbageAfter = 4;
    return faults;
}();

// clang-format off
const VFaultCase faultCases[] = {
    {"Delay", delayed, Hasty, EErrorKind::TimedOut, "timed out after 0.03 s, waiting for the list of commands"},
    {"NeverReply", silent, Hasty, EErrorKind::TimedOut, "timed out after 0.03 s, waiting for the list of commands"},
    {"NeverRead", deaf, Hasty, EErrorKind::TimedOut, "timed out after 0.03 s, waiting for the list of commands"},
    {"CutAtOnce", cutAtOnce, Patient, EErrorKind::Closed, "the host closed the connection"},
    {"CutInHeader", cutInHeader, Patient, EErrorKind::Closed,
     "the host closed the connection in the middle of a frame, after 3 of the 4 bytes of its header"},
    {"CutInText", cutInText, Patient, EErrorKind::Closed,
     "the host closed the connection in the middle of a frame, after 96 of its "},
    {"Garbage", noisy, Patient, EErrorKind::Protocol, "the host announced a frame of "},
    {"GarbageInText", noisyInText, Patient, EErrorKind::Protocol, "the host sent a frame that cannot be read as XML"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, Fault, testing::ValuesIn(faultCases),
                         [](const auto& named) { return std::string(named.param.Name); });

/// The asynchronous client against the same faults: it finds the sound connection by itself.
class FaultAsync : public testing::TestWithParam<VFaultCase>
{
};

TEST_P(FaultAsync, IsLeftBehindByItself)
{
    const VFaultyHost host(GetParam().Faults);
    VAsyncClient client(OptionsFor(host, GetParam().Limit));

    EXPECT_EQ("Host.Information", client.GetCommands().get().front());
}

TEST_P(FaultAsync, IsToldWhereEveryConnectionHasIt)
{
    VFaults faults = GetParam().Faults;
    faults.Connections = 1000000;
    const VFaultyHost host(faults);
    VAsyncOptions options = OptionsFor(host, GetParam().Limit);
    options.TimeLimit = 300ms;
    VAsyncClient client(options);

    const VThrown thrown = ThrownBy([&] { client.GetCommands().get(); });

    EXPECT_EQ(EErrorKind::TimedOut, thrown.Kind);
    EXPECT_THAT(thrown.Text, StartsWith("timed out after 0.3 s, waiting for a connection"));
    EXPECT_FALSE(client.GetStatus().Reason.empty());
}

INSTANTIATE_TEST_SUITE_P(Table, FaultAsync, testing::ValuesIn(faultCases),
                         [](const auto& named) { return std::string(named.param.Name); });

TEST(FaultNeverRead, FillsTheNetworkAndTheSendingTimesOut)
{
    VFaultyHost host(deaf);
    VClient client(WithLimit(200ms));
    client.Connect("127.0.0.1", host.Port(), Patient);
    // More than any network holds.
    const std::string big(32U << 20U, 'x');

    const VThrown thrown = ThrownBy([&] { client.ExecuteCommand("Host.Echo", {{"p", big}}); });

    EXPECT_EQ((VThrown{EErrorKind::TimedOut,
                       "timed out after 0.2 s, sending the request for the reply to the command "
                       "\"Host.Echo\""}),
              thrown);
    EXPECT_FALSE(client.IsConnected()) << "the frame is cut, and nothing could follow it";
    client.SetTimeLimit(Patient);
    client.Connect("127.0.0.1", host.Port(), Patient);
    EXPECT_TRUE(client.ExecuteCommand("Host.Echo", {{"p", "small"}}).Ok);
}

TEST(FaultInABatch, ReachesEveryCallWithoutAReply)
{
    VFaults faults = Faulty();
    faults.CutAfter = 5000;
    VFaultyHost host(faults);
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port(), Patient);
    const std::vector<VCall> calls(200, VCall{"Host.Echo", {{"p", "v"}}});

    const auto outcomes = client.ExecuteBatch(calls);

    EXPECT_TRUE(outcomes.front());
    ASSERT_NE(nullptr, outcomes.back().Error());
    EXPECT_EQ(EErrorKind::Closed, outcomes.back().Error()->Kind());
    client.Connect("127.0.0.1", host.Port(), Patient);
    for (const auto& outcome : client.ExecuteBatch(calls)) {
        EXPECT_TRUE(outcome.Get().Ok);
    }
}

/// A reset would take bytes from the device that are still on their way.
TEST(FaultCut, EndsTheStreamWithoutAReset)
{
    const VFaultyHost host(cutAtOnce);
    VPeer device(host.Port());
    device.SendFrame("<ServerInformation/>");

    EXPECT_EQ("", device.ReadToEnd());

    EXPECT_TRUE(device.SendFrame("late"));
    EXPECT_TRUE(device.SendFrame("later"));
}

TEST(FaultDelay, OnlyDelaysWhereTimeAllows)
{
    VFaults faults;
    faults.Delay = 50ms;
    VFaultyHost host(faults);
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port(), Patient);

    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(1, client.GetServerInformation().Major);

    EXPECT_GE(std::chrono::steady_clock::now() - start, 50ms);
}

TEST(ByteProxy, LetsDevicesWaitUntilItStarts)
{
    FakeHost::VFakeHost host(FakeHost::MakeSimulatedContent(2, {}), 0);
    FakeHost::VByteProxy proxy(0, FakeHost::LoopbackAddress(host.Port()));
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", proxy.Port(), Patient);

    proxy.Start([](unsigned connection) { return FakeHost::MakeFaultFilter({}, connection); });

    EXPECT_EQ(1, client.GetServerInformation().Major);
}

TEST(ByteProxy, EndsAtOnceWhileTheHostTakesNoConnection)
{
    const VFullListener host(INADDR_LOOPBACK);
    std::optional<FakeHost::VByteProxy> proxy(
        std::in_place, 0, FakeHost::LoopbackAddress(host.Port()),
        [](unsigned connection) { return FakeHost::MakeFaultFilter({}, connection); });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", proxy->Port(), Patient);
    while (!IsConnectingTo(host.Port())) {
        std::this_thread::yield();
    }

    const auto start = std::chrono::steady_clock::now();
    proxy.reset();

    EXPECT_LT(std::chrono::steady_clock::now() - start, 3s);
}

TEST(FaultyHost, IsSoundBehindTheChosenConnections)
{
    VFaults faults = Faulty(2);
    faults.CutAfter = 0;
    VFaultyHost host(faults);
    VClient client(WithLimit(Patient));
    for (int i = 0; i < 2; ++i) {
        client.Connect("127.0.0.1", host.Port(), Patient);
        EXPECT_THROW(client.GetCommands(), VError);
    }

    client.Connect("127.0.0.1", host.Port(), Patient);

    EXPECT_FALSE(client.GetCommands().empty());
}

} // namespace
