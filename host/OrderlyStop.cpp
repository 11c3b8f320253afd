#include "OrderlyStop.h"

#include "DebugServices/CrashHandlerForThread.h"
#include "DebugServices/ThreadName.h"
#include "utils/LogStatement.h"

#include <atomic>
#include <cerrno>
#include <csignal>
#include <poll.h>
#include <sys/eventfd.h>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace QuorixHost {
namespace {

// What the signal handler may touch: it can be told nothing but through static objects.
std::atomic<int> signalDescriptor{-1};
std::atomic<int> signalCount{0};
static_assert(std::atomic<int>::is_always_lock_free, "a signal handler may not take a lock");

void OnSignal(int /*signal*/)
{
    if (signalCount.fetch_add(1) > 0) {
        _exit(VOrderlyStop::forcedExitCode);
    }
    const int savedError = errno;
    const std::uint64_t one = 1;
    // A full counter is readable already.
    static_cast<void>(!write(signalDescriptor.load(), &one, sizeof one));
    errno = savedError;
}

sigset_t StopSignals()
{
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGINT);
    sigaddset(&signals, SIGTERM);
    return signals;
}

int MakeEvent()
{
    const int descriptor = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (descriptor < 0) {
        throw std::system_error(errno, std::system_category(), "eventfd");
    }
    return descriptor;
}

/// Waits until one of two descriptors is readable; the second may be -1.
///
/// @param milliseconds  -1 waits without limit
/// @return false when the time is over
bool WaitReadable(int first, int second, int milliseconds)
{
    const auto deadline =
        std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
    pollfd descriptors[] = {{first, POLLIN, 0}, {second, POLLIN, 0}};
    for (int left = milliseconds;;) {
        const int ready = poll(descriptors, 2, left);
        if (ready >= 0) {
            return ready > 0;
        }
        if (milliseconds >= 0) { // interrupted by a signal
            const auto rest = std::chrono::duration_cast<std::chrono::milliseconds>(
                deadline - std::chrono::steady_clock::now());
            left = rest.count() > 0 ? static_cast<int>(rest.count()) : 0;
        }
    }
}

} // namespace

VOrderlyStop::VOrderlyStop(boost::function<void()> requestStop,
                           boost::function<std::string()> describeHolds,
                           std::chrono::milliseconds patience)
    : requestStop(std::move(requestStop)),
      describeHolds(std::move(describeHolds)),
      patience(patience),
      requested(MakeEvent()),
      done(MakeEvent())
{
    signalDescriptor.store(requested);
    signalCount.store(0);

    // Every thread inherits this, so that only the thread below is ever interrupted.
    const sigset_t signals = StopSignals();
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);

    struct sigaction action = {};
    action.sa_handler = &OnSignal;
    action.sa_flags = SA_RESTART;
    sigaction(SIGINT, &action, nullptr);
    sigaction(SIGTERM, &action, nullptr);

    thread = std::thread([this] { Run(); });
}

VOrderlyStop::~VOrderlyStop()
{
    eventfd_write(done, 1);
    thread.join();
    close(done);
    close(requested);
}

void VOrderlyStop::Request()
{
    eventfd_write(requested, 1);
}

void VOrderlyStop::Run()
{
    const DebugServices::VCrashHandlerForThread crashHandler;
    DebugServices::SetThreadName("Orderly Stop");
    const sigset_t signals = StopSignals();
    pthread_sigmask(SIG_UNBLOCK, &signals, nullptr);

    WaitReadable(requested, done, -1);
    if (!WaitReadable(done, -1, 0)) {
        WatchStop();
    }
    // The descriptors are closed after this thread: it may not be interrupted any more by then.
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
}

void VOrderlyStop::WatchStop()
{
    KVR_LOG("Host", 4, "Stopping");
    requestStop();
    if (WaitReadable(done, -1, static_cast<int>(patience.count()))) {
        return;
    }
    // From here on one signal is enough, also where the first wish came without one.
    int none = 0;
    static_cast<void>(signalCount.compare_exchange_strong(none, 1));
    KVR_LOG("Host", 3, "The stop is held up. %1% A second signal ends the process at once.",
            describeHolds());
    WaitReadable(done, -1, -1);
}

} // namespace QuorixHost
