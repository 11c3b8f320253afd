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

void AppendCode(std::string& line, unsigned char byte)
{
    static const char digits[] = "0123456789ABCDEF";
    line += {'\\', 'x', digits[byte >> 4], digits[byte & 0xF]};
}

/// Whether a byte and the one behind it are a control character beyond ASCII, in UTF-8. Among these
/// is one that begins an escape sequence by itself.
bool IsLateControl(unsigned char byte, unsigned char next)
{
    return byte == 0xC2 && next >= 0x80 && next < 0xA0;
}

/// Returns the text with its control characters written out. Messages hold what devices sent, and a
/// line feed or a terminal's escape sequence of theirs must not pass for a line of this log.
std::string OnOneLine(const std::string& text)
{
    std::string line;
    line.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        const auto byte = static_cast<unsigned char>(text[i]);
        if (byte == '\n') {
            line += "\\n";
        } else if (byte != '\t' && (byte < 0x20 || byte == 0x7F)) {
            AppendCode(line, byte);
        } else if (i + 1 < text.size() &&
                   IsLateControl(byte, static_cast<unsigned char>(text[i + 1]))) {
            AppendCode(line, byte);
            AppendCode(line, static_cast<unsigned char>(text[++i]));
        } else {
            line += text[i];
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
