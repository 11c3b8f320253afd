#include "Arrivals.h"
#include "HeapCount.h"
#include "RunningServer.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

namespace {

using namespace std::string_literals;
using TestSupport::VRawClient;

constexpr std::size_t KiB = 1024;

const char* const EchoRequest =
    "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?><ExecuteCommand><Name>Host.Echo"
    "</Name><Correlation>1234</Correlation><Parameters><Parameter><Name>First</Name><Value>one"
    "</Value></Parameter><Parameter><Name>Second</Name><Value>two</Value></Parameter></Parameters>"
    "</ExecuteCommand>";

// The dispatcher of the test remembers every command: where bytes are counted, none is run.
const char* const Information = "<ServerInformation/>";

class Memory : public testing::Test
{
protected:
    Memory()
    {
        running->Dispatcher->Commands[L"Host.Echo"] = &TestSupport::VFakeControlSystem::Echo;
        // What the first connection alone needs is there from here on.
        first.Request(EchoRequest);
        VRunningServer::Fence(first);
    }

    /// Waits for the end of the server, so that no later test meets what it still holds: a message
    /// whose reply has come may keep it for a moment.
    ~Memory() override
    {
        first.Close();
        running.reset();
        EXPECT_TRUE(BecomesTrue([this] { return LiveHeapBytes() < atStart + 8 * KiB; }));
    }

    /// Returns by how much the heap has grown since `before`, for each of the clients.
    static std::size_t GrowthOfEach(std::size_t before, std::size_t count)
    {
        const std::size_t now = LiveHeapBytes();
        return now > before ? (now - before) / count : 0;
    }

    const std::size_t atStart = LiveHeapBytes();
    std::unique_ptr<VRunningServer> running = std::make_unique<VRunningServer>();
    VRawClient first{running->Socket->Port()};
};

TEST_F(Memory, OfAnIdleConnectionIsUnderEightKiB)
{
    constexpr std::size_t count = 200;
    std::vector<VRawClient> devices;
    devices.reserve(count);
    const std::size_t before = LiveHeapBytes();

    for (std::size_t i = 0; i < count; ++i) {
        devices.emplace_back(running->Socket->Port());
        devices.back().Request(Information);
    }
    VRunningServer::Fence(first);

    const std::size_t each = GrowthOfEach(before, count);
    RecordProperty("BytesOfEach", static_cast<int>(each));
    std::printf("an idle connection takes %zu bytes of heap\n", each);
    EXPECT_LT(each, 8 * KiB);
    EXPECT_GT(each, 0U);
}

TEST_F(Memory, OfConnectionsThatAreGoneIsGivenBack)
{
    const std::size_t before = LiveHeapBytes();

    for (std::size_t i = 0; i < 200; ++i) {
        VRawClient device(running->Socket->Port());
        device.Request(Information);
    }
    running->Fire(L"E");
    first.ReadFrame();

    // The last few may still be on their way out, and the list of clients keeps its room.
    EXPECT_TRUE(BecomesTrue([&] { return GrowthOfEach(before, 1) < 16 * KiB; }));
}

TEST_F(Memory, OfAClaimOfFourGigabytesIsAtMost64KiB)
{
    constexpr std::size_t count = 64;
    std::vector<VRawClient> devices;
    devices.reserve(count);
    const std::size_t before = LiveHeapBytes();

    for (std::size_t i = 0; i < count; ++i) {
        devices.emplace_back(running->Socket->Port());
        devices.back().Send("\xFF\xFF\xFF\xFF"s);
    }
    // Each claim has been taken.
    EXPECT_TRUE(BecomesTrue([&] { return LiveHeapBytes() - before >= count * 64 * KiB; }));
    VRunningServer::Fence(first);

    EXPECT_LT(GrowthOfEach(before, count), (64 + 8) * KiB);
}

TEST_F(Memory, OfAClaimAfterALargeMessageIsThatOfTheMessage)
{
    VRawClient device = running->Connect();
    device.SendFrame(std::string(60000, ' '));
    VRunningServer::Fence(first); // nothing small on the device's own connection in between
    const std::size_t before = LiveHeapBytes();

    device.Send("\xFF\xFF\xFF\xFF"s);
    VRunningServer::Fence(first);

    EXPECT_LT(GrowthOfEach(before, 1), 16 * KiB); // 60,000 bytes became 64 KiB
}

TEST_F(Memory, GrowsWithWhatHasComeOfAClaim)
{
    constexpr std::size_t sent = 1000 * KiB;
    VRawClient device = running->Connect();
    const std::size_t before = LiveHeapBytes();

    device.Send("\xFF\xFF\xFF\xFF"s);
    device.Send(std::string(sent, 'x'));
    EXPECT_TRUE(BecomesTrue([&] { return LiveHeapBytes() - before >= sent; }));
    VRunningServer::Fence(first);

    EXPECT_LT(GrowthOfEach(before, 1), 2 * sent + 8 * KiB);
}

TEST_F(Memory, IsNotAllocatedAnewForFramesOfOneSize)
{
    const std::string text(50000, ' ');
    first.SendFrame(text);
    VRunningServer::Fence(first);
    const std::size_t before = LiveHeapBytes();

    for (int i = 0; i < 50; ++i) {
        first.SendFrame(text);
    }
    VRunningServer::Fence(first);

    EXPECT_LT(GrowthOfEach(before, 1), 4 * KiB);
}

TEST_F(Memory, AllocationsForARequestAreFew)
{
    // From one execution to the next: the reply, reading, parsing and the dispatcher of the test.
    VArrivals<std::size_t> counts;
    running->Dispatcher->Commands[L"Host.Echo"] = [&](const auto& input, const auto& success,
                                                      const auto& failure) {
        counts.Add(AllocationsOfThisThread());
        TestSupport::VFakeControlSystem::Echo(input, success, failure);
    };
    constexpr std::size_t rounds = 50;

    for (std::size_t i = 0; i < rounds; ++i) {
        first.Request(EchoRequest);
    }

    const std::vector<std::size_t> seen = counts.Wait(rounds);
    std::vector<std::size_t> each;
    for (std::size_t i = 1; i < rounds; ++i) {
        each.push_back(seen[i] - seen[i - 1]);
    }
    std::sort(each.begin(), each.end());
    const std::size_t middle = each[each.size() / 2];
    RecordProperty("AllocationsOfARequest", static_cast<int>(middle));
    std::printf("a request of two parameters takes %zu allocations\n", middle);
    EXPECT_LE(middle, 60U);
    EXPECT_GT(middle, 0U);
}

} // namespace
