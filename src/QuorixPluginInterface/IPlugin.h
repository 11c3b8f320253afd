#pragma once

#include <cstdint>
#include <string>

class IQuorixGUI;

namespace QuorixPluginInterface {

class IHost;

/// What the host calls of a plug-in, by slot: the order of the operations is the interface.
///
/// Threads: every operation, the destructor too, runs on the host's own thread, which is the Qt GUI
/// thread where the host has windows.
class IPlugin
{
public:
    virtual ~IPlugin() = default;

    // Two texts and four flags whose meaning is the host's; the defaults are what it expects of a
    // plug-in that has nothing to say.
    virtual std::string FirstTextQuery() { return std::string(); }
    virtual std::string SecondTextQuery() { return std::string(); }
    virtual bool FirstQuery() { return true; }
    virtual bool SecondQuery() { return true; }
    virtual bool ThirdQuery() { return true; }
    virtual bool FourthQuery() { return true; }

    /// Takes the host's services and starts work. Called once, before InitialiseGUI.
    virtual bool Start(IHost& /*host*/) { return true; }

    /// Called after Start, and only by a host that has windows.
    virtual bool InitialiseGUI(IHost& /*host*/, IQuorixGUI& /*gui*/) { return true; }

    /// Takes the plug-in's providers out of the host; the destructor does the rest.
    virtual void Stop() {}

    /// The number by which the host recognises this interface.
    virtual int GetInterfaceVersion() { return interfaceVersion; }

    static constexpr int interfaceVersion = 108131;
};

} // namespace QuorixPluginInterface
