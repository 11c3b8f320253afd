#include "cameras/SimulatedParameter.h"

#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataWriter.h"

#include <utility>

namespace QuorixHost {

VSimulatedParameter::VSimulatedParameter(std::shared_ptr<IDataStore> store, VSettingModel setting)
    : store(std::move(store)), setting(std::move(setting)), token(this->setting.Path)
{
}

VDataValue VSimulatedParameter::GetValue()
{
    const VDataReader reader(*store);
    return reader.GetValue(token);
}

bool VSimulatedParameter::SetValue(const VDataValue& value)
{
    if (setting.Held) {
        return false;
    }
    VDataWriter writer(*store);
    // A write would bring back what has gone with its device.
    return writer.HasValue(token) && writer.SetValue(token, value);
}

} // namespace QuorixHost
