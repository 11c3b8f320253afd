#pragma once

#include "utils/FormatMessage.h"

#include <array>
#include <atomic>
#include <cstddef>

namespace KVR {

class ILogCategory;

/// The part of a log statement that stays from one run of it to the next: its category.
///
/// Only the first run looks for the category by name; two threads that meet there find the same.
/// Threads: every operation [any]. Failure: nothing is ever thrown; a message that cannot be
/// written is lost.
class VLogStatement
{
public:
    /// @param categoryName  a literal, kept by its address
    constexpr explicit VLogStatement(const char* categoryName) : name(categoryName) {}

    VLogStatement(const VLogStatement&) = delete;
    VLogStatement& operator=(const VLogStatement&) = delete;

    /// Returns whether the category's level, as it is now, admits a message of `level`.
    bool Admits(int level) noexcept;

    /// Formats and logs. What does not format goes out as a line of level 2 that holds the format.
    template <typename... Args>
    void Log(int level, const char* file, int line, const char* format,
             const Args&... args) noexcept
    {
        const std::array<VFormatArgument, sizeof...(args)> arguments{{VFormatArgument(args)...}};
        LogArguments(level, file, line, format, arguments.data(), arguments.size());
    }

private:
    void LogArguments(int level, const char* file, int line, const char* format,
                      const VFormatArgument* arguments, std::size_t count) noexcept;
    ILogCategory* Category();

    const char* name;
    // Constant-initialised, so that a static one needs no guard. Acquire and release, because the
    // category that another thread fetched must be seen whole.
    std::atomic<ILogCategory*> category{nullptr};
};

} // namespace KVR

/// Logs one line to the category `name` if its level admits `level`. The arguments of a filtered
/// line are not evaluated; a format that does not fit its arguments is logged, never thrown. [any]
#define KVR_LOG(name, level, ...)                                                                  \
    do {                                                                                           \
        static KVR::VLogStatement statement(name); /* fetches its category at first use */         \
        if (statement.Admits(level)) {                                                             \
            statement.Log((level), __FILE__, __LINE__, __VA_ARGS__);                               \
        }                                                                                          \
    } while (false)
