#include "PluginBench.h"

#include <gmock/gmock.h>

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QEvent>
#include <QProcess>
#include <QThread>

#include <string>
#include <unistd.h>

// The plug-in beside a DNS-SD daemon that only this test sees, and a browser that is not ours.

using testing::HasSubstr;

namespace {

constexpr int limit = 60000; // milliseconds

int argumentCount = 1;
char programName[] = "test";
char* arguments[] = {programName, nullptr};

/// What Avahi's own browser sees of our type now.
std::string Browse()
{
    QProcess browser;
    browser.start("avahi-browse", {"-rpt", "_korva._tcp"});
    EXPECT_TRUE(browser.waitForFinished(limit));
    return browser.readAllStandardOutput().toStdString();
}

/// The service as that browser shows it: blanks by their number, and last but one the port.
std::string ExpectedService()
{
    char hostName[256] = "";
    gethostname(hostName, sizeof hostName - 1);
    return std::string("=;lo;IPv4;Quorix\\032on\\032") + hostName +
           ";_korva._tcp;local;testhost.local;127.0.0.1;810;";
}

/// Counts the threads that have ended and delete themselves.
class VEndedThreads : public QObject
{
public:
    bool eventFilter(QObject* object, QEvent* event) override
    {
        if (event->type() == QEvent::DeferredDelete && qobject_cast<QThread*>(object) != nullptr) {
            ++Count;
        }
        return false;
    }

    int Count = 0;
};

/// A plug-in in a host that has an event loop.
class PluginAdvertisement : public PluginBench::VLoadedPlugin
{
protected:
    PluginAdvertisement()
    {
        QCoreApplication::setApplicationName("Quorix");
        application.installEventFilter(&endedThreads);
    }

    /// Runs the event loop until so many registrars have had their outcome, and their threads have
    /// ended and are deleted.
    bool AwaitOutcomes(int count)
    {
        QElapsedTimer timer;
        timer.start();
        while (endedThreads.Count < count && timer.elapsed() < limit) {
            QCoreApplication::processEvents();
            QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        }
        return endedThreads.Count == count;
    }

    static std::string BrowseUntilSeen()
    {
        QElapsedTimer timer;
        timer.start();
        std::string seen = Browse();
        while (seen.find(ExpectedService()) == std::string::npos && timer.elapsed() < limit) {
            seen = Browse();
        }
        return seen;
    }

private:
    QCoreApplication application{argumentCount, arguments};
    VEndedThreads endedThreads;
};

} // namespace

TEST_F(PluginAdvertisement, BeginsWithTheStartAndItsThreadEndsWithTheOutcome)
{
    ASSERT_TRUE(plugin->Start(host));

    EXPECT_TRUE(AwaitOutcomes(1));
    EXPECT_THAT(BrowseUntilSeen(), HasSubstr(ExpectedService()));
}

// The advertisement ends with the process alone.
TEST_F(PluginAdvertisement, StaysWhenThePluginGoes)
{
    ASSERT_TRUE(plugin->Start(host));
    ASSERT_TRUE(AwaitOutcomes(1));
    plugin->Stop();
    Destroy();

    EXPECT_THAT(BrowseUntilSeen(), HasSubstr(ExpectedService()));
}

TEST_F(PluginAdvertisement, NeedsNoDispatcher)
{
    PluginBench::VFakeHost bareHost(nullptr);

    ASSERT_TRUE(plugin->Start(bareHost));

    EXPECT_TRUE(AwaitOutcomes(1));
    EXPECT_THAT(BrowseUntilSeen(), HasSubstr(ExpectedService()));
}

TEST_F(PluginAdvertisement, TwentyStartsAndStopsLeaveNoThreadOfARegistrar)
{
    for (int round = 0; round < 20; ++round) {
        PluginBench::IPlugin* one = library.Create();
        ASSERT_TRUE(one->Start(host)) << round;
        EXPECT_TRUE(PluginBench::CanConnect()) << round;
        one->Stop();
        library.Destroy(one);
        QCoreApplication::processEvents();
    }

    EXPECT_TRUE(AwaitOutcomes(20));
    EXPECT_THAT(BrowseUntilSeen(), HasSubstr(ExpectedService()));
}
