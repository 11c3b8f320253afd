#pragma once

#include "QuorixPluginControlStreamServer/Authorization/IControlAuthorization.h"
#include "notification/MultiCallback.h"

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

namespace FakeHost {

/// What a fake host's operator does with a device that asks to be let in.
enum class EDecision {
    Allow,     ///< every device is known and welcome
    Deny,      ///< every device is banned
    AskAllow,  ///< is asked, and allows after a while
    AskDeny,   ///< is asked, and denies after a while
    AskNobody, ///< is asked, and never answers
};

struct VOperatorOptions
{
    EDecision Decision = EDecision::Allow;
    std::chrono::milliseconds Thinking{1000}; ///< how long, where the operator is asked
};

/// An authorization without lists, dialogs and memory: the same decision for every device.
///
/// Owns: the thread on which the operator thinks. Threads: every operation [any]. An answer holds
/// it for the length of its event, so whoever lets go of it ends the thinking before: it must not
/// be destroyed by its own thread.
class VFakeOperator : public IControlAuthorization
{
public:
    explicit VFakeOperator(const VOperatorOptions& operatorOptions);

    /// Tells that the host goes away.
    ~VFakeOperator() override;

    /// Ends the thread, after the answer that it may be giving. [whoever made it]
    void EndThinking();

    EAuthorizeAnswer Authorize(const std::string& deviceId, const std::string& deviceName) override;
    void CancelAuthorize(const std::string& deviceId) override;
    void Heartbeat() override {}
    KVR::IMultiCallback<void(bool)>& GetAuthorizedCallback() override { return authorized; }
    KVR::IMultiCallback<void()>& GetDisconnectedCallback() override { return disconnected; }
    std::string GetServerName() override { return "Fake host"; }
    std::string GetCurrentDeviceId() override;
    bool IsRequestPending() override;

private:
    void Think();
    void Decide(std::unique_lock<std::mutex>& lock);

    const VOperatorOptions options;
    NotificationSystem::VMultiCallback<void(bool)> authorized;
    NotificationSystem::VMultiCallback<void()> disconnected;

    std::mutex mutex; // guards all below
    std::condition_variable changed;
    std::string currentDevice;
    std::string askingDevice;
    bool pending = false;
    bool ending = false;
    std::chrono::steady_clock::time_point decided; // the moment of the decision, while one is due
    std::thread thread;
};

} // namespace FakeHost
