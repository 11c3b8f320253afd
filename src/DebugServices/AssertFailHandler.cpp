#include "DebugServices/AssertFailHandler.h"

#include "DebugServices/Log.h"

#include <cstdlib>
#include <memory>
#include <mutex>
#include <string>
#include <utility>

namespace DebugServices {

namespace {

struct VInstalledHandler
{
    std::mutex mutex; // a leaf: never held while a handler runs or dies
    std::shared_ptr<const AssertFailHandler> handler;
};

VInstalledHandler& Installed()
{
    // Never destroyed: static objects may fail an assertion in their destructors.
    static VInstalledHandler& installed = *new VInstalledHandler;
    return installed;
}

[[noreturn]] void LogAndAbort(const char* expression, const char* file, int line)
{
    KVR::ILogCategorised& log = KVR::GlobalLog();
    const std::string text = std::string("Assertion failed: ") + expression + " (" + file + ":" +
                             std::to_string(line) + ")";
    log.Log(text, log.GetCategory("Assertion"), 2, file, line);
    std::abort();
}

} // namespace

void CallAssertFailHandler(const char* expression, const char* file, int line)
{
    const char* const knownExpression = expression != nullptr ? expression : "";
    const char* const knownFile = file != nullptr ? file : "";

    std::shared_ptr<const AssertFailHandler> handler;
    {
        const std::lock_guard<std::mutex> lock(Installed().mutex);
        handler = Installed().handler;
    }

    if (handler) {
        (*handler)(knownExpression, knownFile, line);
    } else {
        LogAndAbort(knownExpression, knownFile, line);
    }
}

AssertFailHandler SetAssertFailHandler(AssertFailHandler handler)
{
    std::shared_ptr<const AssertFailHandler> next;
    if (!handler.empty()) {
        next = std::make_shared<const AssertFailHandler>(std::move(handler));
    }

    {
        const std::lock_guard<std::mutex> lock(Installed().mutex);
        Installed().handler.swap(next);
    }

    return next ? *next : AssertFailHandler();
}

} // namespace DebugServices
