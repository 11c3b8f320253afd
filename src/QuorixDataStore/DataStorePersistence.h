#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataToken.h"

#include <cstdint>

class IDataVerifyReader;
class IDataVerifyWriter;

/// What an operation leaves out and what it carries: a bit set. 8 has no meaning.
namespace EDataCopyOptions {

constexpr std::uint32_t SkipReadOnly = 1; ///< leave out what is ReadOnly in the source
constexpr std::uint32_t CopyAll = 2;      ///< carry the flags and both values, not only the current
constexpr std::uint32_t SkipExisting = 4; ///< leave out what has a value in the target already
constexpr std::uint32_t SkipNotSerialized = 16; ///< leave out what is NotSerialized in the source

} // namespace EDataCopyOptions

/// How a copy went; a negative number is a failure.
enum class EDataCopyResult : std::int32_t {
    CopyDone = 0,                    ///< written
    CopySkipped = 1,                 ///< nothing to do: left out, or nothing there
    CopyPartial = 2,                 ///< of many items, some failed and some did not
    CopyFailed = INT32_MIN,          ///< 0x80000000: of many items, all failed
    CopyWriteFailed = INT32_MIN + 9, ///< 0x80000009: a value or the flags could not be written
    CopyReadFailed = INT32_MIN + 10, ///< 0x8000000A: the source could not be read
};

/// Moves items between two stores with both truths of each, and removes them, under one filter.
///
/// The caller holds the views, so that a whole copy is one commit. Where source and target are
/// different stores the writer is the inner view. What is found goes to the log category
/// "DataStore". Threads: the one of the views. Failure: every item is tried, whatever came before.
namespace DataStorePersistence {

/// Copies one item.
EDataCopyResult CopyValue(const VDataToken& token, const IDataVerifyReader& source,
                          IDataVerifyWriter& target, std::uint32_t options);

/// Copies every item of the source that the path finds; wildcards are allowed, and "*" is the whole
/// store.
///
/// @return CopySkipped if there is no such item. One that is left out counts as one that went well.
EDataCopyResult CopyValues(const VDataPath& path, const IDataVerifyReader& source,
                           IDataVerifyWriter& target, std::uint32_t options);

/// Removes every item that the path finds and that the two filters of flags let pass.
void RemoveValues(const VDataPath& path, IDataVerifyWriter& target, std::uint32_t options);

} // namespace DataStorePersistence
