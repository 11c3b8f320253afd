#include "QuorixPluginControlStreamServer/ControlSystem/CameraNames.h"

#include <charconv>
#include <system_error>

namespace CameraNames {

namespace {

const std::string idPrefix = "qx:";

} // namespace

std::string CameraId(std::uint32_t number)
{
    return idPrefix + std::to_string(number);
}

std::optional<std::uint32_t> CameraNumber(const std::string& deviceId)
{
    if (deviceId.compare(0, idPrefix.size(), idPrefix) != 0) {
        return std::nullopt;
    }
    const char* const begin = deviceId.data() + idPrefix.size();
    const char* const end = deviceId.data() + deviceId.size();
    std::uint32_t number = 0;
    const auto [stopped, error] = std::from_chars(begin, end, number);
    if (error != std::errc() || stopped != end) {
        return std::nullopt;
    }
    return number;
}

std::wstring SelectionText(const std::vector<VSelectionEntry>& entries)
{
    std::wstring text;
    for (const VSelectionEntry& entry : entries) {
        std::string deviceId;
        if (!entry.GetDeviceId(deviceId)) {
            continue;
        }
        if (const std::optional<std::uint32_t> number = CameraNumber(deviceId)) {
            text += std::to_wstring(*number) + L',';
        }
    }
    if (!text.empty()) {
        text.pop_back();
    }
    return text;
}

const std::vector<std::int32_t>& SelectionFilter()
{
    static const std::vector<std::int32_t> filter{1};
    return filter;
}

} // namespace CameraNames
