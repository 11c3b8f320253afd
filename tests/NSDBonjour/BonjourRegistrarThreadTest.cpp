#include "FakeDnsServices.h"

#include "NSDBonjour/BonjourRegistrar.h"

#include <gmock/gmock.h>

#include <QCoreApplication>
#include <QThread>

#include <chrono>
#include <future>
#include <memory>

namespace {

/// A registrar on a thread of its own that ends at the first outcome, as a plug-in makes it; here
/// both are destroyed in the end. What that thread writes is read after its end.
class BonjourRegistrarThread : public testing::Test
{
protected:
    BonjourRegistrarThread()
    {
        qRegisterMetaType<VNSDService>("VNSDService");
        registrar->moveToThread(&thread);
        QObject::connect(registrar.get(), &VBonjourRegistrar::error, &thread, &QThread::quit);
        QObject::connect(registrar.get(), &VBonjourRegistrar::serviceRegistered, &thread,
                         &QThread::quit);
        // These two run on the registrar's thread: they have no object that lives elsewhere.
        QObject::connect(registrar.get(), &VBonjourRegistrar::serviceRegistered,
                         [this] { ++registered; });
        QObject::connect(&thread, &QThread::finished, [this] { ended.set_value(); });
        thread.start(QThread::InheritPriority);
    }

    ~BonjourRegistrarThread() override
    {
        thread.quit();
        thread.wait();
    }

    /// Runs the event loop, through which the outcome ends the thread.
    bool WaitForEnd()
    {
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
        while (end.wait_for(std::chrono::milliseconds(1)) != std::future_status::ready) {
            if (std::chrono::steady_clock::now() > deadline) {
                return false;
            }
            QCoreApplication::processEvents();
        }
        return true;
    }

    VFakeDnsServices library;
    std::promise<void> ended;
    const std::future<void> end = ended.get_future();
    int registered = 0;
    QThread thread;
    std::unique_ptr<VBonjourRegistrar> registrar =
        std::make_unique<VBonjourRegistrar>(VFakeDnsServices::Calls());
};

} // namespace

TEST_F(BonjourRegistrarThread, RegistersOnItsOwnThreadAndEndsItWithTheAnswer)
{
    library.ResultsBeforeCallBack = 0;
    library.MakeReadable();

    emit registrar->Register("Name");

    ASSERT_TRUE(WaitForEnd());
    ASSERT_EQ(1U, library.Registrations.size());
    EXPECT_NE(std::this_thread::get_id(), library.Registrations[0].Thread);
    EXPECT_EQ(1, registered);
}

TEST_F(BonjourRegistrarThread, AnErrorEndsItToo)
{
    library.RegisterAnswer = -65537;

    emit registrar->Register("Name");

    EXPECT_TRUE(WaitForEnd());
    EXPECT_EQ(0, registered);
}

TEST_F(BonjourRegistrarThread, TheServiceCrossesThreadsAsAValue)
{
    library.ResultsBeforeCallBack = 0;
    library.MakeReadable();
    VNSDService received;
    QThread* receivingThread = nullptr;
    QObject receiver;
    QObject::connect(registrar.get(), &VBonjourRegistrar::serviceRegistered, &receiver,
                     [&](const VNSDService& service) {
                         received = service;
                         receivingThread = QThread::currentThread();
                     });

    emit registrar->Register("Name");

    ASSERT_TRUE(WaitForEnd());
    QCoreApplication::processEvents();
    EXPECT_EQ(QThread::currentThread(), receivingThread);
    EXPECT_EQ("Name", received.Name);
    EXPECT_EQ("_korva._tcp.", received.RegisteredType);
    EXPECT_EQ("local.", received.ReplyDomain);
}

TEST_F(BonjourRegistrarThread, TheServiceStaysRegisteredAfterTheThreadHasEnded)
{
    library.ResultsBeforeCallBack = 0;
    library.MakeReadable();
    emit registrar->Register("Name");
    ASSERT_TRUE(WaitForEnd());

    library.MakeReadable(); // a later result, which nobody reads any more
    QCoreApplication::processEvents();

    EXPECT_EQ(1, library.Processed);
    EXPECT_EQ(0, library.Deallocated);
}

TEST(VNSDService, IsKnownToTheMetaTypeSystemByItsName)
{
    qRegisterMetaType<VNSDService>("VNSDService");

    EXPECT_EQ(qMetaTypeId<VNSDService>(), QMetaType::type("VNSDService"));
    EXPECT_EQ("", VNSDService().Name + VNSDService().RegisteredType + VNSDService().ReplyDomain);
}
