#include "FileLimit.h"

#include "utils/LogStatement.h"

#include <cerrno>
#include <cstring>
#include <sys/resource.h>

namespace QuorixHost {

void RaiseFileLimit()
{
    rlimit limit = {};
    if (getrlimit(RLIMIT_NOFILE, &limit) != 0) {
        KVR_LOG("Host", 3, "The limit of open files is unknown: %1%", std::strerror(errno));
        return;
    }

    const rlim_t before = limit.rlim_cur;
    if (before == limit.rlim_max) {
        KVR_LOG("Host", 4, "The limit of open files is %1%, the greatest allowed", before);
        return;
    }
    limit.rlim_cur = limit.rlim_max;
    if (setrlimit(RLIMIT_NOFILE, &limit) == 0) {
        KVR_LOG("Host", 4, "Raised the limit of open files from %1% to %2%", before,
                limit.rlim_max);
    } else {
        KVR_LOG("Host", 3, "The limit of open files stays at %1%: %2%", before,
                std::strerror(errno));
    }
}

} // namespace QuorixHost
