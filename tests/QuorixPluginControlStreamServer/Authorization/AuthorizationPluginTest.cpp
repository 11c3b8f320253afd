#include "../PluginBench.h"
#include "ControlSystem.h"
#include "DebugServices/Clock.h"
#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataWriter.h"
#include "io/Values.h"
#include "notification/GuardedCall.h"
#include "notification/IPostalService.h"
#include "notification/Support.h"

#include <gmock/gmock.h>
#include <poll.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

// The end of the plug-in, with devices that ask, beat and listen: each hears of it.

using PluginBench::disconnect;
using PluginBench::port;
using TestSupport::VRawClient;

namespace {

const std::string beat = TestSupport::Frame("<ExecuteCommand><Name>System.Heartbeat</Name>"
                                            "<Correlation>1</Correlation></ExecuteCommand>");

std::string AuthorizeFrame(const std::string& id)
{
    return TestSupport::Frame("<ExecuteCommand><Name>System.Authorize</Name>"
                              "<Correlation>1</Correlation><Parameters><Parameter>"
                              "<Name>DeviceId</Name><Value>" +
                              id + "</Value></Parameter></Parameters></ExecuteCommand>");
}

/// Reads to the end, where answers to commands may come behind the event.
bool HearsOfTheEnd(VRawClient& device)
{
    return device.ReadToEnd().find(disconnect) != std::string::npos;
}

/// Delivers when it is told to, as a host's event loop does on the thread that also stops it.
class VHostQueue : public KVR::IPostalService
{
public:
    void Post(boost::function<void()> function, std::uintptr_t /*token*/) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        waiting.push_back(std::move(function));
    }

    void Deliver()
    {
        std::deque<boost::function<void()>> delivered;
        {
            const std::lock_guard<std::mutex> lock(mutex);
            delivered.swap(waiting);
        }
        for (const auto& function : delivered) {
            KVR::GuardedCall(function);
        }
    }

private:
    std::mutex mutex; // guards the queue
    std::deque<boost::function<void()>> waiting;
};

/// A thread that does something again and again until it goes.
class VAgain
{
public:
    explicit VAgain(std::function<void()> action)
        : thread([this, action = std::move(action)] {
              while (!ended) {
                  action();
              }
          })
    {
    }
    ~VAgain()
    {
        ended = true;
        thread.join();
    }

private:
    std::atomic<bool> ended{false};
    std::thread thread;
};

class AuthorizationPlugin : public testing::Test
{
protected:
    AuthorizationPlugin() { StartHost(); }

    void StartHost()
    {
        controlSystem = std::make_shared<QuorixHost::VControlSystem>();
        host = std::make_unique<PluginBench::VFakeHost>(controlSystem);
        host->Store = store;
        host->PostalService = postal;
        plugin = library.Create();
        plugin->Start(*host);
    }

    /// As the host stops: the providers first, then the plug-in.
    void StopHost()
    {
        plugin->Stop();
        library.Destroy(plugin);
        EXPECT_FALSE(PluginBench::CanConnect()); // the next one is to have the port
    }

    /// A device that the server has on its list.
    static std::unique_ptr<VRawClient> Connect()
    {
        auto device = std::make_unique<VRawClient>(port);
        device->Request("<ServerInformation/>");
        return device;
    }

    /// Delivers until something has come for a device.
    void DeliverUntilReadable(const VRawClient& device)
    {
        const auto deadline = std::chrono::steady_clock::now() + VRawClient::Limit;
        while (!device.IsReadable() && std::chrono::steady_clock::now() < deadline) {
            postal->Deliver();
        }
    }

    std::string Text(const char* path)
    {
        return ReadString(VDataReader(*store).GetValue(VDataToken(VDataPath(path))));
    }

