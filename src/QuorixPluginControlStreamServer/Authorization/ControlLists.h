#pragma once

#include "QuorixPluginControlStreamServer/Authorization/ControlDeviceRecord.h"

#include <string>

/// The stored form of the known devices: two texts, one of the allowed and one of the banned. Each
/// has one line for a device, its id, a semicolon and its name.
///
/// Threads: plain functions [any].
namespace ControlLists {

/// Adds the devices of one text to those that are there; a device in both keeps the later record.
///
/// A line is split at its first semicolon, so that a name may hold others. Empty lines and lines
/// without a semicolon are skipped.
void Read(const std::string& text, bool allowed, VControlDevices& devices);

/// Makes the text of the devices that are allowed, or of those that are not, in their order.
///
/// No name and no id can make the text read back with a device that is not there, or keep it out of
/// a file: line breaks and zeros of a name become blanks, and a device whose id holds a semicolon,
/// a line feed or a zero, or whose id and name together take 64 KiB or more, is left out.
std::string Write(const VControlDevices& devices, bool allowed);

} // namespace ControlLists
