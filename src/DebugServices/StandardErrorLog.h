#pragma once

#include "DebugServices/Log.h"

#include <atomic>
#include <map>
#include <memory>
#include <mutex>

namespace spdlog::sinks {
class sink;
}

namespace DebugServices {

/// Writes each message as one line of time, level, category and text to standard error.
///
/// Owns: its categories, which are never removed.
/// Threads: every operation [any]; lines of several threads do not mix.
/// Failure: a line that cannot be written is lost, and nobody hears of it.
class VStandardErrorLog : public KVR::ILogCategorised
{
public:
    VStandardErrorLog();
    ~VStandardErrorLog() override;

    KVR::ILogCategory* GetCategory(const std::string& name) override;
    void Log(const std::string& text, const KVR::ILogCategory* category, int level,
             const char* file, int line) override;

    /// Sets the level of a category, which is made if nobody has fetched it yet.
    void SetLevel(const std::string& category, int level);

private:
    class VCategory;

    VCategory& Category(const std::string& name);

    std::mutex mutex; // guards the map, not the levels within; a leaf
    std::map<std::string, std::unique_ptr<VCategory>> categories;
    std::unique_ptr<spdlog::sinks::sink> sink;
};

} // namespace DebugServices
