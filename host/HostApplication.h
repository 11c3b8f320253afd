#pragma once

#include "Console.h"
#include "Host.h"
#include "IHostWindow.h"
#include "MainThreadWakeUp.h"
#include "Options.h"
#include "OrderlyStop.h"

#include <memory>

namespace QuorixHost {

class VConsoleStream;
class VHostFolders;
class VPlugin;

/// The host from its first service to its last: starts the plug-in, serves until it is asked to
/// stop, and stops the plug-in.
///
/// Owns: everything that lives as long as the host. Threads: [gui].
class VHostApplication
{
public:
    /// Needs a QCoreApplication, a QApplication for a window, and that no thread has been made yet
    /// but Qt's, with SIGINT and SIGTERM blocked.
    ///
    /// @param makeWindow  empty for a host without a window
    explicit VHostApplication(VOptions options,
                              const VMakeHostWindow& makeWindow = VMakeHostWindow());
    ~VHostApplication();

    VHostApplication(const VHostApplication&) = delete;
    VHostApplication& operator=(const VHostApplication&) = delete;

    /// Serves until SIGINT, SIGTERM or `quit`.
    ///
    /// @return the process's exit code: 0 after an orderly stop, 1 when the plug-in did not start;
    /// the log then says why
    int Run();

private:
    void RequestEnd();
    bool StartPlugin();
    void StartPluginGUI();
    void Serve();
    void ReportPort() const;
    void OpenConsole();
    void StopPlugin();

    const VOptions options;
    VMainThreadWakeUp quit; // outlives the thread of orderlyStop, which wakes it
    VOrderlyStop orderlyStop;
    std::unique_ptr<VHostFolders> folders; // null where no preferences are kept
    VHost host;
    std::unique_ptr<IHostWindow> window; // null without one
    VConsole console;
    std::unique_ptr<VConsoleStream> consoleStream;
    std::unique_ptr<VPlugin> plugin; // goes before the services that it uses
};

} // namespace QuorixHost
