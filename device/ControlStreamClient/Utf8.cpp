#include "ControlStreamClient/Utf8.h"

#include "utils/WideText.h"

#include <algorithm>

namespace ControlStream {

namespace {

bool IsAscii(const std::string& bytes)
{
    return std::all_of(bytes.begin(), bytes.end(),
                       [](char byte) { return static_cast<unsigned char>(byte) < 0x80; });
}

/// What the host's own codec makes of the bytes.
std::string Repaired(const std::string& bytes)
{
    return KVR::WideToUtf8(KVR::Utf8ToWide(bytes));
}

std::string WithoutZeros(const std::string& bytes)
{
    std::string text;
    text.reserve(bytes.size());
    for (const char byte : bytes) {
        if (byte == '\0') {
            text += "\xEF\xBF\xBD"; // U+FFFD
        } else {
            text += byte;
        }
    }
    return text;
}

} // namespace

bool IsUtf8(const std::string& bytes)
{
    return IsAscii(bytes) || Repaired(bytes) == bytes;
}

void MakeReadable(std::string& bytes)
{
    if (bytes.find('\0') != std::string::npos) {
        bytes = WithoutZeros(bytes);
    }
    if (!IsAscii(bytes)) {
        bytes = Repaired(bytes);
    }
}

} // namespace ControlStream
