#include "HostProcess.h"

#include "DeviceConnection.h"
#include "Processes.h"
#include "Statistics.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>
#include <stdexcept>
#include <system_error>

namespace ControlStreamBenchmark {

namespace {

// An event of the size of those that cameras cause.
constexpr const char* fireLine =
    "fire Event.DeviceSettingChanged Name=StrobeIntensity Device=qx:1 Value=0.5\n";

constexpr int wantedPipeBytes = 1 << 20;
constexpr double startSeconds = 30;
constexpr double stopSeconds = 20;
constexpr double answerSeconds = 60;

[[noreturn]] void ThrowErrno(const char* what)
{
    throw std::system_error(errno, std::generic_category(), what);
}

std::string EndOfFile(const std::string& path)
{
    constexpr std::size_t shown = 2000;
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    const std::string all = text.str();
    return all.substr(all.size() - std::min(all.size(), shown));
}

/// What the child does between fork and the host's own main.
[[noreturn]] void BecomeHost(const std::string& program, const std::string& folder, int input,
                             int output, const std::vector<std::string>& environment)
{
    const int errors =
        open((folder + "/errors").c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    std::signal(SIGPIPE, SIG_DFL);    // the benchmark ignores it, and a host begins as from a shell
    prctl(PR_SET_PDEATHSIG, SIGTERM); // a benchmark that is interrupted leaves no host behind
    dup2(input, STDIN_FILENO);
    dup2(output, STDOUT_FILENO);
    dup2(errors, STDERR_FILENO);
    for (const std::string& variable : environment) {
        putenv(const_cast<char*>(variable.c_str()));
    }
    execl(program.c_str(), program.c_str(), "--headless", "--console", "--data",
          (folder + "/data").c_str(), nullptr);
    _exit(127);
}

} // namespace

VHostProcess::VHostProcess(const std::string& program, const std::vector<std::string>& environment)
{
    if (CanConnect(controlPort)) {
        throw std::runtime_error("something answers on port " + std::to_string(controlPort) +
                                 " already; run this in a network namespace of its own");
    }
    std::string name = std::filesystem::temp_directory_path() / "quorix-benchmark-XXXXXX";
    if (mkdtemp(name.data()) == nullptr) {
        ThrowErrno("mkdtemp");
    }
    folder = name;
    try {
        Start(program, environment);
        AwaitReady();
    } catch (...) {
        Stop();
        throw;
    }
}

VHostProcess::~VHostProcess()
{
    Stop();
}

std::size_t VHostProcess::MaximalCount() const
{
    // Lines and answers must fit the pipes, since nobody reads answers while events are received.
    return pipeBytes / std::string(fireLine).size() - 1;
}

void VHostProcess::Fire(std::size_t count)
{
    std::string lines;
    for (std::size_t index = 0; index < count; ++index) {
        lines += fireLine;
    }
    awaitedAnswers += count;
    WriteConsole(lines);
}

void VHostProcess::AwaitFired()
{
    for (; awaitedAnswers > 0; --awaitedAnswers) {
        const std::string answer = ReadLine(answerSeconds);
        if (answer.rfind("ok", 0) != 0) {
            throw std::runtime_error("the host did not fire an event: " + answer);
        }
    }
}

void VHostProcess::Start(const std::string& program, const std::vector<std::string>& environment)
{
    std::array<int, 2> input{};
    std::array<int, 2> output{};
    if (pipe2(input.data(), O_CLOEXEC) != 0 || pipe2(output.data(), O_CLOEXEC) != 0) {
        ThrowErrno("pipe2");
    }
    // Best effort: the size that is really there is asked for below.
    fcntl(input[1], F_SETPIPE_SZ, wantedPipeBytes);
    fcntl(output[1], F_SETPIPE_SZ, wantedPipeBytes);
    pipeBytes = static_cast<std::size_t>(
        std::min(fcntl(input[1], F_GETPIPE_SZ), fcntl(output[1], F_GETPIPE_SZ)));
    process = fork();
    if (process == 0) {
        BecomeHost(program, folder, input[0], output[1], environment);
    }
    close(input[0]);
    close(output[1]);
    console = input[1];
    answers = output[0];
    if (process < 0) {
        process = 0;
        ThrowErrno("fork");
    }
}

void VHostProcess::AwaitReady()
{
    if (ReadLine(startSeconds) != "ready\n") {
        Fail("the host did not become ready");
    }
    if (!CanConnect(controlPort)) {
        Fail("the host does not answer on port " + std::to_string(controlPort));
    }
}

void VHostProcess::Stop()
{
    if (process != 0) {
        const std::string quit = "quit\n";
        const bool asked = write(console, quit.data(), quit.size()) > 0;
        if (!AwaitEnd(process, stopSeconds) || !asked) {
            std::cerr << "the host did not end in order; the end of its log:\n"
                      << EndOfFile(folder + "/errors") << std::endl;
        }
        process = 0;
    }
    for (int* descriptor : {&console, &answers}) {
        if (*descriptor >= 0) {
            close(*descriptor);
            *descriptor = -1;
        }
    }
    std::error_code ignored; // a folder that stays in /tmp harms nobody
    std::filesystem::remove_all(folder, ignored);
}

std::string VHostProcess::ReadLine(double seconds)
{
    const std::int64_t limit = NowNanoseconds() + static_cast<std::int64_t>(seconds * 1e9);
    for (;;) {
        if (const std::size_t end = unread.find('\n'); end != std::string::npos) {
            std::string line = unread.substr(0, end + 1);
            unread.erase(0, end + 1);
            return line;
        }
        const std::int64_t milliseconds = (limit - NowNanoseconds()) / 1'000'000;
        pollfd wait{answers, POLLIN, 0};
        if (milliseconds <= 0 || poll(&wait, 1, static_cast<int>(milliseconds)) == 0) {
            Fail("the host's console is silent");
        }
        std::array<char, 65536> buffer{};
        const ssize_t size = read(answers, buffer.data(), buffer.size());
        if (size == 0) {
            Fail("the host has ended");
        }
        if (size > 0) {
            unread.append(buffer.data(), static_cast<std::size_t>(size));
        }
    }
}

void VHostProcess::WriteConsole(const std::string& text) const
{
    for (std::size_t written = 0; written < text.size();) {
        const ssize_t size = write(console, text.data() + written, text.size() - written);
        if (size < 0 && errno != EINTR) {
            Fail("the host reads no console");
        }
        written += size > 0 ? static_cast<std::size_t>(size) : 0;
    }
}

void VHostProcess::Fail(const std::string& reason) const
{
    throw std::runtime_error(reason + "; the end of its log:\n" + EndOfFile(folder + "/errors"));
}

} // namespace ControlStreamBenchmark
