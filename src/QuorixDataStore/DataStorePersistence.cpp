#include "QuorixDataStore/DataStorePersistence.h"

#include "QuorixDataStore/IDataVerifyReader.h"
#include "QuorixDataStore/IDataVerifyWriter.h"
#include "utils/LogStatement.h"

#include <vector>

namespace {

constexpr std::uint32_t noFlags = 0;

bool HasOption(std::uint32_t options, std::uint32_t option)
{
    return (options & option) != 0;
}

/// Whether the item's flags can be read and hold this one.
bool HasFlag(const IDataReader& reader, const VDataToken& token, std::uint32_t flag)
{
    std::uint32_t flags = noFlags;
    return reader.GetFlags(token, flags) && (flags & flag) != 0;
}

/// The copy of one item: its two tokens, since each store remembers its own numbers in a token.
class VItemCopy
{
public:
    VItemCopy(const VDataToken& token, const IDataVerifyReader& source, IDataVerifyWriter& target)
        : source(source), target(target), sourceToken(token), targetToken(token.GetPath())
    {
    }

    EDataCopyResult Run(std::uint32_t options)
    {
        if (IsSkipped(options)) {
            return EDataCopyResult::CopySkipped;
        }
        if (HasOption(options, EDataCopyOptions::CopyAll)) {
            return CopyAll();
        }
        return HasFlag(source, sourceToken, EDataValueFlags::VerifyRequired) ? CopyProposed()
                                                                             : CopyVerified();
    }

private:
    bool IsSkipped(std::uint32_t options) const
    {
        if (HasOption(options, EDataCopyOptions::SkipExisting) && target.HasValue(targetToken)) {
            KVR_LOG("DataStore", 6, "Skipping value '%1%' that already exists in i_rDataWriter.",
                    Path());
            return true;
        }
        if (HasOption(options, EDataCopyOptions::SkipReadOnly) &&
            HasFlag(source, sourceToken, EDataValueFlags::ReadOnly)) {
            KVR_LOG("DataStore", 6, "Skipping read only value '%1%'.", Path());
            return true;
        }
        if (HasOption(options, EDataCopyOptions::SkipNotSerialized) &&
            HasFlag(source, sourceToken, EDataValueFlags::NotSerialized)) {
            KVR_LOG("DataStore", 6, "Skipping not serialized value '%1%'.", Path());
            return true;
        }
        return false;
    }

    EDataCopyResult CopyAll()
    {
        std::uint32_t flags = noFlags;
        VDataValue verified;
        VDataValue proposed;
        ReadAll(flags, verified, proposed);
        if (verified.Empty() && proposed.Empty()) {
            return EDataCopyResult::CopySkipped; // the flags alone are no item
        }
        return WriteAll(flags, verified, proposed);
    }

    void ReadAll(std::uint32_t& flags, VDataValue& verified, VDataValue& proposed) const
    {
        if (!source.GetFlags(sourceToken, flags)) {
            KVR_LOG("DataStore", 6, "Could not read '%1%' flags.", Path());
            flags = noFlags;
        }
        if (!source.GetVerifiedValue(sourceToken, verified)) {
            KVR_LOG("DataStore", 6, "Could not read '%1%' verified value.", Path());
        }
        if ((flags & EDataValueFlags::VerifyRequired) != 0 &&
            !source.GetProposedValue(sourceToken, proposed)) {
            KVR_LOG("DataStore", 6, "Could not read '%1%' proposed value.", Path());
        }
    }

    EDataCopyResult WriteAll(std::uint32_t flags, const VDataValue& verified,
                             const VDataValue& proposed)
    {
        // Deliberate: one write that succeeds makes the whole a success.
        EDataCopyResult result = EDataCopyResult::CopyWriteFailed;
        if (target.SetFlags(targetToken, flags)) {
            result = EDataCopyResult::CopyDone;
        } else {
            KVR_LOG("DataStore", 2, "Error writing '%1%' value flags", Path());
        }
        if (!verified.Empty()) {
            if (target.SetVerifiedValue(targetToken, verified)) {
                result = EDataCopyResult::CopyDone;
            } else {
                KVR_LOG("DataStore", 2, "Error writing '%1%' verified value", Path());
            }
        }
        if ((flags & EDataValueFlags::VerifyRequired) != 0) {
            // Deliberate: tried also without a proposed value, which the store refuses.
            if (target.SetProposedValue(targetToken, proposed)) {
                result = EDataCopyResult::CopyDone;
            } else {
                KVR_LOG("DataStore", 2, "Error writing '%1%' proposed value", Path());
            }
        }
        return result;
    }

