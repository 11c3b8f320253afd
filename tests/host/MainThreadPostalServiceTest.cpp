#include "MainThreadPostalService.h"

#include "notification/DeregisterWeakCallbackException.h"
#include "support/LogCapture.h"

#include <QCoreApplication>
#include <QEventLoop>
#include <gmock/gmock.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using QuorixHost::VMainThreadPostalService;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

/// A main thread with an event loop and a service on it.
class MainThreadPostalService : public testing::Test
{
protected:
    ~MainThreadPostalService() override { service->Close(); }

    /// Turns the loop until what was posted before has been delivered.
    void DeliverAll()
    {
        service->Post(&QCoreApplication::quit, 0);
        QCoreApplication::exec();
    }

    boost::function<void()> Note(const std::string& text)
    {
        return [this, text] { notes.push_back(text); };
    }

    int argumentCount = 1;
    char name[5] = "test";
    char* arguments[2] = {name, nullptr};
    QCoreApplication application{argumentCount, arguments};
    std::shared_ptr<VMainThreadPostalService> service =
        std::make_shared<VMainThreadPostalService>();
    std::vector<std::string> notes;
};

} // namespace

TEST_F(MainThreadPostalService, DeliversInOrderOnTheMainThread)
{
    std::vector<std::thread::id> threads;
    std::thread([&] {
        service->Post(Note("1"), 0);
        service->Post([&] { threads.push_back(std::this_thread::get_id()); }, 0);
        service->Post(Note("2"), 0);
    }).join();
    EXPECT_THAT(notes, IsEmpty());

    DeliverAll();

    EXPECT_THAT(notes, ElementsAre("1", "2"));
    EXPECT_THAT(threads, ElementsAre(std::this_thread::get_id()));
}

TEST_F(MainThreadPostalService, KeepsTheOrderOfEachOfSeveralThreads)
{
    constexpr int posts = 1000;
    std::vector<int> heard[2];
    std::vector<std::thread> threads;
    for (std::vector<int>& list : heard) {
        threads.emplace_back([&] {
            for (int i = 0; i < posts; ++i) {
                service->Post([&list, i] { list.push_back(i); }, 0);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }

    DeliverAll();

    for (const std::vector<int>& list : heard) {
        ASSERT_EQ(posts, static_cast<int>(list.size()));
        EXPECT_TRUE(std::is_sorted(list.begin(), list.end()));
    }
}

TEST_F(MainThreadPostalService, NeverDeliversInsideAnotherDelivery)
{
    service->Post(
        [&] {
            service->Post(Note("posted inside"), 0);
            // As an open dialog does: a loop of its own, which sees the wake.
            QEventLoop nested;
            for (int i = 0; i < 10; ++i) {
                nested.processEvents();
            }
            notes.push_back("end of the first");
        },
        0);
    service->Post(Note("second"), 0);

    DeliverAll();
    for (int i = 0; i < 10; ++i) {
        QCoreApplication::processEvents(); // without a post, which would wake the service
    }

    EXPECT_THAT(notes, ElementsAre("end of the first", "second", "posted inside"));
}

TEST_F(MainThreadPostalService, AFunctionThatPostsItselfLeavesTheLoopItsTurns)
{
    int calls = 0;
    boost::function<void()> again = [&] {
        ++calls;
        service->Post(again, 0);
    };
    service->Post(again, 0);

    for (int i = 0; i < 10; ++i) {
        QCoreApplication::processEvents();
    }

    EXPECT_GT(calls, 1);
}

TEST_F(MainThreadPostalService, LogsAnExceptionAndGoesOn)
{
    TestSupport::VLogCapture log;
    service->Post([] { throw std::runtime_error("it broke"); }, 0);
    service->Post([] { throw 7; }, 0);
    service->Post(boost::function<void()>(), 0);
    service->Post(Note("after"), 0);

    DeliverAll();

    EXPECT_THAT(notes, ElementsAre("after"));
    EXPECT_THAT(log.Texts("Host"),
                ElementsAre("A posted function failed: it broke",
                            "A posted function failed with an unknown exception",
                            "A posted function failed: call to empty boost::function"));
}

TEST_F(MainThreadPostalService, DropsAFunctionWhoseTargetHasGoneInSilence)
{
    TestSupport::VLogCapture log;
    service->Post([] { throw KVR::VDeregisterWeakCallbackException(); }, 0);
    service->Post(Note("after"), 0);

    DeliverAll();

    EXPECT_THAT(notes, ElementsAre("after"));
    EXPECT_THAT(log.Messages(), IsEmpty());
}

TEST_F(MainThreadPostalService, FreesWhatWaitsWhenItIsClosed)
{
    const auto held = std::make_shared<int>(7);
    service->Post([held, this] { notes.push_back("called"); }, 0);
    EXPECT_EQ(2, held.use_count());

    service->Close();
    service->Post([held, this] { notes.push_back("called late"); }, 0);
    QCoreApplication::processEvents();

    EXPECT_EQ(1, held.use_count());
    EXPECT_THAT(notes, IsEmpty());
}

TEST_F(MainThreadPostalService, MayBeReleasedByAnotherThreadOnceClosed)
{
    service->Close();

    std::thread([released = std::move(service)]() mutable { released.reset(); }).join();
    service = std::make_shared<VMainThreadPostalService>();
}
