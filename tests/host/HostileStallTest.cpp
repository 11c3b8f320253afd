#include "EchoText.h"
#include "RunningHost.h"

#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <utility>

// A device that does not read holds up an event, and with it whoever connects; and no longer.

using TestSupport::Connect;
using TestSupport::Echo;
using TestSupport::EchoReply;
using TestSupport::Event;
using TestSupport::serverInformation;
using TestSupport::VRawClient;
using TestSupport::VRunningHost;

namespace {

/// A device that reads all the time and keeps what is not the great event of the stall tests.
class VListeningDevice
{
public:
    VListeningDevice() : device(Connect()), thread([this] { Listen(); }) {}
    ~VListeningDevice()
    {
        device.ShutdownWrite(); // the host then ends the connection
        thread.join();
    }
    VListeningDevice(const VListeningDevice&) = delete;
    VListeningDevice& operator=(const VListeningDevice&) = delete;

    void Send(const std::string& text) { device.SendFrame(text); }

    /// @return the next text of those kept, empty when none comes
    std::string Next()
    {
        const auto deadline = std::chrono::steady_clock::now() + TestSupport::hostLimit;
        std::unique_lock<std::mutex> lock(mutex);
        if (!arrived.wait_until(lock, deadline, [this] { return !texts.empty(); })) {
            return std::string();
        }
        std::string text = std::move(texts.front());
        texts.pop_front();
        return text;
    }

private:
    void Listen()
    {
        constexpr std::size_t greatText = 100000;
        while (const auto text = WaitForFrame()) {
            if (text->size() < greatText) {
                const std::lock_guard<std::mutex> lock(mutex);
                texts.push_back(*text);
                arrived.notify_all();
            }
        }
    }

    std::optional<std::string> WaitForFrame()
    {
        while (!device.AwaitReadable()) {
            // A stall may last longer than a device waits for a frame.
        }
        return device.ReadFrameOrEnd();
    }

    VRawClient device;
    std::mutex mutex;
    std::condition_variable arrived;
    std::deque<std::string> texts; // guarded by the mutex
    std::thread thread;
};

/// How a device that did not read ends the stall that it caused.
struct VStallEnd
{
    const char* name;
    void (*end)(VRawClient& device);
};

const VStallEnd stallEnds[] = {
    {"Reads", [](VRawClient& device) { device.ReadFrame(); }},
    {"Closes", [](VRawClient& device) { device.Close(); }},
    {"IsKilled", [](VRawClient& device) { device.Reset(); }},
};

class HostileStall : public testing::TestWithParam<VStallEnd>
{
};

} // namespace

TEST_P(HostileStall, LastsUntilTheDeviceThatNeverRead)
{
    constexpr int receiveBuffer = 65536;
    constexpr std::chrono::milliseconds nothingComes{500};
    VRunningHost host;
    VRawClient deaf = Connect(receiveBuffer);
    EXPECT_EQ(serverInformation, deaf.Request("<ServerInformation/>"));
    VListeningDevice listening;
    listening.Send("<ServerInformation/>");
    EXPECT_EQ(serverInformation, listening.Next());

    // The stall: the event is not over, and whoever connects now waits with it.
    ASSERT_TRUE(TestSupport::StallWithEvent(host, deaf));
    listening.Send(Echo("1", "still served"));
    EXPECT_EQ(EchoReply("1", "still served"), listening.Next());
    VRawClient newcomer = Connect();
    newcomer.SendFrame("<ServerInformation/>");
    EXPECT_EQ(std::nullopt, host.ReadLine(nothingComes));
    EXPECT_FALSE(newcomer.IsReadable());

    // Its end, after which everything goes on.
    GetParam().end(deaf);
    EXPECT_EQ("ok", host.ReadLine());
    EXPECT_EQ(serverInformation, newcomer.ReadFrame());
    EXPECT_EQ("ok", host.Command("fire Event.X"));
    EXPECT_EQ(Event("Event.X"), listening.Next());
    EXPECT_EQ(Event("Event.X"), newcomer.ReadFrame());
    if (deaf.Descriptor() >= 0) {
        EXPECT_EQ(Event("Event.X"), deaf.ReadFrame());
    }
    TestSupport::ExpectAnswersTheNextGoodFrame();
    TestSupport::ExpectOrderlyEnd(host);
}

INSTANTIATE_TEST_SUITE_P(Ends, HostileStall, testing::ValuesIn(stallEnds),
                         [](const testing::TestParamInfo<VStallEnd>& test) {
                             return std::string(test.param.name);
                         });
