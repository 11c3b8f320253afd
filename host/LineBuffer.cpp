#include "LineBuffer.h"

#include <cstring>
#include <utility>

namespace QuorixHost {

void VLineBuffer::Append(const char* bytes, std::size_t size)
{
    next = bytes;
    left = size;
}

std::optional<VLineBuffer::VLine> VLineBuffer::TakeLine()
{
    if (left == 0) {
        return std::nullopt;
    }
    const auto* const end = static_cast<const char*>(std::memchr(next, '\n', left));
    const std::size_t size = end == nullptr ? left : static_cast<std::size_t>(end - next);
    Keep(next, size);
    const std::size_t used = end == nullptr ? size : size + 1;
    next += used;
    left -= used;
    if (end == nullptr) {
        return std::nullopt;
    }
    return Finish();
}

std::optional<VLineBuffer::VLine> VLineBuffer::TakeLastLine()
{
    if (line.text.empty() && !line.tooLong) {
        return std::nullopt;
    }
    return Finish();
}

void VLineBuffer::Keep(const char* bytes, std::size_t size)
{
    // A carriage return that will be dropped may stand behind the longest line.
    if (line.tooLong || size > maximumBytes + 1 - line.text.size()) {
        line.tooLong = true;
        line.text.clear();
        return;
    }
    line.text.append(bytes, size);
}

VLineBuffer::VLine VLineBuffer::Finish()
{
    VLine finished = std::exchange(line, VLine());
    if (!finished.text.empty() && finished.text.back() == '\r') {
        finished.text.pop_back();
    }
    if (finished.text.size() > maximumBytes) {
        finished.text.clear();
        finished.tooLong = true;
    }
    return finished;
}

} // namespace QuorixHost
