#pragma once

#include <string>

/// One entry of the host's selection. It may name something that is no device.
class VSelectionEntry
{
public:
    /// Makes an entry that names no device.
    VSelectionEntry() = default;

    /// Makes an entry from a device id, such as "qx:7".
    explicit VSelectionEntry(const std::string& deviceId) : id(deviceId), namesDevice(true) {}

    /// @return false, with `deviceId` untouched, when the entry names no device
    bool GetDeviceId(std::string& deviceId) const
    {
        if (!namesDevice) {
            return false;
        }
        deviceId = id;
        return true;
    }

private:
    std::string id;
    bool namesDevice = false;
};
