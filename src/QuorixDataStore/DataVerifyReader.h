#pragma once

#include "QuorixDataStore/DataViewOperations.h"
#include "QuorixDataStore/IDataVerifyReader.h"

#include <memory>

/// As `VDataReader`, for the side that tells proposed from verified values.
class VDataVerifyReader
    : public DataViewDetail::VReadOperations<IDataVerifyReader, const IDataStore>
{
public:
    explicit VDataVerifyReader(const IDataStore& store);
    explicit VDataVerifyReader(const std::shared_ptr<const IDataStore>& store);
    VDataVerifyReader(VDataVerifyReader&& other) noexcept = default;
    ~VDataVerifyReader() override;

    bool GetProposedValue(const VDataToken& token, VDataValue& value) const override;
    bool GetVerifiedValue(const VDataToken& token, VDataValue& value) const override;
};
