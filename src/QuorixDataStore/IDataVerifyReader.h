#pragma once

#include "QuorixDataStore/IDataReader.h"

/// The hardware's reading side: it tells what was asked for from what was confirmed.
class IDataVerifyReader : public virtual IDataReader
{
public:
    virtual bool GetProposedValue(const VDataToken& token, VDataValue& value) const = 0;
    virtual bool GetVerifiedValue(const VDataToken& token, VDataValue& value) const = 0;
};
