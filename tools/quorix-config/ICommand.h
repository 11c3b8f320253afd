#pragma once

#include <iosfwd>
#include <memory>

namespace CLI {
class App;
}

namespace QuorixConfig {

/// The exit codes of the program. A comparison that finds a difference ends with `failed`, and one
/// that cannot be made with `wrongUsage`, as other such programs have it.
constexpr int done = 0;
constexpr int failed = 1;
constexpr int wrongUsage = 2;

/// One subcommand: it declares itself to the command line and is run if it was chosen there.
///
/// Threads: one. Failure: told in one line on `errors`, and by the exit code.
class ICommand
{
public:
    virtual ~ICommand() = default;

    /// Adds the subcommand with its options, whose values this object receives.
    ///
    /// @return the subcommand, which the application owns
    virtual CLI::App* Declare(CLI::App& application) = 0;

    /// Does what the options ask for. @return the exit code of the program
    virtual int Run(std::ostream& output, std::ostream& errors) = 0;
};

std::unique_ptr<ICommand> MakeCheckCommand();
std::unique_ptr<ICommand> MakeGetCommand();
std::unique_ptr<ICommand> MakeSetCommand();
std::unique_ptr<ICommand> MakeListCommand();
std::unique_ptr<ICommand> MakeDiffCommand();
std::unique_ptr<ICommand> MakeMigrateCommand();

} // namespace QuorixConfig
