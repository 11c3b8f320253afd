#pragma once

#include "io/ISchema.h"

#include <cstdint>
#include <string>
#include <vector>

namespace KVR {
namespace IO {
namespace Detail {

class VVectorReader;
struct VTextCursor;

// Numbers are written and read in runs of one type, so that a long list pays for its type once.

/// True for the integers and the real numbers.
bool IsNumber(EType type);

/// Appends `count` numbers, separated by ",".
///
/// @param type  one for which IsNumber is true
/// @throws std::runtime_error "Unexpected end of binary data"
void WriteNumbers(EType type, std::uint32_t count, VVectorReader& reader, std::string& text);

/// Reads numbers and appends their bytes, with `limit` and `count` as ReadSeparated has them.
/// Blanks around each number are skipped.
///
/// @param type  one for which IsNumber is true
/// @return false if no number of this type stood where one had to
bool ReadNumbers(EType type, std::uint32_t limit, VTextCursor& cursor,
                 std::vector<unsigned char>& bytes, std::uint32_t& count);

} // namespace Detail
} // namespace IO
} // namespace KVR
