#pragma once

#include <cstdint>
#include <string>

/// What the operator made of a request.
enum class EAskOutcome : std::int32_t {
    Cancelled = 0,
    AllowedOnce = 1,
    DeniedOnce = 2,
    AllowedAndRemembered = 3,
    DeniedAndRemembered = 4,
};

/// Puts a device's request before the operator.
///
/// Ids and names are UTF-8; the name is plain text, whatever characters it holds.
class IQuorixControlAuthorizationGUI
{
public:
    /// Asks the operator and waits for the answer, without limit. [gui]
    ///
    /// @return any other number counts as cancelled
    virtual EAskOutcome Ask(const std::string& deviceId, const std::string& deviceName) = 0;

    /// Closes the question that is open, whichever device's it is. [any]
    virtual void Cancel(const std::string& deviceId) = 0;

    virtual ~IQuorixControlAuthorizationGUI() = default;
};
