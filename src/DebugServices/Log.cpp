#include "DebugServices/Log.h"

#include "DebugServices/StandardErrorLog.h"

#include <atomic>

namespace {

/// The log that stands in place of the one on standard error, null if none does.
std::atomic<KVR::ILogCategorised*> replacement{nullptr};

DebugServices::VStandardErrorLog& StandardErrorLog()
{
    // Never destroyed: static objects and threads that outlive `main` still log.
    static DebugServices::VStandardErrorLog& log = *new DebugServices::VStandardErrorLog;
    return log;
}

} // namespace

namespace KVR {

const std::string& ILogCategory::GetName() const
{
    static const std::string& noName = *new std::string;
    return noName;
}

ILogCategorised& GlobalLog()
{
    ILogCategorised* const log = replacement.load(std::memory_order_acquire);
    return log != nullptr ? *log : StandardErrorLog();
}

} // namespace KVR

namespace DebugServices {

void SetLogLevel(const std::string& category, int level)
{
    StandardErrorLog().SetLevel(category, level);
}

KVR::ILogCategorised* SetGlobalLog(KVR::ILogCategorised* log)
{
    KVR::ILogCategorised* const previous = replacement.exchange(log, std::memory_order_acq_rel);
    return previous != nullptr ? previous : &StandardErrorLog();
}

} // namespace DebugServices
