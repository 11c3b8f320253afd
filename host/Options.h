#pragma once

#include <iosfwd>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace QuorixHost {

/// What the command line asks of the host.
struct VOptions
{
    std::string plugin;     ///< path of the shared library; empty for the one built with the host
    unsigned cameras = 4;   ///< how many simulated cameras there are
    bool headless = false;  ///< no window
    std::string dataFolder; ///< where the host's own folders lie; empty for the user's default
    bool console = false;   ///< commands are read from standard input
    std::vector<std::pair<std::string, int>> logLevels; ///< by category, in the order given
};

/// A command line as it was understood: options to run with, or the exit code to end with.
struct VCommandLine
{
    std::optional<VOptions> options;
    int exitCode = 0;
};

/// The exit code of a wrong command line.
constexpr int wrongUsageExitCode = 2;

/// Reads the command line. Help and version go to `output` and end with 0; what is wrong is told
/// to `errors` in one or two lines and ends with wrongUsageExitCode.
VCommandLine ParseCommandLine(int argumentCount, const char* const* arguments, std::ostream& output,
                              std::ostream& errors);

} // namespace QuorixHost
