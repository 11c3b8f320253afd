#pragma once

namespace QuorixHost {

/// Raises the process's soft limit of open files to the hard one, and logs it: each device takes a
/// descriptor, and without one left the plug-in accepts no device any more until the next start.
void RaiseFileLimit();

} // namespace QuorixHost
