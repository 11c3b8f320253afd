#include <gmock/gmock.h>

#include <QApplication>
#include <QTemporaryDir>

/// Runs the tests of a binary below one QApplication. Run by hand the binary needs no environment:
/// windows stay in memory and are drawn by software unless something else is asked for. What Qt and
/// graphics drivers keep between two runs goes with the test and not into the user's home.
int main(int argumentCount, char** arguments)
{
    const QTemporaryDir cache;
    qputenv("XDG_CACHE_HOME", cache.path().toLocal8Bit());
    if (!qEnvironmentVariableIsSet("QT_QPA_PLATFORM")) {
        qputenv("QT_QPA_PLATFORM", "offscreen");
    }
    if (!qEnvironmentVariableIsSet("QT_QUICK_BACKEND")) {
        qputenv("QT_QUICK_BACKEND", "software");
    }
    testing::InitGoogleMock(&argumentCount, arguments);
    const QApplication application(argumentCount, arguments);
    const int result = RUN_ALL_TESTS();
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    return result;
}
