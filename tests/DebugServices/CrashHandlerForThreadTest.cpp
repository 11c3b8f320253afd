#include "DebugServices/CrashHandlerForThread.h"

#include "DebugServices/NoCoreFile.h"
#include "DebugServices/ThreadName.h"

#include <gmock/gmock.h>

#include <csignal>
#include <functional>
#include <future>
#include <stdexcept>
#include <thread>
#include <vector>

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define UNDER_SANITIZER 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define UNDER_SANITIZER 1
#endif
#endif

using DebugServices::VCrashHandlerForThread;
using testing::AllOf;
using testing::ContainsRegex;
using testing::HasSubstr;
using testing::KilledBySignal;
using testing::Not;

namespace {

/// Runs a function on a named thread and waits for it, if it comes back.
void RunOnThread(const char* name, const std::function<void()>& function)
{
    NoCoreFile();
    std::thread([&] {
        DebugServices::SetThreadName(name);
        function();
    }).join();
}

/// The same with the thread guarded.
void RunGuarded(const char* name, const std::function<void()>& function)
{
    RunOnThread(name, [&] {
        const VCrashHandlerForThread crashHandler;
        function();
    });
}

/// What a report has: the thread, the signal, and frames that name this program.
auto IsReport(const std::string& thread, const std::string& signal)
{
    return AllOf(HasSubstr("Thread \"" + thread + "\" crashed: " + signal),
                 ContainsRegex("DebugServicesTest.*\\[0x[0-9a-f]+\\]"),
                 HasSubstr("End of the stack trace"));
}

bool IsDefault(int signal)
{
    struct sigaction action = {};
    return sigaction(signal, nullptr, &action) == 0 && action.sa_handler == SIG_DFL;
}

/// Reads where no memory is.
void ReadBadAddress()
{
    volatile auto address = std::uintptr_t{0x10};
    // NOLINTNEXTLINE(performance-no-int-to-ptr): no object has this address, which is the point
    (void)*reinterpret_cast<volatile int*>(address);
}

#if !defined(UNDER_SANITIZER)
/// Uses up any stack, without the compiler's making a loop of it.
__attribute__((noinline)) int OverflowStack(volatile char* caller)
{
    volatile char frame[4096];
    frame[0] = *caller;
    return frame[0] == 1 ? 0 : OverflowStack(frame) + frame[0];
}
#endif

class CrashHandlerForThreadDeath : public testing::Test
{
protected:
    CrashHandlerForThreadDeath() { GTEST_FLAG_SET(death_test_style, "threadsafe"); }
};

} // namespace

TEST_F(CrashHandlerForThreadDeath, ReportsAnAbortWithTheWholeThreadName)
{
    EXPECT_EXIT(RunGuarded("Control Heartbeat Monitor0", [] { std::abort(); }),
                KilledBySignal(SIGABRT), IsReport("Control Heartbeat Monitor0", "SIGABRT (6)"));
}

TEST_F(CrashHandlerForThreadDeath, ReportsAnExceptionThatLeavesTheThread)
{
    EXPECT_EXIT(RunGuarded("VSocketASIO0", [] { throw std::runtime_error("stray"); }),
                KilledBySignal(SIGABRT),
                AllOf(IsReport("VSocketASIO0", "SIGABRT (6)"), HasSubstr("stray")));
}

TEST_F(CrashHandlerForThreadDeath, ReportsTheKernelsNameOfANamelessThread)
{
    const auto crash = [] {
        const VCrashHandlerForThread crashHandler;
        NoCoreFile();
        pthread_setname_np(pthread_self(), "kernel");
        std::abort();
    };

    EXPECT_EXIT(crash(), KilledBySignal(SIGABRT), IsReport("kernel", "SIGABRT (6)"));
}

TEST_F(CrashHandlerForThreadDeath, ReportsIllegalInstructions)
{
    EXPECT_EXIT(RunGuarded("a", [] { raise(SIGILL); }), KilledBySignal(SIGILL),
                IsReport("a", "SIGILL (4) at address 0x"));
}

#if !defined(UNDER_SANITIZER)

TEST_F(CrashHandlerForThreadDeath, ReportsABadAddressWithTheAddress)
{
    EXPECT_EXIT(RunGuarded("reader", &ReadBadAddress), KilledBySignal(SIGSEGV),
                IsReport("reader", "SIGSEGV (11) at address 0x10\n"));
}

TEST_F(CrashHandlerForThreadDeath, ReportsAStackOverflow)
{
    const auto overflow = [] {
        volatile char start = 0;
        OverflowStack(&start);
    };

    EXPECT_EXIT(RunGuarded("deep", overflow), KilledBySignal(SIGSEGV),
                IsReport("deep", "SIGSEGV (11) at address 0x"));
}

TEST_F(CrashHandlerForThreadDeath, ReportsABusError)
{
    EXPECT_EXIT(RunGuarded("a", [] { raise(SIGBUS); }), KilledBySignal(SIGBUS),
                IsReport("a", "SIGBUS (7) at address 0x"));
}

