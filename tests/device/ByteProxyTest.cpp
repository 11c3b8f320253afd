#include "FakeHost/ByteProxy.h"
#include "FakeHost/FakeHost.h"
#include "FakeHost/Faults.h"
#include "FakeHost/SimulatedContent.h"
#include "support/RawClient.h"
#include "support/Sanitizers.h"

#include <chrono>
#include <ctime>

#include <poll.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <gmock/gmock.h>

namespace {

/// While it is there, the process gets no descriptor beyond those that it has.
class VNoFreeDescriptor
{
public:
    VNoFreeDescriptor()
    {
        getrlimit(RLIMIT_NOFILE, &previous);
        const int lowestFree = dup(STDERR_FILENO);
        close(lowestFree);
        rlimit none = previous;
        none.rlim_cur = static_cast<rlim_t>(lowestFree);
        setrlimit(RLIMIT_NOFILE, &none);
    }

    ~VNoFreeDescriptor() { setrlimit(RLIMIT_NOFILE, &previous); }

    VNoFreeDescriptor(const VNoFreeDescriptor&) = delete;
    VNoFreeDescriptor& operator=(const VNoFreeDescriptor&) = delete;

private:
    rlimit previous{};
};

double SecondsOfWork()
{
    timespec time{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + 1e-9 * static_cast<double>(time.tv_nsec);
}

TEST(ByteProxy, RestsWhileNoDescriptorIsFreeAndTakesTheDeviceLater)
{
    if (TestSupport::isSanitized) {
        GTEST_SKIP() << "a sanitizer opens pipes for its checks, and needs descriptors for them";
    }
    constexpr int waitMilliseconds = 400;
    FakeHost::VFakeHost host(FakeHost::MakeSimulatedContent(1, {}), 0);
    FakeHost::VByteProxy proxy(0, FakeHost::LoopbackAddress(host.Port()), [](unsigned connection) {
        return FakeHost::MakeFaultFilter({}, connection);
    });
    const sockaddr_in address = FakeHost::LoopbackAddress(proxy.Port());
    const int device = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    TestSupport::VRawClient client(device, nullptr);
    {
        const VNoFreeDescriptor none;
        ASSERT_EQ(0, connect(device, reinterpret_cast<const sockaddr*>(&address), sizeof address));
        const double before = SecondsOfWork();
        pollfd nothing{device, POLLIN, 0};
        EXPECT_EQ(0, poll(&nothing, 1, waitMilliseconds));
        EXPECT_LT(SecondsOfWork() - before, 0.5 * waitMilliseconds / 1000);
    }

    client.SendFrame("<ServerInformation/>");

    EXPECT_THAT(client.ReadFrame(), testing::HasSubstr("StreamVersion"));
}

} // namespace
