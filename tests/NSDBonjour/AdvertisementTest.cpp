#include "NSDBonjour/BonjourRegistrar.h"

#include <gmock/gmock.h>

#include <QElapsedTimer>
#include <QProcess>
#include <QSignalSpy>
#include <QThread>

#include <memory>
#include <string>

using testing::HasSubstr;
using testing::Not;

namespace {

constexpr int outcomeLimit = 30000; // milliseconds; commonly two seconds

/// Returns what Avahi's own browser sees of our type now, one line for each resolved service:
/// "=;interface;protocol;name;type;domain;host;address;port;text".
std::string Browse()
{
    QProcess browser;
    browser.start("avahi-browse", {"-rpt", "_korva._tcp"});
    EXPECT_TRUE(browser.waitForFinished(outcomeLimit));
    return browser.readAllStandardOutput().toStdString();
}

/// Browses until `text` is seen or is gone. @return what was seen last
std::string BrowseUntil(const std::string& text, bool isThere)
{
    QElapsedTimer timer;
    timer.start();
    std::string seen = Browse();
    while ((seen.find(text) != std::string::npos) != isThere && timer.elapsed() < outcomeLimit) {
        seen = Browse();
    }
    return seen;
}

/// Registers through the real client library and waits for the outcome.
class VAdvertisement
{
public:
    explicit VAdvertisement(const QString& name)
    {
        emit registrar->Register(name);
        if (registered.isEmpty() && errors.isEmpty()) {
            EXPECT_TRUE(registered.wait(outcomeLimit));
        }
    }

    std::unique_ptr<VBonjourRegistrar> registrar = std::make_unique<VBonjourRegistrar>();
    QSignalSpy registered{registrar.get(), &VBonjourRegistrar::serviceRegistered};
    QSignalSpy errors{registrar.get(), &VBonjourRegistrar::error};
};

} // namespace

TEST(Advertisement, IsSeenByAnotherBrowserWithTypeNameAndPort)
{
    const VAdvertisement advertisement("Quorix on testhost");

    ASSERT_EQ(1, advertisement.registered.count());
    const auto service = advertisement.registered[0][0].value<VNSDService>();
    EXPECT_EQ("Quorix on testhost", service.Name);
    EXPECT_EQ("_korva._tcp.", service.RegisteredType);
    EXPECT_EQ("local.", service.ReplyDomain);
    // The browser writes blanks as their decimal code.
    EXPECT_THAT(BrowseUntil("=;", true),
                HasSubstr("=;lo;IPv4;Quorix\\032on\\032testhost;_korva._tcp;local;testhost.local;"
                          "127.0.0.1;810;"));
}

TEST(Advertisement, CarriesANameOfAnyLetters)
{
    const QString name = QString::fromUtf8("B\xC3\xBChne \xE4\xB8\x80 \xF0\x9F\x98\x80");
    const VAdvertisement advertisement(name);

    ASSERT_EQ(1, advertisement.registered.count());
    EXPECT_EQ(name, advertisement.registered[0][0].value<VNSDService>().Name);
}

TEST(Advertisement, IsWithdrawnWithTheRegistrar)
{
    VAdvertisement advertisement("Short lived");
    ASSERT_THAT(BrowseUntil("Short", true), HasSubstr("Short\\032lived"));

    advertisement.registrar.reset();

    EXPECT_THAT(BrowseUntil("Short", false), Not(HasSubstr("Short")));
}

TEST(Advertisement, ASecondRegisterIsRefusedAndTheFirstStands)
{
    VAdvertisement advertisement("First");

    emit advertisement.registrar->Register("Second");

    ASSERT_EQ(1, advertisement.errors.count());
    EXPECT_EQ("Already registered a service", advertisement.errors[0][0].toString());
    const std::string seen = BrowseUntil("First", true);
    EXPECT_THAT(seen, HasSubstr(";First;"));
    EXPECT_THAT(seen, Not(HasSubstr("Second")));
}

TEST(Advertisement, StaysAfterTheRegistrarsThreadHasEnded)
{
    QThread thread;
    VBonjourRegistrar registrar;
    registrar.moveToThread(&thread);
    QObject::connect(
        &registrar, &VBonjourRegistrar::serviceRegistered, &thread, [&thread] { thread.quit(); },
        Qt::DirectConnection);
    thread.start(QThread::InheritPriority);

    emit registrar.Register("Lasting");
    ASSERT_TRUE(thread.wait(outcomeLimit));

    EXPECT_THAT(BrowseUntil("Lasting", true), HasSubstr("=;lo;IPv4;Lasting;_korva._tcp;"));
}

TEST(Advertisement, ANameThatIsTooLongIsRefused)
{
    const VAdvertisement advertisement(QString(64, 'x'));

    ASSERT_EQ(1, advertisement.errors.count());
    EXPECT_EQ("Bad Param", advertisement.errors[0][0].toString());
    EXPECT_EQ(0, advertisement.registered.count());
}
