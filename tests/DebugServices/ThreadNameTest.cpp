#include "DebugServices/ThreadName.h"

#include <gtest/gtest.h>

#include <pthread.h>

#include <thread>

namespace {

std::string KernelName()
{
    char name[16] = "";
    pthread_getname_np(pthread_self(), name, sizeof name);
    return name;
}

} // namespace

TEST(ThreadName, IsKeptWholeThoughTheKernelTakesFifteenBytes)
{
    std::thread([] {
        DebugServices::SetThreadName("Control Heartbeat Monitor0");

        EXPECT_EQ("Control Heartbeat Monitor0", DebugServices::GetThreadName());
        EXPECT_EQ("Control Heartbe", KernelName());
    }).join();
}

TEST(ThreadName, ReachesTheKernelWholeIfItFits)
{
    std::thread([] {
        DebugServices::SetThreadName("VSocketASIO0");
        EXPECT_EQ("VSocketASIO0", KernelName());

        DebugServices::SetThreadName("123456789012345");
        EXPECT_EQ("123456789012345", KernelName());

        DebugServices::SetThreadName("1234567890123456");
        EXPECT_EQ("123456789012345", KernelName());
        EXPECT_EQ("1234567890123456", DebugServices::GetThreadName());
    }).join();
}

TEST(ThreadName, BelongsToTheCallingThreadAlone)
{
    std::thread([] {
        DebugServices::SetThreadName("outer");
        std::thread([] {
            DebugServices::SetThreadName("inner");
            EXPECT_EQ("inner", DebugServices::GetThreadName());
        }).join();
        EXPECT_EQ("outer", DebugServices::GetThreadName());
    }).join();
}

TEST(ThreadName, IsReplacedByALaterOne)
{
    std::thread([] {
        DebugServices::SetThreadName("a first name that is rather long");
        DebugServices::SetThreadName("b");
        EXPECT_EQ("b", DebugServices::GetThreadName());
        EXPECT_EQ("b", KernelName());
    }).join();
}

TEST(ThreadName, IsTheKernelsUntilItIsSet)
{
    std::thread([] {
        pthread_setname_np(pthread_self(), "kernel");
        EXPECT_EQ("kernel", DebugServices::GetThreadName());
    }).join();
}

TEST(ThreadName, TakesNullAndTheEmptyTextAsEmpty)
{
    std::thread([] {
        DebugServices::SetThreadName(nullptr);
        EXPECT_EQ("", DebugServices::GetThreadName());
        DebugServices::SetThreadName("x");
        DebugServices::SetThreadName("");
        EXPECT_EQ("", DebugServices::GetThreadName());
    }).join();
}
