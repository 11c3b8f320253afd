#include "utils/LogStatement.h"

#include "DebugServices/Log.h"

namespace KVR {

bool VLogStatement::Admits(int level) noexcept
{
    try {
        const ILogCategory* const wanted = Category();
        return wanted != nullptr && wanted->GetLevel() >= level;
    } catch (...) {
        return false; // no memory for the category: the statement is tried again next time
    }
}

void VLogStatement::LogArguments(int level, const char* file, int line, const char* format,
                                 const VFormatArgument* arguments, std::size_t count) noexcept
{
    try {
        std::string text;
        const bool formatted = TryFormatMessage(text, format, arguments, count);
        // What cannot be formatted is an error, and goes out without asking the level again.
        constexpr int errorLevel = 2;
        GlobalLog().Log(text, Category(), formatted ? level : errorLevel, file, line);
    } catch (...) {
        // A log that fails must not take down what it watches.
    }
}

ILogCategory* VLogStatement::Category()
{
    ILogCategory* known = category.load(std::memory_order_acquire);
    if (known == nullptr) {
        known = GlobalLog().GetCategory(name);
        category.store(known, std::memory_order_release);
    }
    return known;
}

} // namespace KVR
