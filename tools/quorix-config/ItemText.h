#pragma once

#include <string>

struct VDataValue;

namespace QuorixConfig {

struct VItem;

/// Returns a text as it may be shown: control characters, which could drive a terminal, are
/// written as numbers.
std::string Printable(const std::string& text);

/// Returns a value as it stands in a file, "" for an empty one.
std::string ValueText(const VDataValue& value);

/// Returns the schema of an item as it stands in a file.
std::string FormatText(const VItem& item);

/// Returns the name of an item's type.
std::string TypeName(const VItem& item);

/// Returns an item in one line: its type and its values.
std::string Describe(const VItem& item);

} // namespace QuorixConfig
