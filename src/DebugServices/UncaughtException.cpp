#include "DebugServices/UncaughtException.h"

#include "DebugServices/Log.h"
#include "DebugServices/ThreadName.h"

#include <boost/core/demangle.hpp>

#include <cxxabi.h>

#include <exception>
#include <string>
#include <typeinfo>

namespace DebugServices {

namespace {

/// Describes the exception that the caller handles; there may be none.
std::string CurrentExceptionText()
{
    const std::type_info* const type = abi::__cxa_current_exception_type();
    if (type == nullptr) {
        return "no exception";
    }
    try {
        throw;
    } catch (const std::exception& exception) {
        return boost::core::demangle(type->name()) + ": " + exception.what();
    } catch (...) {
        return boost::core::demangle(type->name());
    }
}

} // namespace

void ReportUncaughtException(const char* category) noexcept
{
    constexpr int level = 2;
    try {
        KVR::ILogCategorised& log = KVR::GlobalLog();
        const KVR::ILogCategory* const where = log.GetCategory(category != nullptr ? category : "");
        if (where == nullptr || where->GetLevel() < level) {
            return;
        }
        const std::string text =
            "Thread \"" + GetThreadName() + "\" ended by an exception: " + CurrentExceptionText();
        log.Log(text, where, level, __FILE__, __LINE__);
    } catch (...) {
        // Without memory even for a line of log there is nobody left to tell.
    }
}

} // namespace DebugServices
