#pragma once

#include "io/DataValue.h"

#include <cstdint>
#include <string>

// How every caller makes a value and reads one. None of these throws but for want of memory; all
// may be called on any thread.

/// Each makes a value of the plain type in its name. One name for all of them would take a
/// character string for a bool.
VDataValue MakeBoolValue(bool value);
VDataValue MakeUInt32Value(std::uint32_t value);
VDataValue MakeDoubleValue(double value);

/// Makes a value of the type String; a text of 4 GiB or more gives an empty value.
VDataValue MakeStringValue(const std::string& value);

/// Makes a value of an enum. The number need not be one of its entries, but must fit the width of
/// its type: a number that does not, or a schema that is no enum, gives an empty value.
VDataValue MakeEnumValue(const KVR::IO::ISchema& schema, std::int32_t number);

/// Reads a value whose type is the one of `result` and whose bytes are exactly one such value. The
/// type is compared, not the schema: a role or a type name is no hindrance.
///
/// @return false, with `result` untouched, for any other value
bool ReadValue(const VDataValue& value, bool& result);
bool ReadValue(const VDataValue& value, std::int8_t& result);
bool ReadValue(const VDataValue& value, std::int16_t& result);
bool ReadValue(const VDataValue& value, std::int32_t& result);
bool ReadValue(const VDataValue& value, std::int64_t& result);
bool ReadValue(const VDataValue& value, std::uint8_t& result);
bool ReadValue(const VDataValue& value, std::uint16_t& result);
bool ReadValue(const VDataValue& value, std::uint32_t& result);
bool ReadValue(const VDataValue& value, std::uint64_t& result);
bool ReadValue(const VDataValue& value, float& result);
bool ReadValue(const VDataValue& value, double& result);
bool ReadValue(const VDataValue& value, std::string& result);

/// Returns whether the first byte is not 0, whatever the type; false without bytes.
bool ReadBool(const VDataValue& value);

/// Returns the first 4 bytes as a number, whatever the type, or 0 if there are fewer.
std::uint32_t ReadUInt32OrZero(const VDataValue& value);

/// Returns the text of a String, or "" for another type or for bytes that end before the text.
std::string ReadString(const VDataValue& value);
