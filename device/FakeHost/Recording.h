#pragma once

#include <cstdint>
#include <iosfwd>
#include <string>
#include <vector>

namespace FakeHost {

/// What happened at one moment of a recorded stream.
enum class ERecorded {
    Connected, ///< a device connected
    Device,    ///< a device sent a frame
    Host,      ///< the host did
    Closed,    ///< the connection ended
};

struct VRecordedMoment
{
    double Seconds = 0; ///< since the recording began
    unsigned Connection = 1;
    ERecorded Kind = ERecorded::Host;
    std::string Text; ///< of the frame, the very bytes
};

/// Returns a moment as a line of JSON, without its end. Bytes that are not UTF-8 are kept as
/// hexadecimal digits.
std::string ToLine(const VRecordedMoment& moment);

/// Returns the first line of a recording.
std::string HeadLine(const std::string& host);

/// Reads a recording.
///
/// @param name  of the file, for the text of a failure
/// @throws ControlStream::VError  of the kind Usage where a line is not one of a recording
std::vector<VRecordedMoment> ReadRecording(std::istream& input, const std::string& name);

} // namespace FakeHost
