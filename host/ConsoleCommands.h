#pragma once

#include <boost/function.hpp>

#include <memory>

class IControlSystem;

namespace QuorixHost {

class VConsole;

/// Adds `fire EVENT [NAME=VALUE]...`, which publishes an event through the dispatcher before it
/// answers. A name given twice keeps the later value.
void AddEventCommands(VConsole& console, const std::shared_ptr<IControlSystem>& controlSystem);

/// Adds `clock +MS`, which moves forward the clock that the whole process compares with, by at most
/// 49 days at once. Timers still take their time.
void AddClockCommand(VConsole& console);

/// Adds `quit`, which answers first and then calls `requestStop`.
void AddStopCommand(VConsole& console, boost::function<void()> requestStop);

} // namespace QuorixHost
