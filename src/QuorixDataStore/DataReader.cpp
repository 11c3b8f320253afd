#include "QuorixDataStore/DataReader.h"

VDataReader::VDataReader(const IDataStore& store)
    : VReadOperations(DataViewDetail::LockForReading(&store))
{
}

VDataReader::VDataReader(const std::shared_ptr<const IDataStore>& store)
    : VReadOperations(DataViewDetail::LockForReading(store.get()))
{
}

VDataReader::~VDataReader()
{
    if (m_pDataStore != nullptr) {
        m_pDataStore->ReleaseReadLock();
    }
}
