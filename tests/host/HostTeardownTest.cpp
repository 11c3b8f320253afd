#include "RunningHost.h"

#include <gtest/gtest.h>

#include <csignal>
#include <cstdlib>
#include <memory>
#include <string>
#include <tuple>
#include <vector>

// The host's stop while devices are in the middle of everything: it ends, with code 0 and no
// sanitizer's report, and the next host has the port at once.

using TestSupport::Connect;
using TestSupport::ConnectMany;
using TestSupport::Frame;
using TestSupport::serverInformation;
using TestSupport::VRawClient;
using TestSupport::VRunningHost;

namespace {

constexpr std::size_t manyDevices = 200;

/// A hundred rounds in a long run, ten otherwise.
int Rounds()
{
    return std::getenv("QUORIX_SOAK") != nullptr ? 100 : 10;
}

using VDevices = std::vector<std::unique_ptr<VRawClient>>;

struct VScene
{
    const char* name;
    /// Brings the devices to where the stop meets them.
    void (*set)(VRunningHost& host, VDevices& devices);
};

const std::string request = "<ExecuteCommand><Name>Host.Echo</Name><Correlation>1</Correlation>"
                            "</ExecuteCommand>";

/// Devices at every byte of a frame, and some with requests that are being answered.
void SetDevicesWithinFrames(VRunningHost& /*host*/, VDevices& devices)
{
    const std::string frame = Frame(request);
    devices = ConnectMany(manyDevices);
    for (std::size_t i = 0; i < devices.size(); ++i) {
        devices[i]->Send(frame.substr(0, i % frame.size()));
    }
    for (std::size_t i = 0; i < devices.size(); i += 10) {
        const std::string rest = frame.substr(i % frame.size());
        devices[i]->Send(rest + Frame(request) + Frame(request) + frame.substr(0, 7));
    }
}

/// A device that does not read what it is owed, which the buffers hold.
void SetADeviceThatDoesNotRead(VRunningHost& host, VDevices& devices)
{
    devices = ConnectMany(2);
    devices[1]->Request("<ServerInformation/>");
    for (int i = 0; i < 20; ++i) {
        devices[0]->SendFrame(request);
        EXPECT_EQ("ok", host.Command("fire Event.X Text=" + std::string(500, 'x')));
    }
}

/// Events on their way to many devices.
void SetEventsInFlight(VRunningHost& host, VDevices& devices)
{
    devices = ConnectMany(manyDevices);
    devices.back()->Request("<ServerInformation/>");
    for (int i = 0; i < 3; ++i) {
        host.SendLine("fire Event.X Text=" + std::string(500, 'x'));
    }
}

const VScene scenes[] = {
    {"DevicesWithinFrames", &SetDevicesWithinFrames},
    {"ADeviceThatDoesNotRead", &SetADeviceThatDoesNotRead},
    {"EventsInFlight", &SetEventsInFlight},
};

/// How the host is asked to stop.
struct VAsking
{
    const char* name;
    void (*ask)(VRunningHost& host);
};

const VAsking askings[] = {
    {"Quit", [](VRunningHost& host) { host.SendLine("quit"); }},
    {"Terminate", [](VRunningHost& host) { host.Signal(SIGTERM); }},
};

class HostTeardown : public testing::TestWithParam<std::tuple<VScene, VAsking>>
{
};

} // namespace

TEST_P(HostTeardown, EndsInOrderAndTheNextHostHasThePortAtOnce)
{
    TestSupport::RaiseDescriptorLimit();
    const auto& [scene, asking] = GetParam();

    for (int round = 0; round < Rounds(); ++round) {
        VRunningHost host;
        EXPECT_EQ(serverInformation, Connect().Request("<ServerInformation/>"));
        VDevices devices;
        scene.set(host, devices);

        asking.ask(host);

        ASSERT_EQ(0, host.WaitExit().value_or(-1)) << "round " << round << "\n" << host.Errors();
        for (const auto& device : devices) {
            device->ReadToEnd(); // throws where it does not come
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Scenes, HostTeardown,
                         testing::Combine(testing::ValuesIn(scenes), testing::ValuesIn(askings)),
                         [](const auto& test) {
                             return std::string(std::get<0>(test.param).name) +
                                    std::get<1>(test.param).name;
                         });
