#include "ControlStreamClient/FrameBuffer.h"

#include "ControlStreamClient/Error.h"

#include <algorithm>
#include <cstring>

namespace ControlStream {

namespace {

// Room for a common reply with its events, so that one system call reads them all.
constexpr std::size_t FirstSize = 64U << 10U;

// A buffer that one big frame made larger than this goes back once it is empty.
constexpr std::size_t LargestIdleSize = 1U << 20U;

} // namespace

void WriteFrameHeader(std::uint32_t length, unsigned char (&header)[FrameHeaderSize])
{
    for (std::size_t i = 0; i < FrameHeaderSize; ++i) {
        header[i] = static_cast<unsigned char>(length >> (8 * i));
    }
}

VFrameBuffer::VFrameBuffer(std::uint32_t limit) : frameLimit(limit) {}

VFrameBuffer::VSpace VFrameBuffer::GetSpace()
{
    if (begin == end) {
        begin = 0;
        end = 0;
        if (bytes.size() > LargestIdleSize) {
            bytes = std::vector<char>();
        }
    }
    if (end == bytes.size() && begin > 0) {
        std::memmove(bytes.data(), bytes.data() + begin, Size());
        end -= begin;
        begin = 0;
    }
    if (end == bytes.size()) {
        bytes.resize(std::max(FirstSize, 2 * bytes.size()));
    }
    return {bytes.data() + end, bytes.size() - end};
}

void VFrameBuffer::Commit(std::size_t count)
{
    end += count;
}

bool VFrameBuffer::Take(std::string& text)
{
    std::uint32_t length = 0;
    if (!ReadHeader(begin, length)) {
        return false;
    }
    if (length > frameLimit) {
        throw VError(EErrorKind::Protocol,
                     "the host announced a frame of " + std::to_string(length) +
                         " bytes, but the limit is " + std::to_string(frameLimit));
    }
    if (Size() - FrameHeaderSize < length) {
        return false;
    }
    text.assign(bytes.data() + begin + FrameHeaderSize, length);
    begin += FrameHeaderSize + length;
    return true;
}

bool VFrameBuffer::IsFull() const
{
    return Size() > FrameHeaderSize + std::size_t(frameLimit);
}

std::string VFrameBuffer::DescribeRest() const
{
    std::size_t position = begin;
    std::uint32_t length = 0;
    while (ReadHeader(position, length) && end - position - FrameHeaderSize >= length) {
        position += FrameHeaderSize + length; // whole, only not taken yet
    }
    const std::size_t rest = end - position;
    if (rest == 0) {
        return std::string();
    }
    if (rest < FrameHeaderSize) {
        return std::to_string(rest) + " of the 4 bytes of its header";
    }
    return std::to_string(rest - FrameHeaderSize) + " of its " + std::to_string(length) + " bytes";
}

void VFrameBuffer::Clear()
{
    begin = 0;
    end = 0;
}

bool VFrameBuffer::ReadHeader(std::size_t position, std::uint32_t& length) const
{
    if (end - position < FrameHeaderSize) {
        return false;
    }
    length = 0;
    for (std::size_t i = 0; i < FrameHeaderSize; ++i) {
        length |= std::uint32_t(static_cast<unsigned char>(bytes[position + i])) << (8 * i);
    }
    return true;
}

} // namespace ControlStream
