#include "LeftThreads.h"

#include <gmock/gmock.h>

#include <chrono>
#include <future>
#include <set>
#include <thread>
#include <unistd.h>

using QuorixHost::AwaitEndOfOtherThreads;
using QuorixHost::OwnThreads;

namespace {

constexpr std::chrono::milliseconds generousLimit{60000};
constexpr std::chrono::milliseconds atOnce{0};

} // namespace

TEST(LeftThreads, TheMainThreadIsOneOfThem)
{
    EXPECT_THAT(OwnThreads(), testing::Contains(getpid()));
}

TEST(LeftThreads, AThreadOfBeforeIsNotWaitedFor)
{
    std::promise<void> end;
    std::thread thread([&] { end.get_future().wait(); });

    EXPECT_TRUE(AwaitEndOfOtherThreads(OwnThreads(), atOnce));

    end.set_value();
    thread.join();
}

TEST(LeftThreads, ALaterThreadIsWaitedForUpToTheLimit)
{
    std::thread([] {}).join(); // a sanitizer makes a thread of its own along with the first one
    const std::set<pid_t> before = OwnThreads();
    std::promise<void> end;
    std::thread([future = end.get_future()] { future.wait(); }).detach();

    EXPECT_FALSE(AwaitEndOfOtherThreads(before, atOnce));
    end.set_value();
    EXPECT_TRUE(AwaitEndOfOtherThreads(before, generousLimit));
}

TEST(LeftThreads, AThreadThatWorksIsWaitedFor)
{
    std::thread([] {}).join();
    const std::set<pid_t> before = OwnThreads();
    const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(200);
    std::thread([end] {
        while (std::chrono::steady_clock::now() < end) {
        }
    }).detach();

    EXPECT_TRUE(AwaitEndOfOtherThreads(before, generousLimit));
}

TEST(LeftThreads, AThreadThatOnlyWaitsIsNotWaitedForToTheLimit)
{
    std::thread([] {}).join();
    const std::set<pid_t> before = OwnThreads();
    std::promise<void> end;
    std::thread thread([&] { end.get_future().wait(); });
    const auto start = std::chrono::steady_clock::now();

    EXPECT_FALSE(AwaitEndOfOtherThreads(before, generousLimit));

    EXPECT_LT(std::chrono::steady_clock::now() - start, generousLimit);
    end.set_value();
    thread.join();
}
