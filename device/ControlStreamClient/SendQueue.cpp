#include "ControlStreamClient/SendQueue.h"

#include "ControlStreamClient/FrameBuffer.h"

#include <cstdint>

namespace ControlStream {

namespace {

// What has left is cut off only when it is worth moving the rest.
constexpr std::size_t WorthCutting = 64U << 10U;

} // namespace

void VSendQueue::Add(const std::string& text)
{
    unsigned char header[FrameHeaderSize];
    WriteFrameHeader(static_cast<std::uint32_t>(text.size()), header);
    bytes.append(reinterpret_cast<const char*>(header), FrameHeaderSize);
    bytes += text;
    frameEnds.push_back(bytes.size());
}

void VSendQueue::Advance(std::size_t count)
{
    sent += count;
    begun = begun || count > 0;
    while (!frameEnds.empty() && frameEnds.front() <= sent) {
        begun = sent > frameEnds.front();
        frameEnds.pop_front();
    }
    if (sent == bytes.size()) {
        bytes.clear();
        sent = 0;
    } else if (sent >= WorthCutting) {
        bytes.erase(0, sent);
        for (std::size_t& end : frameEnds) {
            end -= sent;
        }
        sent = 0;
    }
}

bool VSendQueue::DropUnsent()
{
    bytes.resize(begun ? frameEnds.front() : sent);
    frameEnds.resize(begun ? 1 : 0);
    return !begun;
}

void VSendQueue::Clear()
{
    bytes.clear();
    frameEnds.clear();
    sent = 0;
    begun = false;
}

} // namespace ControlStream
