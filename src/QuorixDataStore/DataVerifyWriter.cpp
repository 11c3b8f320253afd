#include "QuorixDataStore/DataVerifyWriter.h"

VDataVerifyWriter::VDataVerifyWriter(IDataStore& store)
    : VWriteOperations(DataViewDetail::LockForWriting(&store))
{
}

VDataVerifyWriter::VDataVerifyWriter(const std::shared_ptr<IDataStore>& store)
    : VWriteOperations(DataViewDetail::LockForWriting(store.get()))
{
}

VDataVerifyWriter::~VDataVerifyWriter()
{
    if (m_pDataStore != nullptr) {
        m_pDataStore->ReleaseWriteLock();
    }
}

bool VDataVerifyWriter::GetProposedValue(const VDataToken& token, VDataValue& value) const
{
    KVR_CHECK_DATA_STORE(false);
    return m_pDataStore->GetValue(token, value, EDataValueTarget::Proposed);
}

bool VDataVerifyWriter::GetVerifiedValue(const VDataToken& token, VDataValue& value) const
{
    KVR_CHECK_DATA_STORE(false);
    return m_pDataStore->GetValue(token, value, EDataValueTarget::Verified);
}

bool VDataVerifyWriter::SetProposedValue(const VDataToken& token, const VDataValue& value)
{
    KVR_CHECK_DATA_STORE(false);
    return m_pDataStore->SetValue(token, value, EDataValueTarget::Proposed);
}

bool VDataVerifyWriter::SetVerifiedValue(const VDataToken& token, const VDataValue& value)
{
    KVR_CHECK_DATA_STORE(false);
    return m_pDataStore->SetValue(token, value, EDataValueTarget::Verified);
}
