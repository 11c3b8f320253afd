#include "DebugServices/StandardErrorLog.h"

#include <spdlog/details/log_msg.h>
#include <spdlog/sinks/stdout_sinks.h>

namespace DebugServices {

namespace {

spdlog::level::level_enum NamedLevel(int level)
{
    // The levels in use have names of their own; those between them belong to no message of ours.
    if (level <= 1) {
        return spdlog::level::critical;
    }
    switch (level) {
    case 2:
        return spdlog::level::err;
    case 3:
        return spdlog::level::warn;
    case 4:
        return spdlog::level::info;
    case 5:
        return spdlog::level::debug;
    default:
        return spdlog::level::trace;
    }
}

/// Returns the text with its control characters written out. Messages hold what devices sent, and a
/// line feed or a terminal's escape sequence of theirs must not pass for a line of this log.
std::string OnOneLine(const std::string& text)
{
    static const char digits[] = "0123456789ABCDEF";
    std::string line;
    line.reserve(text.size());
    for (const char character : text) {
        const auto byte = static_cast<unsigned char>(character);
        if (character == '\n') {
            line += "\\n";
        } else if (character != '\t' && (byte < 0x20 || byte == 0x7F)) {
            line += {'\\', 'x', digits[byte >> 4], digits[byte & 0xF]};
        } else {
            line += character;
        }
    }
    return line;
}

} // namespace

class VStandardErrorLog::VCategory : public KVR::ILogCategory
{
public:
    explicit VCategory(const std::string& categoryName) : name(categoryName) {}

    int GetLevel() const override { return level.load(std::memory_order_relaxed); }
    const std::string& GetName() const override { return name; }

    void SetLevel(int newLevel) { level.store(newLevel, std::memory_order_relaxed); }

private:
    const std::string name;
    std::atomic<int> level{DefaultLogLevel};
};

VStandardErrorLog::VStandardErrorLog() : sink(std::make_unique<spdlog::sinks::stderr_sink_mt>())
{
    sink->set_pattern("%Y-%m-%d %H:%M:%S.%e %l [%n] %v");
}

VStandardErrorLog::~VStandardErrorLog() = default;

KVR::ILogCategory* VStandardErrorLog::GetCategory(const std::string& name)
{
    return &Category(name);
}

void VStandardErrorLog::Log(const std::string& text, const KVR::ILogCategory* category, int level,
                            const char* /*file*/, int /*line*/)
{
    try {
        const std::string line = OnOneLine(text);
        const std::string name = category != nullptr ? OnOneLine(category->GetName()) : "";
        sink->log(spdlog::details::log_msg(name, NamedLevel(level), line));
    } catch (const std::exception&) {
        // Standard error is closed or memory has run out; there is nowhere left to say it.
    }
}

void VStandardErrorLog::SetLevel(const std::string& category, int level)
{
    Category(category).SetLevel(level);
}

VStandardErrorLog::VCategory& VStandardErrorLog::Category(const std::string& name)
{
    const std::lock_guard<std::mutex> lock(mutex);
    std::unique_ptr<VCategory>& category = categories[name];
    if (!category) {
        category = std::make_unique<VCategory>(name);
    }
    return *category;
}

} // namespace DebugServices
