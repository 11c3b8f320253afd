#include "korva-control/StopSignals.h"

#include "ControlStreamClient/Client.h"

#include <atomic>

namespace {

std::atomic<ControlStream::VClient*> waitingClient{nullptr};
static_assert(std::atomic<ControlStream::VClient*>::is_always_lock_free,
              "a signal handler may not take a lock");

volatile std::sig_atomic_t stopRequested = 0;

extern "C" void RequestStop(int /*signal*/)
{
    stopRequested = 1;
    ControlStream::VClient* const client = waitingClient;
    if (client != nullptr) {
        client->Interrupt();
    }
}

} // namespace

VStopSignals::VStopSignals(ControlStream::VClient& client)
    : previousInterrupt(), previousTerminate()
{
    stopRequested = 0;
    waitingClient = &client;
    struct sigaction action = {};
    action.sa_handler = &RequestStop;
    action.sa_flags = SA_RESTART | static_cast<int>(SA_RESETHAND);
    sigaction(SIGINT, &action, &previousInterrupt);
    sigaction(SIGTERM, &action, &previousTerminate);
}

VStopSignals::~VStopSignals()
{
    sigaction(SIGINT, &previousInterrupt, nullptr);
    sigaction(SIGTERM, &previousTerminate, nullptr);
    waitingClient = nullptr;
}

bool VStopSignals::IsRequested() const
{
    return stopRequested != 0;
}
