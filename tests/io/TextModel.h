#pragma once

#include "io/ISchema.h"

#include <vector>

/// Carries a value over from one schema to another the slow way: it writes the value as text, picks
/// the texts of members and enum entries by name, and reads the new text. It knows nothing of
/// readers.
///
/// @param stored  a schema from which values can be carried over, whose member names differ
/// @return false if the value has no text under one of the schemas
bool ConvertThroughText(const KVR::IO::ISchema& stored, const std::vector<unsigned char>& bytes,
                        const KVR::IO::ISchema& current, std::vector<unsigned char>& result);
