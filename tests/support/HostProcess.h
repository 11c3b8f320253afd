#pragma once

#include "support/TemporaryFolder.h"
#include "utils/Mutex.h"

#include <cerrno>
#include <chrono>
#include <condition_variable>
#include <csignal>
#include <cstddef>
#include <cstring>
#include <fcntl.h>
#include <optional>
#include <poll.h>
#include <stdexcept>
#include <string>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <utility>
#include <vector>

namespace TestSupport {

/// How long a test waits for what is sure to come. Under a sanitizer, on a busy machine, a host may
/// take many seconds over what is done at once otherwise.
constexpr std::chrono::milliseconds hostLimit{60000};

/// Collects what comes out of a pipe, so that the writer never waits for a test.
class VPipeCollector
{
public:
    /// Takes over the descriptor.
    explicit VPipeCollector(int descriptor) : descriptor(descriptor), thread([this] { Collect(); })
    {
    }

    /// Waits for the end of the pipe: every writer has gone.
    ~VPipeCollector()
    {
        thread.join();
        close(descriptor);
    }

    VPipeCollector(const VPipeCollector&) = delete;
    VPipeCollector& operator=(const VPipeCollector&) = delete;

    /// Returns everything so far, but what TakeLine took.
    std::string Text() const
    {
        const KVR::VMutexLock lock(mutex);
        return text;
    }

    /// Takes the first line. @return empty when none came within the limit, or none will
    std::optional<std::string> TakeLine(std::chrono::milliseconds limit)
    {
        const auto deadline = std::chrono::steady_clock::now() + limit;
        KVR::VMutexLock lock(mutex);
        while (text.find('\n') == std::string::npos) {
            if (ended || changed.wait_until(lock.Inner(), deadline) == std::cv_status::timeout) {
                return std::nullopt;
            }
        }
        const std::size_t end = text.find('\n');
        std::string line = text.substr(0, end);
        text.erase(0, end + 1);
        return line;
    }

    /// @return false when the text did not come within the limit, or will not
    bool WaitFor(const std::string& wanted, std::chrono::milliseconds limit)
    {
        const auto deadline = std::chrono::steady_clock::now() + limit;
        KVR::VMutexLock lock(mutex);
        while (text.find(wanted) == std::string::npos) {
            if (ended || changed.wait_until(lock.Inner(), deadline) == std::cv_status::timeout) {
                return text.find(wanted) != std::string::npos;
            }
        }
        return true;
    }

    /// Waits until every writer has gone.
    void AwaitEnd(std::chrono::milliseconds limit)
    {
        const auto deadline = std::chrono::steady_clock::now() + limit;
        KVR::VMutexLock lock(mutex);
        while (!ended && changed.wait_until(lock.Inner(), deadline) != std::cv_status::timeout) {
        }
    }

private:
    void Collect()
    {
        char bytes[65536];
        for (;;) {
            const ssize_t count = read(descriptor, bytes, sizeof bytes);
            if (count < 0 && errno == EINTR) {
                continue;
            }
            const KVR::VMutexLock lock(mutex);
            if (count > 0) {
                text.append(bytes, static_cast<std::size_t>(count));
            } else {
                ended = true;
            }
            changed.notify_all();
            if (ended) {
                return;
            }
        }
    }

    const int descriptor;
    mutable KVR::VMutex mutex;
    std::condition_variable changed;
    std::string text KVR_GUARDED_BY(mutex);
    bool ended KVR_GUARDED_BY(mutex) = false;
    std::thread thread;
};

/// A quorix-host process of a test, in the test's own network.
///
/// Its console is driven from here, one line and one answer at a time. Everything has a time limit,
/// and a process that is left over is killed. Threads: one, the test's.
class VHostProcess
{
public:
    /// Starts the host.
    ///
    /// @param arguments  of the host
    /// @param launcher   a program with its arguments that runs the host in its own place, such as
    /// {"setpriv", "--reuid", "1000"}
    /// @param program    a copy of the host elsewhere
    explicit VHostProcess(std::vector<std::string> arguments = {"--headless", "--console"},
                          std::vector<std::string> launcher = {},
                          const std::string& program = Program())
    {
        std::vector<std::string> words = std::move(launcher);
        words.push_back(program);
        words.insert(words.end(), arguments.begin(), arguments.end());
        Spawn(words);
    }

    ~VHostProcess()
    {
        if (!exitCode && !WaitExit(std::chrono::milliseconds(0))) {
            kill(pid, SIGKILL);
            WaitExit(hostLimit);
        }
        CloseInput();
    }

    VHostProcess(const VHostProcess&) = delete;
    VHostProcess& operator=(const VHostProcess&) = delete;

    /// Returns the program that the tests were built with.
    static std::string Program() { return QUORIX_HOST_PROGRAM; }

    pid_t Pid() const { return pid; }

    /// Waits for the line that tells that the plug-in has started.
    bool WaitReady() { return ReadLine() == "ready"; }

    /// Sends a line to the console. @return its answer, or a text in brackets when none came
    std::string Command(const std::string& line)
    {
        if (!SendLine(line)) {
            return "(the host took no line)";
        }
        return ReadLine().value_or("(no answer)");
    }

    /// Sends a line and leaves the answer for ReadLine.
    bool SendLine(const std::string& line) { return SendBytes(line + '\n'); }

