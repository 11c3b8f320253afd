#include "FakeHost/FakeOperator.h"

namespace FakeHost {

VFakeOperator::VFakeOperator(const VOperatorOptions& operatorOptions)
    : options(operatorOptions), thread([this] { Think(); })
{
}

VFakeOperator::~VFakeOperator()
{
    EndThinking();
    disconnected();
}

void VFakeOperator::EndThinking()
{
    {
        const std::lock_guard<std::mutex> lock(mutex);
        ending = true;
    }
    changed.notify_all();
    if (thread.joinable()) {
        thread.join();
    }
}

EAuthorizeAnswer VFakeOperator::Authorize(const std::string& deviceId,
                                          const std::string& /*deviceName*/)
{
    const std::lock_guard<std::mutex> lock(mutex);
    switch (options.Decision) {
    case EDecision::Allow:
        currentDevice = deviceId;
        return EAuthorizeAnswer::Allowed;
    case EDecision::Deny:
        return EAuthorizeAnswer::Refused;
    case EDecision::AskAllow:
    case EDecision::AskDeny:
    case EDecision::AskNobody:
        break;
    }
    pending = true;
    askingDevice = deviceId;
    decided = std::chrono::steady_clock::now() + options.Thinking;
    changed.notify_all();
    return EAuthorizeAnswer::Pending;
}

void VFakeOperator::CancelAuthorize(const std::string& /*deviceId*/)
{
    const std::lock_guard<std::mutex> lock(mutex);
    pending = false;
}

std::string VFakeOperator::GetCurrentDeviceId()
{
    const std::lock_guard<std::mutex> lock(mutex);
    return currentDevice;
}

bool VFakeOperator::IsRequestPending()
{
    const std::lock_guard<std::mutex> lock(mutex);
    return pending;
}

void VFakeOperator::Think()
{
    std::unique_lock<std::mutex> lock(mutex);
    while (!ending) {
        if (!pending || options.Decision == EDecision::AskNobody) {
            changed.wait(lock);
        } else if (std::chrono::steady_clock::now() < decided) {
            changed.wait_until(lock, decided);
        } else {
            Decide(lock);
        }
    }
}

/// Listeners are called with no lock held.
void VFakeOperator::Decide(std::unique_lock<std::mutex>& lock)
{
    const bool allowed = options.Decision == EDecision::AskAllow;
    pending = false;
    if (allowed) {
        currentDevice = askingDevice;
    }
    lock.unlock();
    authorized(allowed);
    lock.lock();
}

} // namespace FakeHost
