#include "QuorixDataStore/DataChanges.h"

#include "QuorixDataStore/DataItemUtils.h"
#include "io/SchemaEquality.h"

#include <vector>

bool VDataChanges::SetValue(const VDataToken& token, const VDataValue& value,
                            EDataValueTarget target)
{
    if (!token.IsValid() || value.Empty()) {
        return false;
    }
    const VDataAddress address = visible.Address(token);
    const VDataItemDelta* record = visible.Pending(address);

    // Silent, and against the committed state first: once an item has a committed value, the schema
    // that it first got is the only one that it accepts.
    const KVR::IO::ISchema* held = VVisibleData::FindSchema(address, record);
    const KVR::IO::ISchema* offered = value.EffectiveSchema();
    if (held != nullptr && held != offered && !KVR::IO::RoleAwareEqual(*held, *offered)) {
        return false;
    }

    const VDataValue* seen = VVisibleData::Exists(address, record)
                                 ? VVisibleData::FindValue(address, record, target)
                                 : nullptr;
    if (seen == nullptr) {
        const bool recorded = delta.RecordValue(address, target, value);
        if (address.Item != nullptr) {
            // Whether it applied is all one: the value is recorded already.
            static_cast<void>(delta.RestoreValue(address, target, value));
        }
        return recorded;
    }
    if (DataItemUtils::Equal(*seen, value)) {
        return true;
    }
    if (address.Item != nullptr && delta.RestoreValue(address, target, value)) {
        return true;
    }
    return delta.RecordValue(address, target, value);
}

bool VDataChanges::SetValues(const VDataPath& path, const VDataValue& value,
                             EDataValueTarget target)
{
    std::vector<VDataToken> tokens;
    static_cast<void>(visible.FindTokens(path, tokens)); // none is no failure
    bool all = true;
    for (const VDataToken& token : tokens) {
        all = SetValue(token, value, target) && all;
    }
    return all;
}

bool VDataChanges::Remove(const VDataToken& token, bool restorable)
{
    const VDataAddress address = visible.Address(token);
    if (!VVisibleData::Exists(address, visible.Pending(address))) {
        return false;
    }
    delta.RecordRemoval(address, restorable);
    return true;
}

bool VDataChanges::RemoveEach(const VDataPath& path, bool restorable)
{
    std::vector<VDataToken> tokens;
    static_cast<void>(visible.FindTokens(path, tokens)); // none is no failure
    bool all = true;
    for (const VDataToken& token : tokens) {
        all = Remove(token, restorable) && all;
    }
    return all;
}

bool VDataChanges::SetFlags(const VDataToken& token, std::uint32_t flags)
{
    if (!token.IsValid()) {
        return false;
    }
    const VDataAddress address = visible.Address(token);
    std::uint32_t seen = 0;
    if (visible.GetFlags(token, seen)) {
        if (seen == flags) {
            return true;
        }
        if (address.Item != nullptr && delta.RestoreFlags(address, flags)) {
            return true;
        }
        delta.RecordFlags(address, flags);
        return true;
    }
    delta.RecordFlags(address, flags);
    if (address.Item != nullptr) {
        // Whether it applied is all one: the flags are recorded already.
        static_cast<void>(delta.RestoreFlags(address, flags));
    }
    return true;
}
