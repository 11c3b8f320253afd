#include "utils/StandardStreams.h"

#include <fcntl.h>
#include <unistd.h>

namespace KVR {

void FillStandardStreams()
{
    int descriptor = 0;
    do {
        descriptor = open("/dev/null", O_RDONLY);
    } while (descriptor >= 0 && descriptor <= STDERR_FILENO);
    if (descriptor > STDERR_FILENO) {
        close(descriptor);
    }
}

} // namespace KVR