TEST_F(CrashHandlerForThreadDeath, ReportsADivisionByZero)
{
    const auto divide = [] {
        volatile int zero = 0;
        volatile int number = 10; // 1 / x is optimized to comparisons, which do not fault
        // NOLINTNEXTLINE(clang-analyzer-core.DivideZero): what is tried
        volatile int quotient = number / zero;
        (void)quotient;
    };

    EXPECT_EXIT(RunGuarded("divider", divide), KilledBySignal(SIGFPE),
                IsReport("divider", "SIGFPE (8) at address 0x"));
}

#else

TEST_F(CrashHandlerForThreadDeath, LeavesTheSanitizersReport)
{
    EXPECT_DEATH(RunGuarded("reader", &ReadBadAddress), "Sanitizer.*SEGV");
}

#endif

TEST_F(CrashHandlerForThreadDeath, IsSilentForAThreadThatIsNotGuarded)
{
    const auto crashBesideGuardedThread = [] {
        const VCrashHandlerForThread crashHandler; // of this thread, which does not crash
        RunOnThread("unguarded", [] { std::abort(); });
    };

    EXPECT_EXIT(crashBesideGuardedThread(), KilledBySignal(SIGABRT), Not(HasSubstr("crashed")));
}

TEST_F(CrashHandlerForThreadDeath, IsSilentOnceItIsGone)
{
    const auto crashLate = [] {
        RunOnThread("late", [] {
            {
                const VCrashHandlerForThread crashHandler;
            }
            std::abort();
        });
    };

    EXPECT_EXIT(crashLate(), KilledBySignal(SIGABRT), Not(HasSubstr("crashed")));
}

TEST_F(CrashHandlerForThreadDeath, GuardsUntilTheOutermostOfAThreadIsGone)
{
    const auto crashBehindInner = [] {
        {
            const VCrashHandlerForThread inner;
        }
        std::abort();
    };

    EXPECT_EXIT(RunGuarded("nested", crashBehindInner), KilledBySignal(SIGABRT),
                IsReport("nested", "SIGABRT (6)"));
}

TEST_F(CrashHandlerForThreadDeath, StaysInPlaceWhenAnotherThreadsIsGone)
{
    const auto crashBehindOther = [] {
        RunGuarded("other", [] {});
        std::abort();
    };

    EXPECT_EXIT(RunGuarded("staying", crashBehindOther), KilledBySignal(SIGABRT),
                IsReport("staying", "SIGABRT (6)"));
}

TEST_F(CrashHandlerForThreadDeath, ReportsWhenSeveralThreadsCrashAtOnce)
{
    const auto crashTogether = [] {
        NoCoreFile();
        std::promise<void> start;
        const std::shared_future<void> started = start.get_future().share();
        const auto crash = [&started] {
            DebugServices::SetThreadName("one of two");
            const VCrashHandlerForThread crashHandler;
            started.wait();
            raise(SIGABRT);
        };
        std::thread first(crash);
        std::thread second(crash);
        start.set_value();
        first.join();
        second.join();
    };

    EXPECT_EXIT(crashTogether(), KilledBySignal(SIGABRT), IsReport("one of two", "SIGABRT (6)"));
}

TEST(CrashHandlerForThread, LeavesNoHandlerBehind)
{
    const bool before = IsDefault(SIGABRT);
    {
        const VCrashHandlerForThread first;
        const VCrashHandlerForThread second;
        EXPECT_FALSE(IsDefault(SIGABRT));
    }

    EXPECT_TRUE(before);
    EXPECT_TRUE(IsDefault(SIGABRT));
}

TEST(CrashHandlerForThread, LeavesAHandlerThatWasThereBefore)
{
    const auto own = [](int) {};
    void (*const previous)(int) = std::signal(SIGILL, own);
    {
        const VCrashHandlerForThread crashHandler;
        struct sigaction present = {};
        sigaction(SIGILL, nullptr, &present);
        EXPECT_EQ(+own, present.sa_handler);
    }

    EXPECT_EQ(+own, std::signal(SIGILL, previous));
}

TEST(CrashHandlerForThread, LeavesAHandlerThatWasPutOverIt)
{
    const auto own = [](int) {};
    {
        const VCrashHandlerForThread crashHandler;
        std::signal(SIGILL, own);
    }

    EXPECT_EQ(+own, std::signal(SIGILL, SIG_DFL));
}

TEST(CrashHandlerForThread, RestoresTheThreadsAlternateStack)
{
    stack_t before = {};
    sigaltstack(nullptr, &before);
    stack_t meanwhile = {};
    {
        const VCrashHandlerForThread crashHandler;
        sigaltstack(nullptr, &meanwhile);
    }
    stack_t after = {};
    sigaltstack(nullptr, &after);

    EXPECT_EQ(0, meanwhile.ss_flags & SS_DISABLE);
    EXPECT_NE(before.ss_sp, meanwhile.ss_sp);
    EXPECT_EQ(before.ss_sp, after.ss_sp);
    EXPECT_EQ(before.ss_flags, after.ss_flags);
}

TEST(CrashHandlerForThread, ComesAndGoesOnManyThreads)
{
    constexpr int threadCount = 8;
    std::vector<std::thread> threads;
    threads.reserve(threadCount);
    for (int i = 0; i < threadCount; ++i) {
        threads.emplace_back([] {
            for (int round = 0; round < 100; ++round) {
                const VCrashHandlerForThread crashHandler;
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }

    EXPECT_TRUE(IsDefault(SIGABRT));
}
