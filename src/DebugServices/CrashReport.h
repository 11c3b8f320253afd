#pragma once

namespace DebugServices {

/// Loads what `WriteCrashReport` needs and may not load itself. Not for a signal handler.
void PrepareCrashReport();

/// Writes the calling thread's name, the signal and a stack trace to standard error, by what a
/// signal handler may call: nothing is allocated and no lock of this program is taken.
///
/// @param number   the signal
/// @param address  where the fault was, of meaning for faults only
void WriteCrashReport(int number, const void* address);

} // namespace DebugServices
