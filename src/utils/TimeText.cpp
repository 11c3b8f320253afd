#include "utils/TimeText.h"

#include "DebugServices/Clock.h"

#include <cstdio>
#include <ctime>
#include <limits>
#include <string_view>

namespace KVR {

namespace {

constexpr std::uint64_t millisecondsPerSecond = 1000;

/// Converts to local time. `localtime` itself shares one buffer between all threads; it looks the
/// time zone up at each call, which its sibling leaves to the caller.
bool ToLocalTime(std::uint64_t milliseconds, std::tm& fields)
{
    const auto seconds = static_cast<std::time_t>(milliseconds / millisecondsPerSecond);
    tzset();
    return localtime_r(&seconds, &fields) != nullptr;
}

/// Prints local time by a format of `strftime`, and the milliseconds behind it if wanted.
std::string Print(const std::tm& fields, const char* format, std::uint64_t milliseconds,
                  bool withMilliseconds)
{
    char buffer[100];
    std::string text(buffer, std::strftime(buffer, sizeof buffer, format, &fields));
    if (withMilliseconds) {
        const auto remainder = static_cast<unsigned>(milliseconds % millisecondsPerSecond);
        std::snprintf(buffer, sizeof buffer, ".%03u", remainder);
        text += buffer;
    }
    return text;
}

/// Reads a number of decimal digits only; signs and blanks, which `strtol` takes, are refused.
bool ReadDigits(std::string_view text, int& number)
{
    int value = 0;
    for (const char character : text) {
        if (character < '0' || character > '9') {
            return false;
        }
        value = value * 10 + (character - '0');
    }
    number = value;
    return true;
}

/// Reads "2024-07-31 ", the blank included.
bool ReadDate(std::string_view text, VTimeFields& fields)
{
    return text[4] == '-' && text[7] == '-' && text[10] == ' ' &&
           ReadDigits(text.substr(0, 4), fields.Year) &&
           ReadDigits(text.substr(5, 2), fields.Month) && ReadDigits(text.substr(8, 2), fields.Day);
}

/// Reads "18:05:09".
bool ReadTimeOfDay(std::string_view text, VTimeFields& fields)
{
    return text[2] == ':' && text[5] == ':' && ReadDigits(text.substr(0, 2), fields.Hour) &&
           ReadDigits(text.substr(3, 2), fields.Minute) &&
           ReadDigits(text.substr(6, 2), fields.Second);
}

/// Reads what follows the time of day: nothing, ".500", a zone, or both.
bool ReadFractionAndZone(std::string_view text, VTimeFields& fields)
{
    constexpr std::size_t fractionLength = 4;
    if (text.size() >= fractionLength && text[0] == '.') {
        if (!ReadDigits(text.substr(1, fractionLength - 1), fields.Millisecond)) {
            return false;
        }
        text.remove_prefix(fractionLength);
    }

    if (text == " DST") {
        fields.Daylight = 1;
    } else if (text == " ST") {
        fields.Daylight = 0;
    } else if (text.empty()) {
        fields.Daylight = -1;
    } else {
        return false;
    }
    return true;
}

bool SetToday(VTimeFields& fields)
{
    const std::int64_t now = DebugServices::SystemMilliseconds();
    const std::optional<VTimeFields> today =
        now < 0 ? std::nullopt : SplitTime(static_cast<std::uint64_t>(now));
    if (!today) {
        return false;
    }
    fields.Year = today->Year;
    fields.Month = today->Month;
    fields.Day = today->Day;
    return true;
}

} // namespace

std::string FormatTime(std::uint64_t milliseconds, bool withMilliseconds, bool withDate,
                       bool withZone)
{
    std::tm fields = {};
    if (!ToLocalTime(milliseconds, fields)) {
        return std::string();
    }

    const char* const format = withDate ? "%Y-%m-%d %H:%M:%S" : "%H:%M:%S";
    std::string text = Print(fields, format, milliseconds, withMilliseconds);
    if (withZone && fields.tm_isdst == 1) {
        text += " DST";
    } else if (withZone && fields.tm_isdst == 0) {
        text += " ST";
    } // else the runtime library does not know
    return text;
}

std::string FormatFileTime(std::uint64_t milliseconds, bool withMilliseconds)
{
    std::tm fields = {};
    if (!ToLocalTime(milliseconds, fields)) {
        return std::string();
    }
    return Print(fields, "%Y-%m-%d %H.%M.%S", milliseconds, withMilliseconds);
}

bool ParseTime(const char* text, std::size_t length, bool requireDate, std::uint64_t& result)
{
    constexpr std::size_t shortest = 10;
    constexpr std::size_t longest = 27;
    constexpr std::size_t dateLength = 11; // with the blank
    constexpr std::size_t timeLength = 8;
    if (text == nullptr || length < shortest || length > longest) {
        return false;
    }

    std::string_view rest(text, length);
    VTimeFields fields;
    if (length >= dateLength + timeLength) {
        if (!ReadDate(rest, fields)) {
            return false;
        }
        rest.remove_prefix(dateLength);
    } else if (requireDate || !SetToday(fields)) {
        return false;
    }

    if (!ReadTimeOfDay(rest, fields) || !ReadFractionAndZone(rest.substr(timeLength), fields)) {
        return false;
    }

    const std::optional<std::uint64_t> milliseconds = JoinTime(fields);
    if (!milliseconds) {
        return false;
    }
    result = *milliseconds;
    return true;
}

std::optional<VTimeFields> SplitTime(std::uint64_t milliseconds)
{
    std::tm local = {};
    if (!ToLocalTime(milliseconds, local)) {
        return std::nullopt;
    }

    VTimeFields fields;
    fields.Year = local.tm_year + 1900;
    fields.Month = local.tm_mon + 1;
    fields.Day = local.tm_mday;
    fields.Hour = local.tm_hour;
    fields.Minute = local.tm_min;
    fields.Second = local.tm_sec;
    fields.Millisecond = static_cast<int>(milliseconds % millisecondsPerSecond);
    fields.Daylight = local.tm_isdst;
    return fields;
}

std::optional<std::uint64_t> JoinTime(const VTimeFields& fields)
{
    if (fields.Millisecond < 0 || fields.Millisecond > 999) {
        return std::nullopt;
    }
    constexpr int lowest = std::numeric_limits<int>::min();
    if (fields.Year < lowest + 1900 || fields.Month < lowest + 1) {
        return std::nullopt;
    }

    std::tm local = {};
    local.tm_year = fields.Year - 1900;
    local.tm_mon = fields.Month - 1;
    local.tm_mday = fields.Day;
    local.tm_hour = fields.Hour;
    local.tm_min = fields.Minute;
    local.tm_sec = fields.Second;
    local.tm_isdst = fields.Daylight;
    const std::time_t seconds = std::mktime(&local);

    // -1 is the runtime library's word for failure; times before the epoch have no count here.
    constexpr std::uint64_t mostSeconds =
        std::numeric_limits<std::uint64_t>::max() / millisecondsPerSecond - 1;
    if (seconds < 0 || static_cast<std::uint64_t>(seconds) > mostSeconds) {
        return std::nullopt;
    }
    return static_cast<std::uint64_t>(seconds) * millisecondsPerSecond +
           static_cast<std::uint64_t>(fields.Millisecond);
}

} // namespace KVR
