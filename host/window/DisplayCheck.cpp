#include "window/DisplayCheck.h"

#include <QGuiApplication>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace QuorixHost {
namespace {

using VClock = std::chrono::steady_clock;

// What the copy says last where a window can come up. Not its exit code: a process that was started
// with its children ignored would not learn of that.
constexpr char success = '\0';

// Of the copy that tries: Qt's message handler can be told nothing but through static objects.
int reasonDescriptor = -1;
bool isReasonKnown = false;

/// Tells the parent the first thing that Qt has to say of the platform, and ends where Qt would
/// abort.
void OnMessage(QtMsgType type, const QMessageLogContext& context, const QString& text)
{
    if (!isReasonKnown && context.category != nullptr &&
        std::strncmp(context.category, "qt.qpa", 6) == 0) {
        const std::string reason = text.trimmed().toStdString();
        isReasonKnown = write(reasonDescriptor, reason.data(), reason.size()) > 0;
    }
    if (type == QtFatalMsg) {
        _exit(1);
    }
}

[[noreturn]] void TryPlatform(int descriptor)
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    const rlimit noCore = {0, 0};
    setrlimit(RLIMIT_CORE, &noCore);
    reasonDescriptor = descriptor;
    qInstallMessageHandler(&OnMessage);

    char name[] = "quorix-host";
    char* arguments[] = {name, nullptr};
    int argumentCount = 1;
    new QGuiApplication(argumentCount, arguments); // never destroyed: the process ends with it
    _exit(write(descriptor, &success, 1) == 1 ? 0 : 1);
}

/// Reads to the end of a pipe. @return nothing when that has not come within the limit
std::optional<std::string> ReadToEnd(int descriptor, std::chrono::milliseconds limit)
{
    const auto deadline = VClock::now() + limit;
    std::string text;
    for (;;) {
        const auto left =
            std::chrono::duration_cast<std::chrono::milliseconds>(deadline - VClock::now());
        pollfd readable = {descriptor, POLLIN, 0};
        const int ready = poll(&readable, 1, left.count() > 0 ? static_cast<int>(left.count()) : 0);
        if (ready == 0) {
            return std::nullopt;
        }
        char part[512];
        const ssize_t count = ready > 0 ? read(descriptor, part, sizeof part) : -1;
        if (count == 0) {
            return text;
        }
        if (count > 0) {
            text.append(part, static_cast<std::size_t>(count));
        } else if (errno != EINTR) {
            return text;
        }
    }
}

void AwaitEnd(pid_t child)
{
    while (waitpid(child, nullptr, 0) < 0 && errno == EINTR) {
    }
}

} // namespace

std::optional<std::string> DescribeMissingDisplay(std::chrono::milliseconds limit)
{
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) {
        return std::nullopt; // Qt itself will have to find out
    }
    const pid_t child = fork();
    if (child == 0) {
        TryPlatform(ends[1]);
    }
    close(ends[1]);
    if (child < 0) {
        close(ends[0]);
        return std::nullopt;
    }

    const std::optional<std::string> reason = ReadToEnd(ends[0], limit);
    close(ends[0]);
    if (!reason) {
        kill(child, SIGKILL);
    }
    AwaitEnd(child);
    if (!reason) {
        return "the display does not answer";
    }
    if (reason->empty()) {
        return "Qt gives no reason";
    }
    return reason->back() == success ? std::nullopt : reason;
}

} // namespace QuorixHost
