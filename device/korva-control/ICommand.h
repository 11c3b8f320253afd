#pragma once

#include "korva-control/ExitCode.h"

namespace CLI {
class App;
}

class VSession;

/// One of the program's commands, as the first word behind the options chooses it.
///
/// Threads: the main thread.
class ICommand
{
public:
    /// Adds the command with its options and their help to the program's. The options are read into
    /// this object, which has to outlive `program`.
    ///
    /// @return what the parser chose if it chose this command
    virtual CLI::App* AddTo(CLI::App& program) = 0;

    /// Does the command's work with the options that were read.
    ///
    /// @return how it ended; a failure that ends it early is thrown as ControlStream::VError
    virtual EExitCode Run(VSession& session) = 0;

    virtual ~ICommand() = default;
};
