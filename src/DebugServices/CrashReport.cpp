#include "DebugServices/CrashReport.h"

#include "DebugServices/ThreadNameText.h"

#include <csignal>
#include <execinfo.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace DebugServices {

namespace {

void Write(const char* text)
{
    std::size_t left = strlen(text);
    while (left > 0) {
        const ssize_t written = write(STDERR_FILENO, text, left);
        if (written <= 0) {
            return; // standard error is gone, and the process ends anyway
        }
        text += written;
        left -= static_cast<std::size_t>(written);
    }
}

void WriteNumber(std::uintptr_t number, unsigned base)
{
    char digits[3 * sizeof number]; // more than the decimal digits and the zero
    std::size_t position = sizeof digits;
    digits[--position] = '\0';
    do {
        digits[--position] = "0123456789abcdef"[number % base];
        number /= base;
    } while (number > 0);
    Write(digits + position);
}

const char* SignalName(int number)
{
    switch (number) {
    case SIGSEGV:
        return "SIGSEGV";
    case SIGBUS:
        return "SIGBUS";
    case SIGFPE:
        return "SIGFPE";
    case SIGILL:
        return "SIGILL";
    case SIGABRT:
        return "SIGABRT";
    default:
        return "signal";
    }
}

void WriteThreadName()
{
    const char* name = ThreadNameText();
    char kernelName[16] = ""; // the kernel's length and the zero
    if (name == nullptr) {
        (void)prctl(PR_GET_NAME, kernelName);
        name = kernelName;
    }
    Write(name);
}

} // namespace

void PrepareCrashReport()
{
    // The first trace of a process loads the unwinder, which allocates.
    void* frame = nullptr;
    (void)backtrace(&frame, 1);
}

void WriteCrashReport(int number, const void* address)
{
    Write("\nThread \"");
    WriteThreadName();
    Write("\" crashed: ");
    Write(SignalName(number));
    Write(" (");
    WriteNumber(static_cast<std::uintptr_t>(number), 10);
    Write(")");
    if (number != SIGABRT) {
        Write(" at address 0x");
        WriteNumber(reinterpret_cast<std::uintptr_t>(address), 16);
    }
    Write("\n");

    constexpr int mostFrames = 64;
    void* frames[mostFrames];
    const int count = backtrace(frames, mostFrames);
    backtrace_symbols_fd(frames, count, STDERR_FILENO);
    Write("End of the stack trace\n");
}

} // namespace DebugServices
