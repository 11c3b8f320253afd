#pragma once

#include "QuorixDataStore/VisibleData.h"

/// What the writer does: each change is checked against what he sees and recorded in his delta. The
/// operations are those of `IDataStore`, which tells what they do.
///
/// Owns: nothing; made for one call. Threads: the writer's.
class VDataChanges
{
public:
    VDataChanges(const VCommittedData& committed, DataStoreDelta& changes)
        : visible(committed, changes), delta(changes)
    {
    }

    bool SetValue(const VDataToken& token, const VDataValue& value, EDataValueTarget target);
    bool SetValues(const VDataPath& path, const VDataValue& value, EDataValueTarget target);
    bool Remove(const VDataToken& token, bool restorable);
    bool RemoveEach(const VDataPath& path, bool restorable);
    bool SetFlags(const VDataToken& token, std::uint32_t flags);

private:
    const VVisibleData visible;
    DataStoreDelta& delta;
};
