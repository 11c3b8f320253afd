// Lets any bytes arrive at a device as a host's stream, in pieces of any size, and reads every
// frame that comes out of it as a message; the whole input is read as one message too.

#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/FrameBuffer.h"
#include "ControlStreamClient/Message.h"
#include "ControlStreamClient/Utf8.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

using namespace ControlStream;

constexpr std::uint32_t FrameLimit = 1U << 16U;

void Require(bool holds, const char* what)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n", what);
        std::abort();
    }
}

void RequireText(const std::string& text)
{
    Require(IsUtf8(text), "every text is UTF-8");
    Require(text.find('\0') == std::string::npos, "no text holds a zero");
}

void RequireParameters(const VParameters& parameters)
{
    for (const VParameter& parameter : parameters) {
        RequireText(parameter.Name);
        RequireText(parameter.Value);
    }
}

void RequireDescriptions(const std::vector<VParameterInformation>& parameters)
{
    for (const VParameterInformation& parameter : parameters) {
        RequireText(parameter.Name);
        RequireText(parameter.Description);
    }
}

struct VContentCheck
{
    void operator()(std::monostate) const {}

    void operator()(const VServerInformation& information) const
    {
        Require(information.Major >= 0 && information.Minor >= 0, "versions count from zero");
    }

    void operator()(const std::vector<std::string>& names) const
    {
        for (const std::string& name : names) {
            RequireText(name);
        }
    }

    void operator()(const VCommandInformation& information) const
    {
        RequireText(information.Name);
        RequireText(information.Description);
        RequireDescriptions(information.InputParameters);
        RequireDescriptions(information.ReplyParameters);
    }

    void operator()(const VEventInformation& information) const
    {
        RequireText(information.Name);
        RequireText(information.Description);
        RequireDescriptions(information.Parameters);
    }

    void operator()(const VCommandReply& reply) const
    {
        Require(!reply.Result.empty(), "a reply has a result");
        Require(reply.Ok == (reply.Result == "OK"), "one result alone is good");
        RequireText(reply.Result);
        RequireParameters(reply.Parameters);
    }

    void operator()(const VEvent& event) const
    {
        RequireText(event.Name);
        RequireParameters(event.Parameters);
    }
};

void Read(const std::string& text)
{
    try {
        const VMessage message = ParseMessage(text);
        RequireText(message.Correlation);
        std::visit(VContentCheck(), message.Content);
    } catch (const VError& error) {
        Require(error.Kind() == EErrorKind::Protocol, "a bad message is the host's fault");
    }
}

/// @return false once the stream cannot be followed any more
bool TakeFrames(VFrameBuffer& buffer)
{
    try {
        for (std::string text; buffer.Take(text);) {
            Require(text.size() <= FrameLimit, "no frame is above the limit");
            Read(text);
        }
        return true;
    } catch (const VError& error) {
        Require(error.Kind() == EErrorKind::Protocol, "a bad length is the host's fault");
        return false;
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    Read(bytes);

    VFrameBuffer buffer(FrameLimit);
    const std::size_t step = size == 0 ? 1 : 1 + data[size - 1];
    for (std::size_t sent = 0; sent < size;) {
        const VFrameBuffer::VSpace space = buffer.GetSpace();
        const std::size_t count = std::min({step, space.Size, size - sent});
        std::memcpy(space.Data, bytes.data() + sent, count);
        buffer.Commit(count);
        sent += count;
        if (!TakeFrames(buffer)) {
            break;
        }
    }
    buffer.DescribeRest();
    return 0;
}
