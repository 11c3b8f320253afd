#include "io/IInputStream.h"

namespace KVR {

bool IInputStream::ReadParts(const std::vector<Part>& parts)
{
    for (const Part& part : parts) {
        if (!Read(part.first, part.second)) {
            return false;
        }
    }
    return true;
}

bool IInputStream::IsSeekable() const
{
    return false;
}

} // namespace KVR
