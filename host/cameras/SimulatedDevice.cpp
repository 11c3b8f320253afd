#include "cameras/SimulatedDevice.h"

#include <algorithm>

namespace QuorixHost {

VSimulatedDevice::VSimulatedDevice(const std::shared_ptr<IDataStore>& store,
                                   const VDeviceModel& model)
{
    for (const VSettingModel& setting : model.Settings) {
        parameters.push_back(std::make_shared<VSimulatedParameter>(store, setting));
    }
}

std::shared_ptr<IParameter> VSimulatedDevice::GetParameter(const std::string& name)
{
    return Find(name);
}

std::shared_ptr<IParameter> VSimulatedDevice::FindParameter(const std::string& name)
{
    return Find(name);
}

std::shared_ptr<VSimulatedParameter> VSimulatedDevice::Find(const std::string& name) const
{
    const auto found =
        std::find_if(parameters.begin(), parameters.end(),
                     [&](const auto& parameter) { return parameter->Setting().Name == name; });
    return found != parameters.end() ? *found : nullptr;
}

} // namespace QuorixHost
