#pragma once

#include "ControlStreamClient/Records.h"

#include <string>
#include <variant>
#include <vector>

namespace ControlStream {

/// What a host can send. The names are those of the elements on the wire.
enum class EMessageKind {
    Unknown, ///< well-formed, but with no element that this client knows
    ServerInformation,
    Commands,
    CommandInformation,
    Events,
    EventInformation,
    CommandReply,
    Event,
};

/// One message from the host.
struct VMessage
{
    EMessageKind Kind = EMessageKind::Unknown;

    /// The request's own, which the host hands back; empty for the kinds that have none.
    std::string Correlation;

    /// The record of the kind; a list of names for Commands and Events, nothing for Unknown.
    std::variant<std::monostate, VServerInformation, std::vector<std::string>, VCommandInformation,
                 VEventInformation, VCommandReply, VEvent>
        Content;
};

/// Reads the text of a frame. [any]
///
/// @param text  a copy to work in: what is not UTF-8 becomes U+FFFD
/// @throws VError  of the kind Protocol where it is no XML, is nested too deeply, or lacks what a
///                 message of its kind must have
VMessage ParseMessage(std::string text);

} // namespace ControlStream
