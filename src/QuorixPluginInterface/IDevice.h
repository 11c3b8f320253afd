#pragma once

#include <memory>
#include <string>

class IParameter;

/// One device of the host and its parameters by name.
///
/// Threads: every operation may be called on any thread.
class IDevice
{
public:
    virtual ~IDevice() = default;

    /// Returns the parameter of that name, empty where the device has none.
    virtual std::shared_ptr<IParameter> GetParameter(const std::string& name) = 0;

    /// A second look-up of the same form and result.
    virtual std::shared_ptr<IParameter> FindParameter(const std::string& name) = 0;
};
