#pragma once

#include <cstdint>
#include <optional>
#include <ostream>
#include <string>

namespace UtilsRapidXml {

/// The version of a file's format, a plain value. One with a negative part is unset, and an unset
/// version passes every check.
struct IVersion
{
    std::int32_t Major = -1;
    std::int32_t Minor = -1;

    bool IsSet() const { return Major >= 0 && Minor >= 0; }
};

bool operator==(const IVersion& left, const IVersion& right);
bool operator!=(const IVersion& left, const IVersion& right);

/// Orders by the major part and then by the minor one, set or not.
bool operator<(const IVersion& left, const IVersion& right);

/// Prints the two parts with a "." between them, and nothing for an unset version.
std::ostream& operator<<(std::ostream& stream, const IVersion& version);

/// Returns the text of a version, which is empty for an unset one.
std::string VersionText(const IVersion& version);

/// Reads decimal digits, a "." and decimal digits, and nothing else.
///
/// @return empty for any other text, and for a part that does not fit 31 bits
std::optional<IVersion> ParseVersion(const std::string& text);

/// Returns whether something that exists from `first` to `last` is supported in a file of version
/// `version`. Each of the three may be unset, and then sets no limit.
bool IsSupported(const IVersion& version, const IVersion& first, const IVersion& last);

} // namespace UtilsRapidXml
