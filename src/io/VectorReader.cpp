#include "io/VectorReader.h"

#include <stdexcept>

namespace KVR {
namespace IO {
namespace Detail {

bool VVectorReader::ReadString(std::string& text)
{
    const auto length = Read<std::uint32_t>();
    if (!Advance(length)) {
        return false;
    }
    const unsigned char* first = BytesBehind(length);
    text.assign(first, first + length);
    return true;
}

void VVectorReader::ThrowUnexpectedEnd()
{
    throw std::runtime_error("Unexpected end of binary data");
}

} // namespace Detail
} // namespace IO
} // namespace KVR
