#pragma once

#include <iosfwd>

namespace QuorixConfig {

/// Reads the command line and runs the subcommand that it names.
///
/// @return the exit code of the program
int RunProgram(int argumentCount, const char* const* arguments, std::ostream& output,
               std::ostream& errors);

} // namespace QuorixConfig
