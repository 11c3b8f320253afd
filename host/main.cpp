#include "DebugServices/CrashHandlerForThread.h"
#include "DebugServices/Log.h"
#include "HostApplication.h"
#include "Options.h"
#include "QuorixVersion.h"
#include "utils/LogStatement.h"
#include "utils/StandardStreams.h"
#include "window/DisplayCheck.h"
#include "window/HostWindow.h"
#include "window/WindowLog.h"

#include <QApplication>
#include <QQuickWindow>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <exception>
#include <iostream>

namespace {

constexpr int noDisplayExitCode = 1;

// How long a display may take to answer before it counts as none.
constexpr std::chrono::seconds displayPatience{10};

/// Has Qt's own threads leave the signals to the thread that waits for them.
void BlockStopSignals()
{
    sigset_t stopSignals;
    sigemptyset(&stopSignals);
    sigaddset(&stopSignals, SIGINT);
    sigaddset(&stopSignals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &stopSignals, nullptr);
}

int RunHost(const QuorixHost::VOptions& options, const QuorixHost::VMakeHostWindow& makeWindow)
{
    QCoreApplication::setApplicationName("Quorix");
    QCoreApplication::setApplicationVersion(QUORIX_VERSION);
    try {
        QuorixHost::VHostApplication host(options, makeWindow);
        return host.Run();
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 2, "The host failed: %1%", exception.what());
        return 1;
    }
}

int RunWithoutWindow(const QuorixHost::VOptions& options, int& argumentCount, char** arguments)
{
    const QCoreApplication application(argumentCount, arguments);
    return RunHost(options, QuorixHost::VMakeHostWindow());
}

int RunWithWindow(const QuorixHost::VOptions& options, int& argumentCount, char** arguments)
{
    if (const auto reason = QuorixHost::DescribeMissingDisplay(displayPatience)) {
        KVR_LOG("Host", 2,
                "There is no display for a window: %1%. Run with --headless to do without",
                *reason);
        return noDisplayExitCode;
    }
    BlockStopSignals();
    QuorixHost::VWindowLog::Installed(); // from the first line on
    QApplication::setStyle("Fusion");    // the one style that follows every palette
    const QApplication application(argumentCount, arguments);
    QApplication::setQuitOnLastWindowClosed(false); // the host stops in order
    if (QGuiApplication::platformName() == "offscreen") {
        QQuickWindow::setSceneGraphBackend(QSGRendererInterface::Software); // it has no OpenGL
    }
    return RunHost(options, &QuorixHost::MakeHostWindow);
}

} // namespace

int main(int argumentCount, char** arguments)
{
    KVR::FillStandardStreams();
    const QuorixHost::VCommandLine commandLine =
        QuorixHost::ParseCommandLine(argumentCount, arguments, std::cout, std::cerr);
    if (!commandLine.options) {
        return commandLine.exitCode;
    }

    // A device, or whoever reads the console's answers, may go away at any time.
    std::signal(SIGPIPE, SIG_IGN);
    // Avahi tells whoever uses it through this interface to use another one, in three lines on
    // standard error. Nobody at the host can, and they hide what the host has to say.
    setenv("AVAHI_COMPAT_NOWARN", "1", 0);
    const DebugServices::VCrashHandlerForThread crashHandler;
    for (const auto& [category, level] : commandLine.options->logLevels) {
        DebugServices::SetLogLevel(category, level);
    }

    const QuorixHost::VOptions& options = *commandLine.options;
    int qtArgumentCount = 1; // the options are the host's own
    return options.headless ? RunWithoutWindow(options, qtArgumentCount, arguments)
                            : RunWithWindow(options, qtArgumentCount, arguments);
}
