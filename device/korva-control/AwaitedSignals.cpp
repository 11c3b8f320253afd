#include "korva-control/AwaitedSignals.h"

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
    timespec time{};
    time.tv_sec = static_cast<std::time_t>(limit->count() / 1000);
    time.tv_nsec = static_cast<long>(limit->count() % 1000) * 1000000;
    sigtimedwait(&signals, nullptr, &time);
}
