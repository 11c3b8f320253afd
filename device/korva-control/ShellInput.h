#pragma once

#include "korva-control/ShellInbox.h"

#include <csignal>
#include <functional>
#include <string>

/// Why a wait for input ended.
enum class EShellInput { Ready, Ended, Interrupted, Terminated, Resized, Resumed, Posted };

/// The shell's three sources: what is typed, what other threads post, and signals.
///
/// Owns: the blocking of SIGINT, SIGTERM, SIGWINCH and SIGCONT, put back in the end, and the
/// descriptor that hears them. To be made before any thread. Threads: the main thread.
class VShellInput
{
public:
    explicit VShellInput(VShellInbox& shellInbox);
    ~VShellInput();
    VShellInput(const VShellInput&) = delete;
    VShellInput& operator=(const VShellInput&) = delete;

    /// Waits for one of them.
    ///
    /// @param reads  whether typed text counts; it stays where it is otherwise
    EShellInput Wait(bool reads);

    /// Whether something typed can be taken at once.
    static bool HasTyped();

    /// Takes one byte that has been typed. @return false at the end of the input
    static bool ReadByte(char& byte);

    VShellInbox& Inbox() { return inbox; }

    bool IsTerminated() const { return terminated; }

private:
    EShellInput ReadSignal();

    VShellInbox& inbox;
    sigset_t previous{};
    int signals = -1;
    bool terminated = false;
};
