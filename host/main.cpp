#include "DebugServices/CrashHandlerForThread.h"
#include "DebugServices/Log.h"
#include "HostApplication.h"
#include "Options.h"
#include "QuorixVersion.h"
#include "utils/LogStatement.h"

#include <QCoreApplication>

#include <csignal>
#include <exception>
#include <iostream>

namespace {

int RunHost(const QuorixHost::VOptions& options)
{
    if (!options.headless) {
        KVR_LOG("Host", 3, "This host has no window: it runs as with --headless");
    }
    try {
        QuorixHost::VHostApplication host(options);
        return host.Run();
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 2, "The host failed: %1%", exception.what());
        return 1;
    }
}

} // namespace

int main(int argumentCount, char** arguments)
{
    const QuorixHost::VCommandLine commandLine =
        QuorixHost::ParseCommandLine(argumentCount, arguments, std::cout, std::cerr);
    if (!commandLine.options) {
        return commandLine.exitCode;
    }

    // A device, or whoever reads the console's answers, may go away at any time.
    std::signal(SIGPIPE, SIG_IGN);
    const DebugServices::VCrashHandlerForThread crashHandler;
    for (const auto& [category, level] : commandLine.options->logLevels) {
        DebugServices::SetLogLevel(category, level);
    }

    int qtArgumentCount = 1; // the options are the host's own
    const QCoreApplication application(qtArgumentCount, arguments);
    QCoreApplication::setApplicationName("Quorix");
    QCoreApplication::setApplicationVersion(QUORIX_VERSION);

    return RunHost(*commandLine.options);
}
