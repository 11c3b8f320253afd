#pragma once

#include "io/SchemaTextMode.h"

#include <string>
#include <vector>

struct VDataValue;

namespace KVR {
namespace IO {

struct ISchema;

/// Replaces `text` by the text of the value that `bytes` hold under `schema`.
///
/// @return false for a part of type Void or Ref, an enum value without an entry, a String whose
///         length runs past the end, an Array or List without exactly one part, and elements that
///         no bytes stand behind above 2^20 in one list or 4 MiB of text in all; `text` then holds
///         what was written so far
/// @throws std::runtime_error "Unexpected end of binary data" where any other part is cut off [any]
bool BinaryToText(const std::vector<unsigned char>& bytes, const ISchema& schema, std::string& text,
                  SchemaTextMode mode = SchemaTextMode(1));

/// As above, in mode 4 if `quoted` is true and in mode 3 if not. [any]
bool BinaryToText(const std::vector<unsigned char>& bytes, const ISchema& schema, std::string& text,
                  bool quoted);

/// A bare number names no mode: it would be taken for a bool, so that 3 became mode 4.
bool BinaryToText(const std::vector<unsigned char>& bytes, const ISchema& schema, std::string& text,
                  int mode) = delete;

/// Replaces `bytes` by the value that the text from `begin` to `end` stands for, and moves `begin`
/// to where reading stopped. What follows the value is the caller's affair: compare `begin` with
/// `end`. Mode 3 reads the bare row; any other reads tuples by position or by member name.
///
/// @return false if the text does not parse, with `bytes` in whatever state they reached [any]
bool TextToBinary(const char*& begin, const char* end, const ISchema& schema,
                  std::vector<unsigned char>& bytes, SchemaTextMode mode);

} // namespace IO
} // namespace KVR

/// Returns the text of a value in mode 3, which is what a device is shown, or "" for a value that
/// has no text or is cut off: a device never sees half a value. [any]
std::string ValueToText(const VDataValue& value);
