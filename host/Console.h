#pragma once

#include "ConsoleLine.h"

#include <boost/function.hpp>
#include <nlohmann/json_fwd.hpp>

#include <map>
#include <string>
#include <vector>

namespace QuorixHost {

/// The commands of the console: answers each line with exactly one line.
///
/// Owns: the table of commands and the table of what `state` tells. Threads: [gui].
/// Failure: a wrong line, and whatever a command throws, is answered by "error: " and the reason.
class VConsole
{
public:
    /// Runs a command on the rest of its line, behind the command's name.
    ///
    /// @return JSON to answer with, or an empty text where there is nothing to tell. What it throws
    /// becomes the error's reason.
    using Command = boost::function<std::string(VConsoleLine& line)>;

    /// Writes one part of the host's state into the object that `state` answers with.
    using StatePart = boost::function<void(nlohmann::json& state)>;

    VConsole();

    /// Adds a command, or replaces the one of that name.
    void AddCommand(const std::string& name, Command command);

    /// Adds to what `state` tells.
    void AddStatePart(StatePart part);

    /// Runs one line.
    ///
    /// @param line  any bytes; without the line's end
    /// @return "ok", "ok <JSON>" or "error: <reason>", without a line's end
    std::string Answer(const std::string& line);

private:
    std::string Run(const std::string& line);
    std::string DescribeState() const;

    std::map<std::string, Command> commands;
    std::vector<StatePart> stateParts;
};

} // namespace QuorixHost