    EDataCopyResult CopyProposed()
    {
        VDataValue value;
        if (!source.GetProposedValue(sourceToken, value)) {
            KVR_LOG("DataStore", 6, "Could not read '%1%' proposed value", Path());
            if (!source.GetVerifiedValue(sourceToken, value)) {
                KVR_LOG("DataStore", 6, "Could not read '%1%' verified value", Path());
                return EDataCopyResult::CopyReadFailed;
            }
        }
        RequireVerify();
        if (!target.SetProposedValue(targetToken, value)) {
            KVR_LOG("DataStore", 2, "Error writing '%1%' proposed value", Path());
            return EDataCopyResult::CopyWriteFailed;
        }
        return EDataCopyResult::CopyDone;
    }

    /// Sees to it that the target's item has a proposed value to write.
    void RequireVerify()
    {
        std::uint32_t flags = noFlags;
        if (!target.GetFlags(targetToken, flags)) {
            flags = noFlags;
        }
        if ((flags & EDataValueFlags::VerifyRequired) != 0) {
            return;
        }
        KVR_LOG("DataStore", 6, "VerifyRequired flag missing in '%1%' target value, setting flag.",
                Path());
        if (!target.SetFlags(targetToken, flags | EDataValueFlags::VerifyRequired)) {
            KVR_LOG("DataStore", 6, "Setting VerifyRequired flag '%1%' failed.", Path());
        }
    }

    EDataCopyResult CopyVerified()
    {
        VDataValue value;
        if (!source.GetVerifiedValue(sourceToken, value)) {
            KVR_LOG("DataStore", 6, "Could not read '%1%' verified value", Path());
            return EDataCopyResult::CopyReadFailed;
        }
        if (!target.SetVerifiedValue(targetToken, value)) {
            // Deliberate: a verified value is written, but who searches logs knows these words.
            KVR_LOG("DataStore", 2, "Error writing '%1%' proposed value", Path());
            return EDataCopyResult::CopyWriteFailed;
        }
        return EDataCopyResult::CopyDone;
    }

    std::string Path() const { return sourceToken.GetPath().Text(); }

    const IDataVerifyReader& source;
    IDataVerifyWriter& target;
    const VDataToken& sourceToken;
    const VDataToken targetToken;
};

EDataCopyResult Aggregate(std::size_t failures, std::size_t others)
{
    if (failures == 0) {
        return others == 0 ? EDataCopyResult::CopySkipped : EDataCopyResult::CopyDone;
    }
    return others == 0 ? EDataCopyResult::CopyFailed : EDataCopyResult::CopyPartial;
}

bool IsKept(const VDataToken& token, const IDataReader& target, std::uint32_t options)
{
    if (HasOption(options, EDataCopyOptions::SkipReadOnly) &&
        HasFlag(target, token, EDataValueFlags::ReadOnly)) {
        KVR_LOG("DataStore", 6, "skipping read only parameter '%1%'", token.GetPath().Text());
        return true;
    }
    if (HasOption(options, EDataCopyOptions::SkipNotSerialized) &&
        HasFlag(target, token, EDataValueFlags::NotSerialized)) {
        KVR_LOG("DataStore", 6, "skipping not serialized value '%1%'.", token.GetPath().Text());
        return true;
    }
    return false;
}

} // namespace

namespace DataStorePersistence {

EDataCopyResult CopyValue(const VDataToken& token, const IDataVerifyReader& source,
                          IDataVerifyWriter& target, std::uint32_t options)
{
    return VItemCopy(token, source, target).Run(options);
}

EDataCopyResult CopyValues(const VDataPath& path, const IDataVerifyReader& source,
                           IDataVerifyWriter& target, std::uint32_t options)
{
    std::vector<VDataToken> tokens;
    static_cast<void>(source.FindTokens(path, tokens)); // without tokens nothing is counted
    std::size_t failures = 0;
    std::size_t others = 0;
    for (const VDataToken& token : tokens) {
        const bool failed =
            static_cast<std::int32_t>(CopyValue(token, source, target, options)) < 0;
        ++(failed ? failures : others);
    }
    return Aggregate(failures, others);
}

void RemoveValues(const VDataPath& path, IDataVerifyWriter& target, std::uint32_t options)
{
    std::vector<VDataToken> tokens;
    static_cast<void>(target.FindTokens(path, tokens)); // without tokens nothing is removed
    for (const VDataToken& token : tokens) {
        if (!IsKept(token, target, options) && !target.Remove(token)) {
            KVR_LOG("DataStore", 2, "Error removing '%1%' parameter value", token.GetPath().Text());
        }
    }
}

} // namespace DataStorePersistence
