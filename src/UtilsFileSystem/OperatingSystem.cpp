#include "UtilsFileSystem/OperatingSystem.h"

#include <sys/utsname.h>

namespace UtilsFileSystem {

std::string GetOperatingSystemName()
{
    utsname names{};
    if (uname(&names) != 0) {
        return "Unknown Linux Version 64Bit";
    }
    return std::string(names.sysname) + " " + names.release + " 64Bit";
}

} // namespace UtilsFileSystem
