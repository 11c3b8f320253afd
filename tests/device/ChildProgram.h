#pragma once

#include "support/HostProcess.h"

#include <climits>
#include <string>
#include <vector>

#include <sys/ioctl.h>

/// How a program ended, and what it wrote.
struct VOutcome
{
    int ExitCode = -1; ///< 128 and the number of the signal where one ended it
    std::string Output;
    std::string Errors;
};

/// A korva-control that runs beside the test. One that is left over is killed.
///
/// Threads: the test's.
class VChildProgram
{
public:
    enum class EOutput { Read, NotRead };

    /// @param arguments  behind the program's name
    /// @param input      what its standard input holds
    /// @param reading    whether its standard output is read, or fills the pipe
    explicit VChildProgram(std::vector<std::string> arguments, const std::string& input = "",
                           EOutput reading = EOutput::Read)
    {
        arguments.insert(arguments.begin(), KORVA_CONTROL_PROGRAM);
        int inputPipe[2], outputPipe[2], errorPipe[2];
        if (pipe2(inputPipe, O_CLOEXEC) != 0 || pipe2(outputPipe, O_CLOEXEC) != 0 ||
            pipe2(errorPipe, O_CLOEXEC) != 0) {
            throw std::runtime_error("no pipe");
        }
        Start(arguments, inputPipe[0], outputPipe[1], errorPipe[1]);
        close(inputPipe[0]);
        close(outputPipe[1]);
        close(errorPipe[1]);
        if (reading == EOutput::Read) {
            output.emplace(outputPipe[0]);
        } else {
            unreadOutput = outputPipe[0];
        }
        errors.emplace(errorPipe[0]);
        std::signal(SIGPIPE, SIG_IGN); // a program need not read its input
        [[maybe_unused]] const ssize_t written = write(inputPipe[1], input.data(), input.size());
        close(inputPipe[1]);
    }

    ~VChildProgram()
    {
        if (pid > 0) {
            kill(pid, SIGKILL);
            waitpid(pid, nullptr, 0);
        }
        if (unreadOutput >= 0) {
            close(unreadOutput);
        }
    }

    VChildProgram(const VChildProgram&) = delete;
    VChildProgram& operator=(const VChildProgram&) = delete;

    std::optional<std::string> ReadLine() { return output->TakeLine(TestSupport::hostLimit); }

    bool WaitForError(const std::string& text)
    {
        return errors->WaitFor(text, TestSupport::hostLimit);
    }

    /// Returns what came on standard error so far.
    std::string Errors() const { return errors->Text(); }

    void Signal(int signal) const { kill(pid, signal); }

    /// Stops the whole process as Ctrl-Z does, and lets it go on.
    void SuspendForAMoment() const
    {
        kill(pid, SIGSTOP);
        siginfo_t information{};
        waitid(P_PID, static_cast<id_t>(pid), &information, WSTOPPED);
        kill(pid, SIGCONT);
        waitid(P_PID, static_cast<id_t>(pid), &information, WCONTINUED);
    }

    /// Waits until an output that is not read takes no more.
    void WaitUntilOutputIsFull() const
    {
        const int capacity = fcntl(unreadOutput, F_GETPIPE_SZ);
        const auto deadline = std::chrono::steady_clock::now() + TestSupport::hostLimit;
        for (int waiting = 0; waiting < capacity - PIPE_BUF;) {
            if (std::chrono::steady_clock::now() > deadline ||
                ioctl(unreadOutput, FIONREAD, &waiting) != 0) {
                throw std::runtime_error("the output did not fill");
            }
            std::this_thread::yield();
        }
    }

    /// Whether the program has ended; its exit code stays for Finish.
    bool HasEnded() const
    {
        siginfo_t information{};
        return waitid(P_PID, static_cast<id_t>(pid), &information, WEXITED | WNOHANG | WNOWAIT) ==
                   0 &&
               information.si_pid == pid;
    }

    /// Waits for the end and returns what has not been read before.
    VOutcome Finish()
    {
        VOutcome outcome;
        outcome.Output = output ? Rest(*output) : std::string();
        outcome.Errors = Rest(*errors);
        int status = 0;
        waitpid(pid, &status, 0); // its outputs have ended, so that it has too, or is about to
        pid = -1;
        outcome.ExitCode = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
        return outcome;
    }

private:
    void Start(std::vector<std::string>& words, int input, int out, int error)
    {
        std::vector<char*> arguments;
        arguments.reserve(words.size() + 1);
        for (std::string& word : words) {
            arguments.push_back(word.data());
        }
        arguments.push_back(nullptr);
        pid = fork();
        if (pid == 0) {
            // Between fork and exec only what a signal handler may do.
            prctl(PR_SET_PDEATHSIG, SIGKILL);
            std::signal(SIGINT, SIG_DFL); // ignored where a shell runs the tests in the background
            dup2(input, STDIN_FILENO);
            dup2(out, STDOUT_FILENO);
            dup2(error, STDERR_FILENO);
            execv(arguments[0], arguments.data());
            _exit(127);
        }
        if (pid < 0) {
            throw std::runtime_error("no process");
        }
    }

    static std::string Rest(TestSupport::VPipeCollector& collector)
    {
        std::string text;
        while (const auto line = collector.TakeLine(TestSupport::hostLimit)) {
            text += *line + "\n";
        }
        return text + collector.Text();
    }

    pid_t pid = -1;
    int unreadOutput = -1;
    std::optional<TestSupport::VPipeCollector> output;
    std::optional<TestSupport::VPipeCollector> errors;
};

/// Runs the program to its end.
inline VOutcome RunProgram(const std::vector<std::string>& arguments, const std::string& input = "")
{
    return VChildProgram(arguments, input).Finish();
}
