#pragma once

#include <string>

namespace UtilsFileSystem {

/// Returns the name of the system for logs: its name, its release and the width of its words. [any]
std::string GetOperatingSystemName();

} // namespace UtilsFileSystem
