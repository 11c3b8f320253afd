#pragma once

#include "DebugServices/Export.h"

namespace DebugServices {

/// Reports a crash of the thread that made it, for as long as it lives: the thread's name, the
/// signal and a stack trace go to standard error, and the process then ends by that same signal.
///
/// Heard are SIGSEGV, SIGBUS, SIGFPE, SIGILL and SIGABRT, hence also `std::terminate`, which ends
/// in an abort. The report runs on a stack of its own, so that an overflow of the thread's is told
/// too. A signal for which somebody else has a handler stays with that handler: the sanitizers'
/// reports and a host's own crash handling are not disturbed.
///
/// Threads: made and destroyed on the thread it stands for, in the order of a stack; objects on
/// several threads, and further ones on the same thread, are fine.
/// Failure: without memory for the stack of its own, the thread is reported from its normal stack.
class KVR_DEBUG_SERVICES_EXPORT VCrashHandlerForThread
{
public:
    VCrashHandlerForThread();
    ~VCrashHandlerForThread();

    VCrashHandlerForThread(const VCrashHandlerForThread&) = delete;
    VCrashHandlerForThread& operator=(const VCrashHandlerForThread&) = delete;
};

} // namespace DebugServices
