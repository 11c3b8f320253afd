#pragma once

#include "DebugServices/Log.h"

#include <algorithm>
#include <mutex>
#include <string>
#include <vector>

namespace TestSupport {

/// One message as the process's log received it.
struct VLoggedMessage
{
    std::string Text;
    std::string Category;
    int Level = 0;
    std::string File;
    int Line = 0;
};

/// The log behind every `VLogCapture`. Never destroyed, as other threads may be inside it when a
/// capture ends; without a capture it hands everything to the log that it replaced.
class VCapturingLog : public KVR::ILogCategorised
{
public:
    static VCapturingLog& Installed()
    {
        static VCapturingLog& log = *new VCapturingLog;
        return log;
    }

    KVR::ILogCategory* GetCategory(const std::string& name) override
    {
        return replaced->GetCategory(name);
    }

    void Log(const std::string& text, const KVR::ILogCategory* category, int level,
             const char* file, int line) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        if (targets.empty()) {
            replaced->Log(text, category, level, file, line);
            return;
        }
        targets.back()->push_back({text, category != nullptr ? category->GetName() : "", level,
                                   file != nullptr ? file : "", line});
    }

    void Begin(std::vector<VLoggedMessage>* target)
    {
        const std::lock_guard<std::mutex> lock(mutex);
        targets.push_back(target);
    }

    void End(std::vector<VLoggedMessage>* target)
    {
        const std::lock_guard<std::mutex> lock(mutex);
        targets.erase(std::remove(targets.begin(), targets.end(), target), targets.end());
    }

    std::vector<VLoggedMessage> Copy(const std::vector<VLoggedMessage>& target)
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return target;
    }

private:
    VCapturingLog() : replaced(DebugServices::SetGlobalLog(this)) {}

    KVR::ILogCategorised* const replaced;
    std::mutex mutex; // guards the list and what it points at
    std::vector<std::vector<VLoggedMessage>*> targets;
};

/// Keeps what the process logs for its own lifetime, instead of writing it to standard error. The
/// levels of the categories hold as ever. Of several captures the youngest receives.
class VLogCapture
{
public:
    VLogCapture() { VCapturingLog::Installed().Begin(&messages); }
    ~VLogCapture() { VCapturingLog::Installed().End(&messages); }

    VLogCapture(const VLogCapture&) = delete;
    VLogCapture& operator=(const VLogCapture&) = delete;

    /// Returns what was logged so far, in order. [any]
    std::vector<VLoggedMessage> Messages() const
    {
        return VCapturingLog::Installed().Copy(messages);
    }

    /// Returns the texts of one category's messages, in order. [any]
    std::vector<std::string> Texts(const std::string& category) const
    {
        std::vector<std::string> texts;
        for (const VLoggedMessage& message : Messages()) {
            if (message.Category == category) {
                texts.push_back(message.Text);
            }
        }
        return texts;
    }

private:
    std::vector<VLoggedMessage> messages;
};

/// Gives a log category another level for its own lifetime.
class VLogLevel
{
public:
    VLogLevel(const std::string& category, int level)
        : name(category), previous(KVR::GlobalLog().GetCategory(category)->GetLevel())
    {
        DebugServices::SetLogLevel(category, level);
    }
    ~VLogLevel() { DebugServices::SetLogLevel(name, previous); }

    VLogLevel(const VLogLevel&) = delete;
    VLogLevel& operator=(const VLogLevel&) = delete;

private:
    const std::string name;
    const int previous;
};

} // namespace TestSupport
