#include "CameraCommands.h"

#include "Console.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "cameras/CameraHardware.h"
#include "cameras/CameraSelection.h"
#include "cameras/SimulatedCameras.h"
#include "io/ValueText.h"
#include "io/Values.h"
#include "utils/NumberText.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <charconv>
#include <string>
#include <utility>
#include <vector>

namespace QuorixHost {
namespace {

// Enough for any test of a burst. A slip of the finger is to be noticed, not carried out.
constexpr std::uint32_t mostNotifications = 1'000'000;

using ParameterReference = std::shared_ptr<VSimulatedParameter>;

ParameterReference FindParameter(const VSimulatedCameras& cameras, const std::string& deviceClass,
                                 const std::string& deviceId, const std::string& name)
{
    const std::shared_ptr<VSimulatedDevice> device = cameras.Find(deviceClass, deviceId);
    if (!device) {
        throw VConsoleError("there is no device " + deviceId + " of the class " + deviceClass);
    }
    ParameterReference parameter = device->Find(name);
    if (!parameter) {
        throw VConsoleError(deviceId + " has no parameter " + name);
    }
    return parameter;
}

ParameterReference TakeParameter(VConsoleLine& line, const VSimulatedCameras& cameras)
{
    const std::string deviceClass = line.TakeWord("a device's class");
    const std::string deviceId = line.TakeWord("a device's id");
    return FindParameter(cameras, deviceClass, deviceId, line.TakeWord("a parameter's name"));
}

std::uint32_t TakeCameraNumber(VConsoleLine& line)
{
    const std::string word = line.TakeWord("a camera's number");
    const std::optional<std::uint32_t> number = KVR::DeviceTextToUInt32(word);
    if (!number) {
        throw VConsoleError("'" + word + "' is no camera's number");
    }
    return *number;
}

/// Takes a number of 32 bits that may be negative.
std::int32_t TakeRawNumber(VConsoleLine& line)
{
    const std::string word = line.TakeWord("a number");
    std::int32_t number = 0;
    const auto result = std::from_chars(word.data(), word.data() + word.size(), number);
    if (result.ec != std::errc() || result.ptr != word.data() + word.size()) {
        throw VConsoleError("'" + word + "' is no number of 32 bits");
    }
    return number;
}

std::uint32_t TakeCount(VConsoleLine& line)
{
    const std::string word = line.TakeWord("a count");
    const std::optional<std::uint32_t> count = KVR::DeviceTextToUInt32(word);
    if (!count || *count < 1 || *count > mostNotifications) {
        throw VConsoleError("'" + word + "' is no count from 1 to " +
                            std::to_string(mostNotifications));
    }
    return *count;
}

std::string TrimBlanks(const std::string& text)
{
    const std::size_t begin = text.find_first_not_of(" \t");
    return begin == std::string::npos
               ? std::string()
               : text.substr(begin, text.find_last_not_of(" \t") - begin + 1);
}

/// Returns the value of a text under the schema that a parameter's values have. Blanks at the end
/// belong to a text without quotes, and to nothing else.
VDataValue ParseValue(const VSettingModel& setting, const std::string& given)
{
    VDataValue value;
    value.Schema = setting.Initial.Schema;
    const std::string text =
        value.Schema->Type == KVR::IO::EType::String ? given : TrimBlanks(given);
    const char* position = text.data();
    const char* const end = position + text.size();
    if (!KVR::IO::TextToBinary(position, end, *value.Schema, value.Bytes,
                               KVR::IO::SchemaTextModeRow) ||
        position != end) {
        throw VConsoleError("'" + text + "' is no value of " + setting.Name);
    }
    return value;
}

void SetValue(VSimulatedParameter& parameter, const VDataValue& value)
{
    if (!parameter.SetValue(value)) {
        throw VConsoleError(parameter.Setting().Path.Text() + " refuses to be changed");
    }
}

/// Reads camera numbers between commas; no text at all is none.
std::vector<VSelectionEntry> ParseSelection(const std::string& text)
{
    std::vector<VSelectionEntry> selection;
    for (std::size_t begin = 0, end = 0; end < text.size(); begin = end + 1) {
        end = std::min(text.find(',', begin), text.size());
        const std::string word = TrimBlanks(text.substr(begin, end - begin));
        const std::optional<std::uint32_t> number = KVR::DeviceTextToUInt32(word);
        if (!number) {
            throw VConsoleError("'" + word + "' is no camera's number");
        }
        selection.emplace_back(CameraId(*number));
    }
    return selection;
}

nlohmann::json DescribeLocks(const VDataStore& store)
{
    nlohmann::json locks = nlohmann::json::array();
    for (const VDataStoreLock& lock : store.GetLocks()) {
        locks.push_back({{"thread", lock.ThreadName},
                         {"changeId", lock.ChangeId},
                         {"readLocks", lock.ReadLocks},
                         {"writeLocks", lock.WriteLocks},
                         {"waiting", lock.Waiting},
                         {"writer", lock.WriterMark}});
    }
    return locks;
}

} // namespace

void AddCameraCommands(VConsole& console, const VCameraServices& services)
{
    const std::shared_ptr<VSimulatedCameras> cameras = services.cameras;

    console.AddCommand("set", [cameras](VConsoleLine& line) {
        const ParameterReference parameter = TakeParameter(line, *cameras);
        const std::string text = line.TakeRest();
        if (text.empty()) {
            throw VConsoleError("expected a value");
        }
        SetValue(*parameter, ParseValue(parameter->Setting(), text));
        return std::string();
    });
    console.AddCommand("get", [cameras](VConsoleLine& line) {
        const ParameterReference parameter = TakeParameter(line, *cameras);
        line.ExpectEnd();
        return nlohmann::json(ValueToText(parameter->GetValue()))
            .dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
    });
    console.AddCommand("mode", [cameras](VConsoleLine& line) {
        const std::uint32_t camera = TakeCameraNumber(line);
        const std::int32_t number = TakeRawNumber(line);
        line.ExpectEnd();
        const ParameterReference parameter =
            FindParameter(*cameras, "Device", CameraId(camera), "GreyscaleMode");
        SetValue(*parameter, MakeEnumValue(GreyscaleModeSchema(), number));
        return std::string();
    });
    console.AddCommand("select", [selection = services.selection](VConsoleLine& line) {
        selection->GetView()->SetSelection(ParseSelection(TrimBlanks(line.TakeRest())),
                                           VCameraSelection::CameraFilter());
        return std::string();
    });
    console.AddCommand("notify", [cameras, hardware = services.hardware](VConsoleLine& line) {
        const ParameterReference parameter = TakeParameter(line, *cameras);
        const std::uint32_t count = TakeCount(line);
        line.ExpectEnd();
        hardware->NotifyRepeatedly(parameter, count);
        return std::string();
    });
    console.AddCommand("add", [cameras](VConsoleLine& line) {
        const std::uint32_t number = TakeCameraNumber(line);
        line.ExpectEnd();
        if (!cameras->AddCamera(number)) {
            throw VConsoleError("there is a camera " + std::to_string(number) + " already");
        }
        return std::string();
    });
    console.AddCommand("remove", [cameras](VConsoleLine& line) {
        const std::uint32_t number = TakeCameraNumber(line);
        line.ExpectEnd();
        if (!cameras->RemoveCamera(number)) {
            throw VConsoleError("there is no camera " + std::to_string(number));
        }
        return std::string();
    });
    console.AddCommand("locks", [store = services.store](VConsoleLine& line) {
        line.ExpectEnd();
        return DescribeLocks(*store).dump();
    });
}

} // namespace QuorixHost
