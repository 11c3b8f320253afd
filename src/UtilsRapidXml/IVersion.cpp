#include "UtilsRapidXml/IVersion.h"

#include <charconv>
#include <tuple>

namespace UtilsRapidXml {

namespace {

/// Reads digits up to `stop`, or to the end where that is zero. @return behind them, null if wrong
const char* ParsePart(const char* begin, const char* end, char stop, std::int32_t& part)
{
    if (begin == end || *begin == '-') {
        return nullptr;
    }
    const std::from_chars_result result = std::from_chars(begin, end, part);
    if (result.ec != std::errc()) {
        return nullptr;
    }
    if (stop == 0) {
        return result.ptr == end ? end : nullptr;
    }
    return result.ptr != end && *result.ptr == stop ? result.ptr + 1 : nullptr;
}

} // namespace

bool operator==(const IVersion& left, const IVersion& right)
{
    return left.Major == right.Major && left.Minor == right.Minor;
}

bool operator!=(const IVersion& left, const IVersion& right)
{
    return !(left == right);
}

bool operator<(const IVersion& left, const IVersion& right)
{
    return std::tie(left.Major, left.Minor) < std::tie(right.Major, right.Minor);
}

std::ostream& operator<<(std::ostream& stream, const IVersion& version)
{
    return stream << VersionText(version);
}

std::string VersionText(const IVersion& version)
{
    // Not printed number by number: a stream's locale would group the digits.
    return version.IsSet() ? std::to_string(version.Major) + "." + std::to_string(version.Minor)
                           : std::string();
}

std::optional<IVersion> ParseVersion(const std::string& text)
{
    IVersion version;
    const char* const end = text.data() + text.size();
    const char* const minor = ParsePart(text.data(), end, '.', version.Major);
    if (minor == nullptr || ParsePart(minor, end, 0, version.Minor) == nullptr) {
        return std::nullopt;
    }
    return version;
}

bool IsSupported(const IVersion& version, const IVersion& first, const IVersion& last)
{
    return !version.IsSet() ||
           ((!first.IsSet() || !(version < first)) && (!last.IsSet() || !(last < version)));
}

} // namespace UtilsRapidXml
