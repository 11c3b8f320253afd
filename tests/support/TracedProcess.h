#pragma once

#include <csignal>
#include <cstddef>
#include <functional>
#include <stdexcept>
#include <sys/ptrace.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <sys/user.h>
#include <sys/wait.h>
#include <unistd.h>

namespace TestSupport {

/// Work in a child process that can be killed at any of its system calls: before it, after it, or,
/// where it writes, in its middle.
///
/// Nothing in the code under test knows of it. Only for tests whose process has a single thread.
class VTracedProcess
{
public:
    explicit VTracedProcess(const std::function<void()>& work)
    {
        child = fork();
        if (child == 0) {
            ptrace(PTRACE_TRACEME, 0, nullptr, nullptr);
            raise(SIGSTOP);
            work();
            _exit(0);
        }
        AwaitStop();
        ptrace(PTRACE_SETOPTIONS, child, nullptr, PTRACE_O_TRACESYSGOOD | PTRACE_O_EXITKILL);
    }

    ~VTracedProcess()
    {
        if (!ended) {
            kill(child, SIGKILL);
            AwaitStop();
        }
    }

    VTracedProcess(const VTracedProcess&) = delete;
    VTracedProcess& operator=(const VTracedProcess&) = delete;

    /// Runs to the next entry of a system call or return from one; those that only fetch random
    /// numbers, of which there may be thousands, change nothing and are passed over.
    ///
    /// @return false at the end
    bool Step()
    {
        do {
            RunToStop();
        } while (!ended && IsHarmless());
        return !ended;
    }

    /// Whether the process stands before a system call, and not behind one.
    bool IsBefore() const { return entered; }

#ifdef __x86_64__
    /// Returns the number of the system call at which the process stands.
    long Call() const
    {
        return static_cast<long>(Registers().orig_rax);
    }

    /// Whether the process stands before the writing of more than one byte.
    bool IsBeforeWrite() const
    {
        const user_regs_struct registers = Registers();
        const bool writes = registers.orig_rax == SYS_write || registers.orig_rax == SYS_writev;
        return entered && writes && SizeOfWrite(registers) > 1;
    }

    /// Makes the system write only the first half of what the process asks for.
    void HalveWrite()
    {
        user_regs_struct registers = Registers();
        const std::size_t half = SizeOfWrite(registers) / 2;
        if (registers.orig_rax == SYS_write) {
            registers.rdx = half;
            ptrace(PTRACE_SETREGS, child, nullptr, &registers);
        } else {
            ptrace(PTRACE_POKEDATA, child, LengthOfLastPiece(registers), half);
        }
    }
#endif

    /// Whether the process came to its end by itself, and well.
    bool HasSucceeded() const
    {
        return ended && WIFEXITED(status) && WEXITSTATUS(status) == 0;
    }

private:
#ifdef __x86_64__
    user_regs_struct Registers() const
    {
        user_regs_struct registers{};
        ptrace(PTRACE_GETREGS, child, nullptr, &registers);
        return registers;
    }

    /// A stream writes what it has buffered and then the text itself: the last piece is the text.
    static std::size_t LengthOfLastPiece(const user_regs_struct& registers)
    {
        return registers.rsi + (registers.rdx - 1) * sizeof(iovec) + offsetof(iovec, iov_len);
    }

    std::size_t SizeOfWrite(const user_regs_struct& registers) const
    {
        if (registers.orig_rax == SYS_write) {
            return registers.rdx;
        }
        return static_cast<std::size_t>(
            ptrace(PTRACE_PEEKDATA, child, LengthOfLastPiece(registers), nullptr));
    }
#endif

    void RunToStop()
    {
        do {
            if (ptrace(PTRACE_SYSCALL, child, nullptr, nullptr) != 0) {
                throw std::runtime_error("cannot trace");
            }
            AwaitStop();
        } while (!ended && WSTOPSIG(status) != (SIGTRAP | 0x80));
        entered = !entered;
    }

    bool IsHarmless() const
    {
#ifdef __x86_64__
        return Registers().orig_rax == SYS_getrandom;
#else
        return false;
#endif
    }

    void AwaitStop()
    {
        if (waitpid(child, &status, 0) != child) {
            throw std::runtime_error("no child process");
        }
        ended = WIFEXITED(status) || WIFSIGNALED(status);
    }

    pid_t child = -1;
    int status = 0;
    bool ended = false;
    bool entered = false;
};

/// Runs the work once for each of its system calls, killed before it and after it, and once for
/// each that writes, killed in its middle; `examine` looks at what each of them has left behind.
///
/// @return how often the work was killed
inline std::size_t KillAtEachStep(const std::function<void()>& prepare,
                                  const std::function<void()>& work,
                                  const std::function<void()>& examine)
{
    std::size_t kills = 0;
    for (std::size_t stop = 1;; ++stop) {
        bool writes = false;
        for (const bool halved : {false, true}) {
            if (halved && !writes) {
                continue;
            }
            prepare();
            {
                VTracedProcess process(work);
                for (std::size_t step = 0; step < stop; ++step) {
                    if (!process.Step()) {
                        return process.HasSucceeded() ? kills : 0;
                    }
                }
#ifdef __x86_64__
                writes = process.IsBeforeWrite();
                if (halved) {
                    process.HalveWrite();
                    process.Step();
                }
#endif
            }
            ++kills;
            examine();
        }
    }
}

} // namespace TestSupport
