#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

namespace KVR {

// Times are counts of milliseconds since the Unix epoch; texts and fields are in local time, whose
// zone is looked up anew at each call. Every function [any].

/// A local time in its parts.
struct VTimeFields
{
    int Year = 0;        ///< in full
    int Month = 0;       ///< from 1
    int Day = 0;         ///< from 1
    int Hour = 0;        ///< 0 to 23
    int Minute = 0;      ///< 0 to 59
    int Second = 0;      ///< 0 to 59
    int Millisecond = 0; ///< 0 to 999
    int Daylight = -1;   ///< 1 daylight saving time, 0 standard time, negative unknown
};

/// Returns a time as "2024-07-31 18:05:09", without `withDate` as "18:05:09"; behind it come ".500"
/// with `withMilliseconds` and then " DST" or " ST" with `withZone`.
std::string FormatTime(std::uint64_t milliseconds, bool withMilliseconds, bool withDate,
                       bool withZone);

/// Returns a time as "2024-07-31 18.05.09", which can stand in a file name; behind it comes ".500"
/// with `withMilliseconds`.
std::string FormatFileTime(std::uint64_t milliseconds, bool withMilliseconds);

/// Reads what `FormatTime` makes, with or without date, milliseconds and zone, except for a time of
/// day alone, which must have milliseconds or a zone. Today's date stands in for a missing one.
///
/// Fields outside their range roll over into the next one, as in the 31st of June.
///
/// @param text         of `length` characters
/// @param requireDate  whether a text without a date fails
/// @param result       set on success only
/// @return false for a text of another form and for a time that `JoinTime` refuses
bool ParseTime(const char* text, std::size_t length, bool requireDate, std::uint64_t& result);

/// Returns the parts of a time; empty where the runtime library has no date for it.
std::optional<VTimeFields> SplitTime(std::uint64_t milliseconds);

/// Returns the time of its parts. An unknown daylight flag is found out from the date; any other
/// part outside its range rolls over, except for `Millisecond`.
///
/// @return empty for milliseconds outside 0 to 999 and for times before the epoch
std::optional<std::uint64_t> JoinTime(const VTimeFields& fields);

} // namespace KVR
