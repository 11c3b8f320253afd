#pragma once

namespace QuorixHost {

class VConsole;

/// Adds what the operator does to the plug-in's question, as if by hand:
///
/// - `answer allow|deny|cancel [remember|forget]` sets the check box when told to, and presses the
///   button of that name; cancel does what a device does that withdraws its request
///
/// and `dialog` to what `state` tells: null, or whose request is open and how the check box stands.
void AddWindowCommands(VConsole& console);

} // namespace QuorixHost
