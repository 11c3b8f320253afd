#include "korva-control/AwaitedSignals.h"

#include <algorithm>
#include <cerrno>
#include <ctime>

VAwaitedSignals::VAwaitedSignals()
{
    sigemptyset(&signals);
    sigaddset(&signals, SIGINT);
    sigaddset(&signals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &signals, &previous);
}

VAwaitedSignals::~VAwaitedSignals()
{
    pthread_sigmask(SIG_SETMASK, &previous, nullptr);
}

void VAwaitedSignals::Await(std::optional<std::chrono::milliseconds> limit) const
{
    if (!limit) {
        int number = 0;
        sigwait(&signals, &number);
        return;
    }
    const auto end = std::chrono::steady_clock::now() + *limit;
    int number = 0;
    do {
        const auto left = std::max(
            std::chrono::ceil<std::chrono::milliseconds>(end - std::chrono::steady_clock::now()),
            std::chrono::milliseconds::zero());
        timespec time{};
        time.tv_sec = static_cast<std::time_t>(left.count() / 1000);
        time.tv_nsec = static_cast<long>(left.count() % 1000) * 1000000;
        number = sigtimedwait(&signals, nullptr, &time);
    } while (number < 0 && errno == EINTR); // a program that was suspended goes on waiting
}