    PluginBench::VLibrary library;
    const std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    const std::shared_ptr<VHostQueue> postal = std::make_shared<VHostQueue>();
    std::shared_ptr<QuorixHost::VControlSystem> controlSystem;
    std::unique_ptr<PluginBench::VFakeHost> host;
    QuorixPluginInterface::IPlugin* plugin = nullptr;
};

constexpr int rounds = 100;

} // namespace

TEST_F(AuthorizationPlugin, EveryDeviceHearsOfTheEndBeforeItsConnectionCloses)
{
    for (int round = 0; round < rounds; ++round) {
        std::vector<std::unique_ptr<VRawClient>> devices;
        for (int i = 0; i < 5; ++i) {
            devices.push_back(Connect());
        }

        StopHost();

        for (const auto& device : devices) {
            ASSERT_EQ(disconnect, device->ReadToEnd()) << round;
        }
        StartHost();
    }
    StopHost();
}

TEST_F(AuthorizationPlugin, EveryDeviceHearsOfTheEndAlsoWithCommandsOnTheirWay)
{
    const std::string authorize = AuthorizeFrame("0");
    for (int round = 0; round < rounds; ++round) {
        const auto listening = Connect();
        const auto beating = Connect();
        const auto asking = Connect();
        asking->Send(authorize);
        DeliverUntilReadable(*listening); // it holds the connection now, and may ask again
        {
            const VAgain beats([&] { beating->Send(beat); });
            const VAgain requests([&] { asking->Send(authorize); });
            std::thread beatReader([&] { EXPECT_TRUE(HearsOfTheEnd(*beating)); });
            std::thread askReader([&] { EXPECT_TRUE(HearsOfTheEnd(*asking)); });
            postal->Deliver();

            StopHost();

            EXPECT_TRUE(HearsOfTheEnd(*listening)) << round;
            beatReader.join();
            askReader.join();
        }
        StartHost();
    }
    StopHost();
}

TEST_F(AuthorizationPlugin, EveryDeviceHearsOfTheEndAlsoWithACheckOnItsWay)
{
    constexpr int stale = 3500; // milliseconds, so that the check has something to write
    const auto device = Connect();
    device->Send(AuthorizeFrame("0"));
    device->ReadFrame(); // pending, so the step waits by now
    postal->Deliver();
    device->ReadFrame(); // authorized
    NotificationTest::VLatch checking, ending;
    VDataListeners& listeners = VDataWriter(*store).GetListeners(VDataPath("Control.0.Connected"));
    const std::uint64_t id = listeners.OnVerifiedChanged.Add([&] {
        checking.CountDown();
        ending.Wait();
        // For as long as it takes to end without it, which would close the connection.
        pollfd closed{device->Descriptor(), POLLIN, 0};
        poll(&closed, 1, 200);
    });
    DebugServices::AdvanceClock(stale);
    EXPECT_TRUE(checking.Wait());

    ending.CountDown();
    StopHost();

    EXPECT_EQ(disconnect, device->ReadToEnd());
    listeners.OnVerifiedChanged.Remove(id);
    DebugServices::AdvanceClock(-stale);
}

TEST_F(AuthorizationPlugin, TheListsAreReadAtStartAndWrittenAtTheEnd)
{
    StopHost();
    const VDataToken allowed(VDataPath("Preferences.User.AllowedControls"));
    VDataWriter(*store).SetValue(allowed, MakeStringValue("b;Beta\nnonsense\na;Alpha"));
    StartHost();
    const auto device = Connect();

    device->Send(AuthorizeFrame("b"));
    EXPECT_THAT(device->ReadFrame(), testing::HasSubstr("<Value>Authorized</Value>"));
    device->Send(AuthorizeFrame("c"));
    EXPECT_THAT(device->ReadFrame(), testing::HasSubstr("<Value>Connected</Value>"));
    StopHost();

    EXPECT_EQ("a;Alpha\nb;Beta", Text("Preferences.User.AllowedControls"));
    EXPECT_EQ("", Text("Preferences.User.BannedControls"));
}
