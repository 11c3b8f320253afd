#pragma once

#include "QuorixPluginInterface/IDevice.h"
#include "cameras/SimulatedParameter.h"

#include <memory>
#include <string>
#include <vector>

namespace QuorixHost {

/// A simulated device: its settings by name, which do not change while it lives.
///
/// Threads: every operation [any].
class VSimulatedDevice : public IDevice
{
public:
    VSimulatedDevice(const std::shared_ptr<IDataStore>& store, const VDeviceModel& model);

    std::shared_ptr<IParameter> GetParameter(const std::string& name) override;
    std::shared_ptr<IParameter> FindParameter(const std::string& name) override;

    /// Returns the parameter of that name, empty where the device has none.
    std::shared_ptr<VSimulatedParameter> Find(const std::string& name) const;

    /// Returns every parameter, in the order in which the device's model has them.
    const std::vector<std::shared_ptr<VSimulatedParameter>>& Parameters() const
    {
        return parameters;
    }

private:
    std::vector<std::shared_ptr<VSimulatedParameter>> parameters;
};

} // namespace QuorixHost
