#pragma once

#include "QuorixDataStore/DataViewOperations.h"
#include "QuorixDataStore/IDataVerifyWriter.h"

#include <memory>

/// As `VDataWriter`, for the side that tells proposed from verified values.
class VDataVerifyWriter : public DataViewDetail::VWriteOperations<IDataVerifyWriter>
{
public:
    explicit VDataVerifyWriter(IDataStore& store);
    explicit VDataVerifyWriter(const std::shared_ptr<IDataStore>& store);
    VDataVerifyWriter(VDataVerifyWriter&& other) noexcept = default;
    ~VDataVerifyWriter() override;

    bool GetProposedValue(const VDataToken& token, VDataValue& value) const override;
    bool GetVerifiedValue(const VDataToken& token, VDataValue& value) const override;
    bool SetProposedValue(const VDataToken& token, const VDataValue& value) override;
    bool SetVerifiedValue(const VDataToken& token, const VDataValue& value) override;
};
