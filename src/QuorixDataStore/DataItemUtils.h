#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataValueFlags.h"
#include "QuorixDataStore/DataValueTarget.h"
#include "io/DataValue.h"

#include <cstdint>

/// Which value a target means, and what a change of flags does to the values: the same rules, in
/// the same words, for the committed items and for the pending changes.
///
/// The path is for messages only; they go to the log category "DataStore". Threads: [any].
namespace DataItemUtils {

/// Returns what ChooseForRead tells of targets that only the verify views and odd callers pass.
const VDataValue* ChooseOtherForRead(const VDataPath& path, EDataValueTarget target,
                                     std::uint32_t flags, const VDataValue& proposed,
                                     const VDataValue& verified);

/// Returns the value that a read with this target means, or null where there is no such target.
///
/// @param flags  those that apply: pending ones take the place of the committed ones
inline const VDataValue* ChooseForRead(const VDataPath& path, EDataValueTarget target,
                                       std::uint32_t flags, const VDataValue& proposed,
                                       const VDataValue& verified)
{
    if (target == EDataValueTarget::Current) {
        return (flags & EDataValueFlags::VerifyRequired) != 0 ? &proposed : &verified;
    }
    return ChooseOtherForRead(path, target, flags, proposed, verified);
}

/// Copies the value that the target means. An empty one leaves the destination untouched, and the
/// result is still true; it is false only for an unknown target of an item with VerifyRequired.
bool Read(const VDataPath& path, EDataValueTarget target, std::uint32_t flags,
          const VDataValue& proposed, const VDataValue& verified, VDataValue& destination);

/// Copies one value over another, with the schema of Void in place of none.
inline void Copy(const VDataValue& from, VDataValue& to)
{
    to.Schema = from.Schema != nullptr ? from.Schema : from.EffectiveSchema();
    to.Bytes = from.Bytes;
}

/// Does what Write tells for targets that only the verify views and odd callers pass.
bool WriteOther(const VDataPath& path, EDataValueTarget target, std::uint32_t flags,
                const VDataValue& value, VDataValue& proposed, VDataValue& verified);

/// Replaces the value that the target means. It is false, with nothing written, only for an unknown
/// target of an item with VerifyRequired.
inline bool Write(const VDataPath& path, EDataValueTarget target, std::uint32_t flags,
                  const VDataValue& value, VDataValue& proposed, VDataValue& verified)
{
    if (target == EDataValueTarget::Current) {
        Copy(value, (flags & EDataValueFlags::VerifyRequired) != 0 ? proposed : verified);
        return true;
    }
    return WriteOther(path, target, flags, value, proposed, verified);
}

/// As operator== of values, by the pointers alone where these are enough.
inline bool Equal(const VDataValue& left, const VDataValue& right)
{
    return (left.Schema == right.Schema || left.EffectiveSchema() == right.EffectiveSchema()) &&
           left.Bytes == right.Bytes;
}

/// Moves the value to where it is looked for after a change of VerifyRequired, so that no item
/// loses its content by a change of flags. An empty value moves nothing, and other flags move
/// nothing.
void MoveForFlags(std::uint32_t oldFlags, std::uint32_t newFlags, VDataValue& proposed,
                  VDataValue& verified);

} // namespace DataItemUtils
