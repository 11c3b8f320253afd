#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace KVR {

// No function here follows a locale of the process, neither C's nor C++'s: the same text is the
// same number whatever a user's desktop is set to.

/// How a number is printed so that reading it gives the same number again.
constexpr char FloatFormat[] = "%.9g";
constexpr char DoubleFormat[] = "%.17g";

/// Reads a number as C's `sscanf` does: leading blanks, a sign, hexadecimal, "inf" and "nan" pass,
/// and a number too great for the type is infinity. Beside these the spellings of earlier compilers
/// pass, such as "1.#INF", padded with zeros or not.
///
/// @return empty unless the whole text is a number; an empty text is none [any]
std::optional<float> TextToFloat(const std::string& text);
std::optional<double> TextToDouble(const std::string& text);

/// Reads a number that a device sent: decimal digits behind at most one "+", nothing else. A number
/// with a minus sign or above 32 bits is none, as are blanks and an empty text. [any]
std::optional<std::uint32_t> DeviceTextToUInt32(const std::string& text);

/// Reads a number that a device sent: decimal, with or without fraction and exponent, behind at
/// most one sign; "inf" and "nan" pass. Blanks, hexadecimal, an exponent without digits, what does
/// not fit the type and an empty text are none. [any]
std::optional<double> DeviceTextToDouble(const std::string& text);

} // namespace KVR
