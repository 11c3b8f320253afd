#include "DebugServices/CrashHandlerForThread.h"

#include "DebugServices/CrashReport.h"

#include <csignal>
#include <sys/mman.h>
#include <unistd.h>

#include <atomic>
#include <cstddef>
#include <mutex>

namespace DebugServices {

namespace {

struct VHeardSignal
{
    int Number;
    bool Installed; // our handler was put in place, since nobody else had one
};

/// How many threads are guarded, and with it whether the handlers are in place: their place is the
/// process's, not the thread's.
struct VProcessState
{
    std::mutex mutex; // a leaf; never taken by the handler
    int guardedThreads = 0;
    VHeardSignal signals[5] = {
        {SIGSEGV, false}, {SIGBUS, false}, {SIGFPE, false}, {SIGILL, false}, {SIGABRT, false}};
};

VProcessState& ProcessState()
{
    static VProcessState& state = *new VProcessState; // threads may outlive static objects
    return state;
}

/// The stack on which the calling thread's crash is reported, with an inaccessible page below it.
struct VAlternateStack
{
    void* Memory = nullptr;
    std::size_t Size = 0;
    stack_t Previous = {};
};

/// What the handler knows of its thread. In the static part of thread storage, since a signal
/// handler must not be the one who makes the thread's part of it.
struct VThreadState
{
    int depth;
    VAlternateStack* stack;
};
__attribute__((tls_model("initial-exec"))) thread_local VThreadState threadState = {0, nullptr};

/// The thread whose crash is being reported, 0 if there is none.
std::atomic<pid_t> reportingThread{0};

/// Ends the process as if no handler had ever been there.
[[noreturn]] void EndBySignal(int number)
{
    struct sigaction action = {};
    action.sa_handler = SIG_DFL;
    sigaction(number, &action, nullptr);

    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, number);
    pthread_sigmask(SIG_UNBLOCK, &signals, nullptr);
    raise(number);
    _exit(128 + number); // only if the process was made deaf to the signal meanwhile
}

/// Gives the thread that reports already some seconds to end the process.
void WaitForOtherReport()
{
    for (int i = 0; i < 100; ++i) {
        const timespec tenthOfSecond = {0, 100000000};
        nanosleep(&tenthOfSecond, nullptr);
    }
}

void OnCrash(int number, siginfo_t* information, void* /*context*/)
{
    // The handlers are the process's, so they also hear the threads that nobody guards.
    if (threadState.depth == 0) {
        EndBySignal(number);
    }

    pid_t reporting = 0;
    if (reportingThread.compare_exchange_strong(reporting, gettid())) {
        WriteCrashReport(number, information->si_addr);
    } else if (reporting != gettid()) {
        WaitForOtherReport();
    } // else this thread crashed in its own report
    EndBySignal(number);
}

bool HasDefaultAction(const struct sigaction& action)
{
    return (action.sa_flags & SA_SIGINFO) == 0 && action.sa_handler == SIG_DFL;
}

bool IsOurs(const struct sigaction& action)
{
    return (action.sa_flags & SA_SIGINFO) != 0 && action.sa_sigaction == &OnCrash;
}

void AddGuardedThread()
{
    VProcessState& state = ProcessState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    if (state.guardedThreads++ > 0) {
        return;
    }

    for (VHeardSignal& signal : state.signals) {
        struct sigaction present = {};
        if (sigaction(signal.Number, nullptr, &present) != 0 || !HasDefaultAction(present)) {
            continue; // a sanitizer's or the host's own: their report is the one that is awaited
        }
        struct sigaction action = {};
        action.sa_sigaction = &OnCrash;
        action.sa_flags = SA_SIGINFO | SA_ONSTACK;
        sigemptyset(&action.sa_mask);
        signal.Installed = sigaction(signal.Number, &action, nullptr) == 0;
    }
}

void RemoveGuardedThread()
{
    VProcessState& state = ProcessState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    if (--state.guardedThreads > 0) {
        return;
    }

    for (VHeardSignal& signal : state.signals) {
        struct sigaction present = {};
        // Who has put a handler over ours since then keeps it.
        if (signal.Installed && sigaction(signal.Number, nullptr, &present) == 0 &&
            IsOurs(present)) {
            struct sigaction action = {};
            action.sa_handler = SIG_DFL;
            sigaction(signal.Number, &action, nullptr);
        }
        signal.Installed = false;
    }
}

/// Gives the thread a stack for its report. A stack overflow leaves no room for one on its own.
VAlternateStack* MakeAlternateStack()
{
    constexpr std::size_t stackSize =
        std::size_t{128} * 1024; // taken from the system only when it is used
    const auto pageSize = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
    const std::size_t size = stackSize + pageSize;

    void* const memory =
        mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (memory == MAP_FAILED) {
        return nullptr;
    }
    (void)mprotect(memory, pageSize, PROT_NONE);

    stack_t next = {};
    next.ss_sp = static_cast<char*>(memory) + pageSize;
    next.ss_size = stackSize;
    stack_t previous = {};
    if (sigaltstack(&next, &previous) != 0) {
        munmap(memory, size);
        return nullptr;
    }
    return new VAlternateStack{memory, size, previous};
}

void ReleaseAlternateStack(VAlternateStack* stack)
{
    if (stack == nullptr) {
        return;
    }
    // A sanitizer gives each thread such a stack too, and takes it back when the thread ends.
    (void)sigaltstack(&stack->Previous, nullptr);
    munmap(stack->Memory, stack->Size);
    delete stack;
}

} // namespace

VCrashHandlerForThread::VCrashHandlerForThread()
{
    if (threadState.depth == 0) {
        PrepareCrashReport();
        threadState.stack = MakeAlternateStack();
        AddGuardedThread();
    }
    ++threadState.depth;
}

VCrashHandlerForThread::~VCrashHandlerForThread()
{
    --threadState.depth;
    if (threadState.depth == 0) {
        RemoveGuardedThread();
        ReleaseAlternateStack(threadState.stack);
        threadState.stack = nullptr;
    }
}

} // namespace DebugServices
