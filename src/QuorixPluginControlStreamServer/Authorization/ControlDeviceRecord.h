#pragma once

#include <map>
#include <string>

/// What is remembered of a device that the operator has judged for good.
struct VControlDeviceRecord
{
    bool Allowed = false; ///< false: banned
    std::string Name;     ///< in plain text, UTF-8
};

inline bool operator==(const VControlDeviceRecord& left, const VControlDeviceRecord& right)
{
    return left.Allowed == right.Allowed && left.Name == right.Name;
}

/// The known devices by their ids, in the order of the ids' bytes.
using VControlDevices = std::map<std::string, VControlDeviceRecord>;
