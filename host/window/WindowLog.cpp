#include "window/WindowLog.h"

#include "DebugServices/Clock.h"

#include <utility>

namespace QuorixHost {

VWindowLog& VWindowLog::Installed()
{
    static VWindowLog& log = *new VWindowLog;
    return log;
}

VWindowLog::VWindowLog() : before(DebugServices::SetGlobalLog(this)) {}

KVR::ILogCategory* VWindowLog::GetCategory(const std::string& name)
{
    {
        const KVR::VMutexLock lock(mutex);
        categories.insert(name);
    }
    return before->GetCategory(name);
}

void VWindowLog::Log(const std::string& text, const KVR::ILogCategory* category, int level,
                     const char* file, int line)
{
    before->Log(text, category, level, file, line);

    boost::function<void()> told;
    {
        const KVR::VMutexLock lock(mutex);
        lines.push_back({DebugServices::SystemMilliseconds(), level,
                         category != nullptr ? category->GetName() : std::string(), text});
        if (lines.size() > mostLines) {
            lines.pop_front();
        }
        categories.insert(lines.back().Category);
        told = listener;
    }
    if (told) {
        told();
    }
}

void VWindowLog::SetListener(boost::function<void()> newListener)
{
    const KVR::VMutexLock lock(mutex);
    listener.swap(newListener); // the old one goes after the lock
}

std::deque<VLogLine> VWindowLog::TakeLines()
{
    const KVR::VMutexLock lock(mutex);
    return std::exchange(lines, {});
}

std::vector<std::string> VWindowLog::CategoryNames() const
{
    const KVR::VMutexLock lock(mutex);
    return {categories.begin(), categories.end()};
}

} // namespace QuorixHost
