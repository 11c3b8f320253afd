#include "CameraCommands.h"

#include "Console.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "cameras/CameraSelection.h"
#include "cameras/SimulatedCameras.h"
#include "io/Values.h"

#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace QuorixHost {
namespace {

/// Returns a value as JSON: a greyscale mode by its number, since it may have no name.
nlohmann::json ToJson(const VDataValue& value)
{
    switch (value.EffectiveSchema()->Type) {
    case KVR::IO::EType::Bool:
        return ReadBool(value);
    case KVR::IO::EType::String:
        return ReadString(value);
    case KVR::IO::EType::UInt32:
        return ReadUInt32OrZero(value);
    case KVR::IO::EType::Enum32:
        return static_cast<std::int32_t>(ReadUInt32OrZero(value));
    case KVR::IO::EType::Float64: {
        double number = 0.0;
        return ReadValue(value, number) ? nlohmann::json(number) : nlohmann::json();
    }
    default:
        return nullptr; // no device has a setting of another type
    }
}

nlohmann::json DescribeCameras(const VSimulatedCameras& cameras, const IDataReader& reader)
{
    nlohmann::json described = nlohmann::json::array();
    for (const std::uint32_t number : cameras.CameraNumbers()) {
        nlohmann::json camera = {{"id", number}};
        for (const auto& parameter : cameras.Find("Device", CameraId(number))->Parameters()) {
            camera[parameter->Setting().Name] = ToJson(reader.GetValue(parameter->Token()));
        }
        described.push_back(std::move(camera));
    }
    return described;
}

nlohmann::json DescribeSelection(VCameraSelection& selection)
{
    std::vector<VSelectionEntry> entries;
    selection.GetView()->GetSelection(VCameraSelection::CameraFilter(), entries);
    nlohmann::json numbers = nlohmann::json::array();
    for (const VSelectionEntry& entry : entries) {
        std::string id;
        if (!entry.GetDeviceId(id)) {
            continue;
        }
        if (const auto number = CameraNumber(id)) {
            numbers.push_back(*number);
        }
    }
    return numbers;
}

nlohmann::json DescribeControl(const IDataReader& reader)
{
    nlohmann::json control = nlohmann::json::object();
    const VDataPath root{"Control"};
    std::vector<std::string> deviceIds;
    reader.GetChildren(root, deviceIds);
    for (const std::string& id : deviceIds) {
        const VDataPath device(root, id);
        control[id] = {
            {"Connected", ReadBool(reader.GetValue(VDataToken(VDataPath(device, "Connected"))))},
            {"Name", ReadString(reader.GetValue(VDataToken(VDataPath(device, "Name"))))}};
    }
    return control;
}

} // namespace

void AddCameraState(VConsole& console, const VCameraServices& services)
{
    console.AddStatePart([services](nlohmann::json& state) {
        const auto system = services.cameras->Find("System", "Gen6System");
        const auto tapToSelect = system->Find("EnableTapToSelect");
        state["selection"] = DescribeSelection(*services.selection);

        const VDataReader reader(*services.store); // one state of the store for all of it
        state["cameras"] = DescribeCameras(*services.cameras, reader);
        state["tapToSelect"] = ReadBool(reader.GetValue(tapToSelect->Token()));
        state["control"] = DescribeControl(reader);
        state["dialog"] = nullptr; // there is no window that one could be open in
    });
}

} // namespace QuorixHost
