#pragma once

#include "ControlStreamClient/Records.h"

#include <string>

#include <nlohmann/json.hpp>

using VJson = nlohmann::ordered_json;

/// The program's standard output. Each line is flushed at once, since another program may wait
/// for it.
///
/// Failure: std::runtime_error where the output takes no more. Threads: the main thread.
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

private:
    const bool json;
};

/// An object with the parameters' names for keys, in their order; of two with one name the later
/// counts.
VJson ToJson(const ControlStream::VParameters& parameters);

/// A list of objects with the keys "name" and "description".
VJson ToJson(const std::vector<ControlStream::VParameterInformation>& parameters);
