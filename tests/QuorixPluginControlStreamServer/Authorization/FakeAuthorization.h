#pragma once

#include "QuorixPluginControlStreamServer/Authorization/IControlAuthorization.h"
#include "notification/MultiCallback.h"

#include <string>
#include <utility>
#include <vector>

namespace AuthorizationBench {

/// An authorization that decides as a test says and notes what it is asked. Threads: one.
class VFakeAuthorization : public IControlAuthorization
{
public:
    EAuthorizeAnswer Answer = EAuthorizeAnswer::Pending;
    bool Pending = false;
    std::string CurrentDeviceId;
    NotificationSystem::VMultiCallback<void(bool)> Authorized;
    NotificationSystem::VMultiCallback<void()> Disconnected;

    std::vector<std::pair<std::string, std::string>> Asked;
    std::vector<std::string> Cancelled;
    int Beats = 0;

    EAuthorizeAnswer Authorize(const std::string& deviceId, const std::string& deviceName) override
    {
        Asked.emplace_back(deviceId, deviceName);
        return Answer;
    }
    void CancelAuthorize(const std::string& deviceId) override { Cancelled.push_back(deviceId); }
    void Heartbeat() override { ++Beats; }
    KVR::IMultiCallback<void(bool)>& GetAuthorizedCallback() override { return Authorized; }
    KVR::IMultiCallback<void()>& GetDisconnectedCallback() override { return Disconnected; }
    std::string GetServerName() override { return "Server \xC3\xA9"; }
    std::string GetCurrentDeviceId() override { return CurrentDeviceId; }
    bool IsRequestPending() override { return Pending; }
};

} // namespace AuthorizationBench
