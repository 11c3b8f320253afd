#pragma once

#include <boost/function.hpp>

#include <memory>

class IQuorixGUI;

namespace QuorixHost {

class VConsole;
class VHost;

/// The host's window, as the rest of the host knows it, which also runs without any.
///
/// Threads: every operation [gui].
class IHostWindow
{
public:
    virtual ~IHostWindow() = default;

    /// Returns the services that the plug-in's windows are given.
    virtual IQuorixGUI& GUI() = 0;

    virtual void Show() = 0;

    /// Adds the commands and the parts of the state that need a window.
    virtual void AddToConsole(VConsole& console) = 0;

    /// Ends every dialog that waits for the operator, with the code 0, so that whoever waits for
    /// its answer goes on.
    virtual void EndDialogs() = 0;

    /// Destroys what panels are still open, once the event loop has ended and before the plug-in
    /// goes, whose widgets they are.
    virtual void ClosePanels() = 0;
};

/// Makes the window of a host.
///
/// @param host         outlives the window
/// @param requestStop  called when the operator wants the host to stop
using VMakeHostWindow = boost::function<std::unique_ptr<IHostWindow>(
    VHost& host, const boost::function<void()>& requestStop)>;

} // namespace QuorixHost
