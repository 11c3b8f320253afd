#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace ControlStream {

// What crosses the control stream, as plain records. Every text is valid UTF-8: bytes from the host
// that are not become U+FFFD.

/// The TCP port on which every host listens. It differs from the port that hosts advertise.
constexpr std::uint16_t DefaultPort = 803;

/// One value with its name. Every value is text, whatever it means.
struct VParameter
{
    std::string Name;
    std::string Value;
};

/// Parameters in the order in which they stand in the message.
using VParameters = std::vector<VParameter>;

/// Returns the value under `name`, or the empty text where there is none: the control stream does
/// not tell an absent parameter from an empty one.
std::string GetValue(const VParameters& parameters, const std::string& name);

/// The version of the protocol that the host speaks; 1.0 is the only one.
struct VServerInformation
{
    int Major = 0;
    int Minor = 0;
};

/// One parameter's name with a text for people.
struct VParameterInformation
{
    std::string Name;
    std::string Description;
};

/// What the host tells of a command.
///
/// For a command that it does not describe, `Name` is empty and `Description` is
/// "Command not found."; this goes for the commands of the authorization too, which can be run all
/// the same.
struct VCommandInformation
{
    std::string Name;
    std::string Description;
    std::vector<VParameterInformation> InputParameters;
    std::vector<VParameterInformation> ReplyParameters;
};

/// What the host tells of an event. Hosts commonly tell nothing: all fields are empty then, whether
/// the event exists or not.
struct VEventInformation
{
    std::string Name;
    std::string Description;
    std::vector<VParameterInformation> Parameters;
};

/// A command to be run, with its parameters.
struct VCall
{
    std::string Name;
    VParameters Parameters;
};

/// The outcome of a command.
struct VCommandReply
{
    std::string Result;     ///< "OK", or the reason of the failure
    bool Ok = false;        ///< whether Result is "OK"
    VParameters Parameters; ///< empty after a failure
};

/// Something that the host told without being asked.
struct VEvent
{
    std::string Name;
    VParameters Parameters;
};

} // namespace ControlStream
