#include "QuorixDataStore/DataItemUtils.h"

#include "QuorixDataStore/DataValueFlags.h"
#include "utils/LogStatement.h"

namespace {

bool RequiresVerify(std::uint32_t flags)
{
    return (flags & EDataValueFlags::VerifyRequired) != 0;
}

/// Moves a value that is not empty, and leaves its old side as a new one.
void Move(VDataValue& from, VDataValue& to)
{
    if (from.Empty()) {
        return;
    }
    to.Schema = from.EffectiveSchema();
    to.Bytes = std::move(from.Bytes);
    from = VDataValue();
}

} // namespace

namespace DataItemUtils {

const VDataValue* ChooseOtherForRead(const VDataPath& path, EDataValueTarget target,
                                     std::uint32_t flags, const VDataValue& proposed,
                                     const VDataValue& verified)
{
    if (target == EDataValueTarget::Verified) {
        return &verified;
    }
    if (!RequiresVerify(flags)) {
        if (target == EDataValueTarget::Proposed) {
            KVR_LOG("DataStore", 3,
                    "Attempt to get Proposed value without flag EDataValueFlags::VerifyRequired "
                    "for value '%1%'.",
                    path.Text());
        }
        // Deliberate: any other number reads verified without a word, since a caller that knows
        // only items with a single truth may pass what it likes.
        return &verified;
    }
    if (target == EDataValueTarget::Proposed) {
        return &proposed;
    }
    KVR_LOG("DataStore", 2, "Unknown value target while trying to read value '%1%'.", path.Text());
    return nullptr;
}

bool Read(const VDataPath& path, EDataValueTarget target, std::uint32_t flags,
          const VDataValue& proposed, const VDataValue& verified, VDataValue& destination)
{
    const VDataValue* chosen = ChooseForRead(path, target, flags, proposed, verified);
    if (chosen == nullptr) {
        return false;
    }
    if (!chosen->Empty()) {
        Copy(*chosen, destination);
    }
    return true;
}

bool WriteOther(const VDataPath& path, EDataValueTarget target, std::uint32_t flags,
                const VDataValue& value, VDataValue& proposed, VDataValue& verified)
{
    if (target == EDataValueTarget::Verified) {
        Copy(value, verified);
        return true;
    }
    if (!RequiresVerify(flags)) {
        if (target == EDataValueTarget::Proposed) {
            KVR_LOG("DataStore", 3,
                    "Attempt to set Proposed value without flag EDataValueFlags::VerifyRequired "
                    "for value '%1%'.",
                    path.Text());
        }
        Copy(value, verified);
        return true;
    }
    if (target == EDataValueTarget::Proposed) {
        Copy(value, proposed);
        return true;
    }
    KVR_LOG("DataStore", 2, "Unknown value target while trying to set value '%1%'.", path.Text());
    return false;
}

void MoveForFlags(std::uint32_t oldFlags, std::uint32_t newFlags, VDataValue& proposed,
                  VDataValue& verified)
{
    if (RequiresVerify(oldFlags) == RequiresVerify(newFlags)) {
        return;
    }
    if (RequiresVerify(newFlags)) {
        Move(verified, proposed);
    } else {
        Move(proposed, verified);
    }
}

} // namespace DataItemUtils
