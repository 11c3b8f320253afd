#pragma once

#include <array>
#include <cstddef>
#include <ostream>
#include <string>
#include <type_traits>

namespace KVR {

/// One argument of a message, of any type with an `operator<<`: Boost.Format stays in one source
/// file. It points at the argument, which must outlive it.
class VFormatArgument
{
public:
    template <typename T>
    explicit VFormatArgument(const T& argument) : value(&argument), write(&Write<T>)
    {
        static_assert(!std::is_convertible<const T&, const wchar_t*>::value,
                      "a wide text would print as an address; convert it with WideToUtf8");
    }

    /// A temporary would be gone before it is written.
    template <typename T>
    explicit VFormatArgument(const T&&) = delete;

    /// Writes the argument; whatever its operator throws passes on.
    void WriteTo(std::ostream& stream) const { write(stream, value); }

private:
    template <typename T>
    static void Write(std::ostream& stream, const void* value)
    {
        stream << *static_cast<const T*>(value);
    }

    const void* value;
    void (*write)(std::ostream&, const void*);
};

/// Formats with Boost.Format under the classic locale, whatever the process has set.
///
/// @param arguments  `count` of them, may be null if `count` is 0
/// @return false if the format does not fit its arguments or an argument's operator throws; `text`
/// is then the line that tells so: Cannot Format Log Message "<format>" [any]
bool TryFormatMessage(std::string& text, const char* format, const VFormatArgument* arguments,
                      std::size_t count);

/// Returns the message for a format with %1% placeholders, or the line that tells that it cannot be
/// made. For diagnostics: a wrong format in a rarely used branch throws nothing. [any]
template <typename... Args>
std::string FormatMessage(const char* format, const Args&... args)
{
    const std::array<VFormatArgument, sizeof...(args)> arguments{{VFormatArgument(args)...}};
    std::string text;
    TryFormatMessage(text, format, arguments.data(), arguments.size());
    return text;
}

} // namespace KVR
