#include "QuorixPluginControlStreamServer/Authorization/ControlLists.h"

#include <algorithm>
#include <cstddef>

namespace ControlLists {
namespace {

constexpr char entrySeparator = '\n';
constexpr char nameSeparator = ';';

void ReadEntry(const std::string& entry, bool allowed, VControlDevices& devices)
{
    const std::size_t split = entry.find(nameSeparator);
    if (split != std::string::npos) {
        devices[entry.substr(0, split)] = {allowed, entry.substr(split + 1)};
    }
}

// A zero could not be printed: the file would go without the whole list.
constexpr char unprintable = '\0';

// A file beyond some megabytes is not read again, and everything else in it would go with the list.
constexpr std::size_t longestEntry = std::size_t{64} << 10;

bool IsStorable(const std::string& deviceId, const std::string& name)
{
    return deviceId.find(nameSeparator) == std::string::npos &&
           deviceId.find(entrySeparator) == std::string::npos &&
           deviceId.find(unprintable) == std::string::npos &&
           deviceId.size() + name.size() < longestEntry;
}

std::string InOneLine(std::string name)
{
    const auto isBreak = [](char character) {
        return character == '\n' || character == '\r' || character == unprintable;
    };
    std::replace_if(name.begin(), name.end(), isBreak, ' ');
    return name;
}

} // namespace

void Read(const std::string& text, bool allowed, VControlDevices& devices)
{
    std::size_t begin = 0;
    while (begin < text.size()) {
        const std::size_t end = std::min(text.find(entrySeparator, begin), text.size());
        ReadEntry(text.substr(begin, end - begin), allowed, devices);
        begin = end + 1;
    }
}

std::string Write(const VControlDevices& devices, bool allowed)
{
    std::string text;
    bool first = true;
    for (const auto& [deviceId, record] : devices) {
        if (record.Allowed != allowed || !IsStorable(deviceId, record.Name)) {
            continue;
        }
        if (!first) {
            text += entrySeparator;
        }
        first = false;
        text += deviceId + nameSeparator + InOneLine(record.Name);
    }
    return text;
}

} // namespace ControlLists
