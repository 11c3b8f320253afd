#pragma once

#include "QuorixDataStore/IDataVerifyReader.h"
#include "QuorixDataStore/IDataWriter.h"

/// The hardware's writing side: it reads what was asked for, applies it and writes what it
/// confirms. Whoever must carry both truths of an item works through it too.
class IDataVerifyWriter : public IDataVerifyReader, public IDataWriter
{
public:
    bool GetProposedValue(const VDataToken& token, VDataValue& value) const override = 0;
    bool GetVerifiedValue(const VDataToken& token, VDataValue& value) const override = 0;
    virtual bool SetProposedValue(const VDataToken& token, const VDataValue& value) = 0;
    virtual bool SetVerifiedValue(const VDataToken& token, const VDataValue& value) = 0;
};