    /// Sends bytes to the console. @return false when the host did not take them within the limit
    bool SendBytes(const std::string& bytes, std::chrono::milliseconds limit = hostLimit)
    {
        const auto deadline = std::chrono::steady_clock::now() + limit;
        for (std::size_t sent = 0; sent < bytes.size();) {
            const ssize_t count = write(input, bytes.data() + sent, bytes.size() - sent);
            if (count > 0) {
                sent += static_cast<std::size_t>(count);
                continue;
            }
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
                deadline - std::chrono::steady_clock::now());
            pollfd writable = {input, POLLOUT, 0};
            if ((errno != EAGAIN && errno != EINTR) || left.count() <= 0 ||
                poll(&writable, 1, static_cast<int>(left.count())) == 0) {
                return false;
            }
        }
        return true;
    }

    /// Returns the next line of standard output, empty when none came within the limit.
    std::optional<std::string> ReadLine(std::chrono::milliseconds limit = hostLimit)
    {
        return output->TakeLine(limit);
    }

    /// Ends the console's input.
    void CloseInput()
    {
        if (input >= 0) {
            close(input);
            input = -1;
        }
    }

    /// Returns what the host has written to standard error so far; all of it after WaitExit. What a
    /// running host must say is for WaitForError.
    std::string Errors() const { return errors->Text(); }

    /// @return false when the text did not appear on standard error within the limit
    bool WaitForError(const std::string& text, std::chrono::milliseconds limit = hostLimit)
    {
        return errors->WaitFor(text, limit);
    }

    void Signal(int signal) const { kill(pid, signal); }

    /// Waits for the end of the process.
    ///
    /// @return its exit code, or 128 and the number of the signal that ended it; empty when it
    /// still runs at the end of the limit
    std::optional<int> WaitExit(std::chrono::milliseconds limit = hostLimit)
    {
        if (exitCode) {
            return exitCode;
        }
        pollfd ended = {processDescriptor, POLLIN, 0};
        if (poll(&ended, 1, static_cast<int>(limit.count())) != 1) {
            return std::nullopt;
        }
        int status = 0;
        waitpid(pid, &status, 0);
        close(processDescriptor);
        exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
        output->AwaitEnd(hostLimit);
        errors->AwaitEnd(hostLimit);
        return exitCode;
    }

private:
    /// A pipe whose ends are not inherited by programs that the test starts meanwhile.
    struct VPipe
    {
        VPipe()
        {
            if (pipe2(ends, O_CLOEXEC) != 0) {
                throw std::runtime_error("no pipe");
            }
        }
        int ends[2] = {-1, -1}; // to read from, to write to
    };

    /// Returns the test's environment with folders of the host's own for data and caches, so that
    /// nothing that one host remembers is met by another. Anybody may write to them, as a host may
    /// be another user.
    std::vector<std::string> Environment() const
    {
        chmod(dataHome.Path().c_str(), 0777);
        chmod(cacheHome.Path().c_str(), 0777);
        std::vector<std::string> settings{"XDG_DATA_HOME=" + dataHome.Path(),
                                          "XDG_CACHE_HOME=" + cacheHome.Path()};
        for (char** setting = environ; *setting != nullptr; ++setting) {
            if (std::strncmp(*setting, "XDG_DATA_HOME=", 14) != 0 &&
                std::strncmp(*setting, "XDG_CACHE_HOME=", 15) != 0) {
                settings.emplace_back(*setting);
            }
        }
        return settings;
    }

    void Spawn(std::vector<std::string>& words)
    {
        std::vector<char*> arguments;
        for (std::string& word : words) {
            arguments.push_back(word.data());
        }
        arguments.push_back(nullptr);
        const std::vector<std::string> settings = Environment();
        std::vector<char*> environment;
        for (const std::string& setting : settings) {
            environment.push_back(const_cast<char*>(setting.data())); // as the call has it
        }
        environment.push_back(nullptr);
        const VPipe inputPipe, outputPipe, errorPipe;

        pid = fork();
        if (pid == 0) {
            // Between fork and exec only what a signal handler may do.
            prctl(PR_SET_PDEATHSIG, SIGKILL);
            std::signal(SIGINT, SIG_DFL); // ignored where a shell runs the tests in the background
            dup2(inputPipe.ends[0], STDIN_FILENO);
            dup2(outputPipe.ends[1], STDOUT_FILENO);
            dup2(errorPipe.ends[1], STDERR_FILENO);
            execvpe(arguments[0], arguments.data(), environment.data());
            _exit(127);
        }
        if (pid < 0) {
            throw std::runtime_error("no process");
        }
        processDescriptor = static_cast<int>(syscall(SYS_pidfd_open, pid, 0));
        close(inputPipe.ends[0]);
        close(outputPipe.ends[1]);
        close(errorPipe.ends[1]);
        input = inputPipe.ends[1];
        fcntl(input, F_SETFL, O_NONBLOCK);
        // A host that has gone is told by a result.
        std::signal(SIGPIPE, SIG_IGN);
        output.emplace(outputPipe.ends[0]);
        errors.emplace(errorPipe.ends[0]);
    }

    const VTemporaryFolder dataHome;  // gone after the process
    const VTemporaryFolder cacheHome; // likewise
    pid_t pid = -1;
    int processDescriptor = -1; // becomes readable when the process ends
    int input = -1;
    std::optional<VPipeCollector> output;
    std::optional<VPipeCollector> errors;
    std::optional<int> exitCode;
};

} // namespace TestSupport
