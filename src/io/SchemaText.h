#pragma once

#include "io/SchemaTextMode.h"

#include <string>

struct VDataValue;

namespace KVR {
namespace IO {

struct ISchema;

/// Appends the text of a schema. Mode 3 gives a summary that does not read back; so does any mode
/// for a name that holds a tab or a zero byte.
///
/// @return false if a member could not be written, which no schema in memory brings about [any]
bool WriteSchemaText(std::string& output, const ISchema& schema, SchemaTextMode mode);

/// Reads a schema from zero-terminated text, in either of its forms, and moves `text` behind it. At
/// most 256 schemas lie within each other, which bounds all that recurses over a schema.
///
/// @return false on a syntax error, with `schema` and `text` in whatever state they reached [any]
bool ReadSchemaText(ISchema& schema, const char*& text);

/// Empties the bytes of `value`, then reads a schema from zero-terminated text and gives its
/// interned instance to `value`. Text behind the schema is accepted.
///
/// @return false on a syntax error, with the schema of `value` as it was [any]
bool ParseSchemaText(VDataValue& value, const char* text);

} // namespace IO
} // namespace KVR
