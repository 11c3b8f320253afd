#pragma once

#include "DebugServices/Log.h"
#include "utils/Mutex.h"

#include <boost/function.hpp>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <set>
#include <string>
#include <vector>

namespace QuorixHost {

/// One line of the log as a window shows it.
struct VLogLine
{
    std::int64_t Time = 0; ///< milliseconds since the epoch
    int Level = 0;
    std::string Category;
    std::string Text;
};

/// Keeps the youngest lines of the process's log for a window, and passes all on to the log before.
///
/// Never destroyed, as threads may write to it to the end. Owns: the lines kept and the names of
/// the categories seen. Threads: every operation [any].
class VWindowLog : public KVR::ILogCategorised
{
public:
    /// How many lines are kept for a window that does not fetch them.
    static constexpr std::size_t mostLines = 5000;

    /// Returns the process's one, which is put in place at the first call.
    static VWindowLog& Installed();

    KVR::ILogCategory* GetCategory(const std::string& name) override;
    void Log(const std::string& text, const KVR::ILogCategory* category, int level,
             const char* file, int line) override;

    /// Calls a function after each line; an empty one ends it.
    void SetListener(boost::function<void()> listener);

    /// Returns the lines that came since the last call, the oldest left out where there were more
    /// than are kept.
    std::deque<VLogLine> TakeLines();

    std::vector<std::string> CategoryNames() const;

private:
    VWindowLog();

    KVR::ILogCategorised* const before;
    mutable KVR::VMutex mutex;
    std::deque<VLogLine> lines KVR_GUARDED_BY(mutex);
    std::set<std::string> categories KVR_GUARDED_BY(mutex);
    boost::function<void()> listener KVR_GUARDED_BY(mutex);
};

} // namespace QuorixHost
