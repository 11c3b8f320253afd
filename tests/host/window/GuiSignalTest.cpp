#include "window/GuiSignal.h"

#include "support/WindowWait.h"

#include <QCoreApplication>
#include <QTest>
#include <gtest/gtest.h>

#include <thread>

TEST(GuiSignal, CallsOnTheEventLoopOnceForSeveralWishes)
{
    int calls = 0;
    std::thread::id caller;
    const QuorixHost::VGuiSignal signal([&] {
        ++calls;
        caller = std::this_thread::get_id();
    });

    std::thread([wake = signal.Waker()] {
        wake();
        wake();
    }).join();
    EXPECT_EQ(0, calls);

    EXPECT_TRUE(TestSupport::WaitFor([&] { return calls > 0; }));
    EXPECT_EQ(1, calls);
    EXPECT_EQ(std::this_thread::get_id(), caller);
}

TEST(GuiSignal, IsSilentAfterItsEnd)
{
    boost::function<void()> wake;
    int calls = 0;
    {
        const QuorixHost::VGuiSignal signal([&] { ++calls; });
        wake = signal.Waker();
        wake();
    }

    std::thread(wake).join();
    QCoreApplication::processEvents();

    EXPECT_EQ(0, calls);
}
