#include "Arrivals.h"
#include "TooMuch.h"
#include "WireText.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>
#include <system_error>
#include <thread>
#include <vector>

// The end of a server, whatever its devices, its events and its commands are just doing.

namespace {

using TestSupport::VRawClient;

TEST(Teardown, IsCleanWithDevicesInEveryState)
{
    for (int round = 0; round < 20; ++round) {
        VRunningServer running({"", false, round % 2 != 0}); // in turn with a service of its own
        running.Dispatcher->Commands[L"Echo"] = &TestSupport::VFakeControlSystem::Echo;
        std::vector<VRawClient> devices;
        const std::string frame =
            TestSupport::Frame("<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation>"
                               "</ExecuteCommand>");
        for (std::size_t i = 0; i < 40; ++i) {
            devices.emplace_back(running.Socket->Port());
            devices.back().Send(frame.substr(0, i * frame.size() / 40)); // cut somewhere
        }
        VRawClient notReading(running.Socket->Port());
        std::atomic<bool> stop{false};
        std::thread firing([&] {
            // No more than the buffers of those who do not read can take, or it would stall.
            for (int event = 0; event < 200 && !stop; ++event) {
                running.Fire(L"E");
            }
        });
        VRawClient busy = running.Connect();
        std::thread asking([&] {
            try {
                while (busy.Send(frame) && busy.ReadFrameOrEnd()) {
                }
            } catch (const std::runtime_error&) {
                // Cut off in the middle of a reply.
            }
        });
        notReading.Send(frame);
        stop = true; // an event may still be on its way
        running.Stop();

        firing.join();
        asking.join();
        for (VRawClient& device : devices) {
            device.ReadToEnd();
        }
    }
}

TEST(Teardown, IsCleanWhileDevicesConnect)
{
    for (int round = 0; round < 20; ++round) {
        VRunningServer running;
        const std::uint16_t port = running.Socket->Port();
        std::atomic<int> connected{0};
        std::thread connecting([&] {
            try {
                for (;;) {
                    VRawClient client(port);
                    ++connected;
                    client.SendFrame(Information);
                }
            } catch (const std::system_error&) {
                // Refused: the server has gone.
            }
        });
        EXPECT_TRUE(BecomesTrue([&] { return connected > round; }));

        running.Stop();

        connecting.join();
    }
}

TEST(Teardown, IsCleanWhenAnEventHoldsTheServerLongest)
{
    auto running = std::make_unique<VRunningServer>();
    VRawClient stalled(running->Socket->Port(), SmallBuffer);
    VRunningServer::Fence(stalled);
    const auto dispatcher = running->Dispatcher; // as the host's, it outlives the plug-in
    std::thread firing([&] {
        ControlSystem::IParameters parameters;
        parameters.Set(L"P", std::wstring(TooMuch, L'x'));
        dispatcher->FireEvent(L"Large", parameters);
    });
    EXPECT_TRUE(BecomesTrue([&] { return stalled.IsReadable(); }));

    running.reset(); // returns at once; server and socket go with the event
    stalled.Close();

    firing.join();
}

TEST(Teardown, IsCleanWhenACommandHoldsTheServerLongest)
{
    VLatch entered;
    VLatch proceed;
    auto running = std::make_unique<VRunningServer>();
    running->Dispatcher->Commands[L"Wait"] = [&](const auto& input, const auto& success,
                                                 const auto&) {
        entered.Open();
        proceed.Wait();
        success(input);
    };
    const auto dispatcher = running->Dispatcher;
    VRawClient client(running->Socket->Port());
    client.SendFrame(
        "<ExecuteCommand><Name>Wait</Name><Correlation>1</Correlation></ExecuteCommand>");
    entered.Wait();

    running.reset(); // the message holds the server, and the server its socket
    proceed.Open();

    EXPECT_EQ(DECLARATION "<CommandReply><Name>Wait</Name><Correlation>1</Correlation>"
                          "<Result>OK</Result><Parameters/></CommandReply>",
              client.ReadFrame());
    EXPECT_EQ("", client.ReadToEnd());
}

TEST(Teardown, LetsARestartTakeThePort)
{
    auto running = std::make_unique<VRunningServer>();
    const std::uint16_t port = running->Socket->Port();
    VRawClient client = running->Connect();
    running.reset();
    EXPECT_EQ("", client.ReadToEnd());

    // The closed connection keeps the port for a minute from whoever does not ask to reuse it. The
    // old socket may go an instant later, on its own thread, where a message was just being
    // handled.
    EXPECT_TRUE(
        BecomesTrue([port] { return ControlStreamServer::VSocketASIO(port).Port() == port; }));
}

} // namespace
