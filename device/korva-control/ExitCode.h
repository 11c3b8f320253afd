#pragma once

/// What the program ends with; scripts rely on the numbers.
enum class EExitCode {
    Done = 0,
    HostFailed = 1,   ///< the host answered with a failure, or with something unreadable
    WrongUsage = 2,   ///< nothing was sent
    NoConnection = 3, ///< none was made, or the host closed it
    TimedOut = 4,
};
