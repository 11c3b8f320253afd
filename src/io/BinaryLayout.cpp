#include "io/BinaryLayout.h"

#include <limits>

namespace KVR {
namespace IO {
namespace Detail {

bool AppendString(std::vector<unsigned char>& bytes, const std::string& text)
{
    if (text.size() > std::numeric_limits<std::uint32_t>::max()) {
        return false;
    }
    AppendNumber(bytes, static_cast<std::uint32_t>(text.size()));
    bytes.insert(bytes.end(), text.begin(), text.end());
    return true;
}

bool AppendEnum(std::vector<unsigned char>& bytes, EType type, std::int32_t number)
{
    switch (type) {
    case EType::Enum8:
        AppendNumber(bytes, static_cast<std::int8_t>(number));
        return true;
    case EType::Enum16:
        AppendNumber(bytes, static_cast<std::int16_t>(number));
        return true;
    case EType::Enum32:
        AppendNumber(bytes, number);
        return true;
    default:
        return false;
    }
}

} // namespace Detail
} // namespace IO
} // namespace KVR
