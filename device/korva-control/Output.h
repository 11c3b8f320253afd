#pragma once

#include "ControlStreamClient/Records.h"
#include "korva-control/ExitCode.h"

#include <optional>
#include <string>

#include <nlohmann/json.hpp>

using VJson = nlohmann::ordered_json;

/// The program's standard output, and what it says of itself on standard error. Each line is
/// flushed at once, since another program may wait for it.
///
/// Failure: std::runtime_error where the output takes no more; what standard error does not take is
/// lost. Threads: the main thread.
class VOutput
{
public:
    /// @param jsonLines  one JSON object a line, for programs, instead of lines for people
    explicit VOutput(bool jsonLines) : json(jsonLines) {}

    bool IsJson() const { return json; }

    /// Prints a line for people; what is in it from the host must be made harmless before.
    void PrintLine(const std::string& line);

    void PrintJson(const VJson& object);

    /// Prints the bytes as they are and ends the line; to a terminal, made harmless.
    void PrintRaw(const std::string& bytes);

    /// Writes a line about the program's own doings to standard error.
    void PrintNotice(const std::string& text) const;

    /// The same, about what may not go as it was meant.
    void PrintWarning(const std::string& text) const;

    /// The same, about what was not done.
    ///
    /// @param exitCode  what the program ends with; empty where it goes on
    void PrintFailure(const std::string& text, std::optional<EExitCode> exitCode) const;

private:
    const bool json;
};

/// An object with the parameters' names for keys, in their order; of two with one name the later
/// counts.
VJson ToJson(const ControlStream::VParameters& parameters);

/// A list of objects with the keys "name" and "description".
VJson ToJson(const std::vector<ControlStream::VParameterInformation>& parameters);
