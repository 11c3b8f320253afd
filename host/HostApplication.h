#pragma once

#include "Console.h"
#include "Host.h"
#include "MainThreadWakeUp.h"
#include "Options.h"
#include "OrderlyStop.h"

#include <memory>

namespace QuorixHost {

class VConsoleStream;
class VPlugin;

/// The host from its first service to its last: starts the plug-in, serves until it is asked to
/// stop, and stops the plug-in.
///
/// Owns: everything that lives as long as the host. Threads: [gui].
class VHostApplication
{
public:
    /// Needs a QCoreApplication, and that no thread has been made yet.
    explicit VHostApplication(VOptions options);
    ~VHostApplication();

    VHostApplication(const VHostApplication&) = delete;
    VHostApplication& operator=(const VHostApplication&) = delete;

    /// Serves until SIGINT, SIGTERM or `quit`.
    ///
    /// @return the process's exit code: 0 after an orderly stop, 1 when the plug-in did not start;
    /// the log then says why
    int Run();

private:
    bool StartPlugin();
    void Serve();
    void ReportPort() const;
    void OpenConsole();
    void StopPlugin();

    const VOptions options;
    VMainThreadWakeUp quit; // outlives the thread of orderlyStop, which wakes it
    VOrderlyStop orderlyStop;
    VHost host;
    VConsole console;
    std::unique_ptr<VConsoleStream> consoleStream;
    std::unique_ptr<VPlugin> plugin; // goes before the services that it uses
};

} // namespace QuorixHost
