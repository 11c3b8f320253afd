#include "NSDBonjour/BonjourRegistrar.h"

#include <gtest/gtest.h>

#include <QSignalSpy>
#include <QSocketNotifier>

TEST(BonjourRegistrarWithoutDaemon, SaysSoAtOnceAndAgainAtTheNextTry)
{
    // Read once in a process; no other test of this binary goes to the real client library.
    qputenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus");
    VBonjourRegistrar registrar;
    const QSignalSpy errors(&registrar, &VBonjourRegistrar::error);

    emit registrar.Register("Nowhere");
    emit registrar.Register("Nowhere");

    ASSERT_EQ(2, errors.count());
    EXPECT_EQ("Unknown Error", errors[0][0].toString());
    EXPECT_EQ("Unknown Error", errors[1][0].toString());
    EXPECT_EQ(nullptr, registrar.findChild<QSocketNotifier*>());
}
