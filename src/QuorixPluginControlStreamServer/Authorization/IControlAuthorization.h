#pragma once

#include "notification/IMultiCallback.h"

#include <cstdint>
#include <string>

/// The answer to a device that asks to be let in.
enum class EAuthorizeAnswer : std::int32_t {
    Allowed = 0, ///< the device may act now
    Refused = 1, ///< the device is banned
    Pending = 2, ///< the outcome comes by the authorized notification
};

/// Decides which remote control device may act, as the providers of commands and events see it.
///
/// Ids and names are UTF-8. Threads: every operation [any].
class IControlAuthorization
{
public:
    IControlAuthorization() = default;
    IControlAuthorization(const IControlAuthorization&) = delete;
    IControlAuthorization& operator=(const IControlAuthorization&) = delete;

    /// Asks for a device to be let in; never waits for the operator.
    virtual EAuthorizeAnswer Authorize(const std::string& deviceId,
                                       const std::string& deviceName) = 0;

    /// Withdraws the request that the operator is being asked about, whichever device's it is.
    virtual void CancelAuthorize(const std::string& deviceId) = 0;

    /// Notes that the device which holds the connection is alive.
    virtual void Heartbeat() = 0;

    /// Fires with the outcome of each request that was pending, unless it was cancelled.
    virtual KVR::IMultiCallback<void(bool)>& GetAuthorizedCallback() = 0;

    /// Fires once, when the authorization goes away, on the thread that lets go of it last.
    virtual KVR::IMultiCallback<void()>& GetDisconnectedCallback() = 0;

    /// Returns the name under which people know this host.
    virtual std::string GetServerName() = 0;

    /// Returns the device that holds the connection or held it last, empty before the first.
    virtual std::string GetCurrentDeviceId() = 0;

    /// Returns whether a request waits for its outcome.
    virtual bool IsRequestPending() = 0;

    virtual ~IControlAuthorization() = default;
};
