#include "QuorixDataStore/DataVerifyReader.h"

VDataVerifyReader::VDataVerifyReader(const IDataStore& store)
    : VReadOperations(DataViewDetail::LockForReading(&store))
{
}

VDataVerifyReader::VDataVerifyReader(const std::shared_ptr<const IDataStore>& store)
    : VReadOperations(DataViewDetail::LockForReading(store.get()))
{
}

VDataVerifyReader::~VDataVerifyReader()
{
    if (m_pDataStore != nullptr) {
        m_pDataStore->ReleaseReadLock();
    }
}

bool VDataVerifyReader::GetProposedValue(const VDataToken& token, VDataValue& value) const
{
    KVR_CHECK_DATA_STORE(false);
    return m_pDataStore->GetValue(token, value, EDataValueTarget::Proposed);
}

bool VDataVerifyReader::GetVerifiedValue(const VDataToken& token, VDataValue& value) const
{
    KVR_CHECK_DATA_STORE(false);
    return m_pDataStore->GetValue(token, value, EDataValueTarget::Verified);
}
