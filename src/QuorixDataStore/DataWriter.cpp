#include "QuorixDataStore/DataWriter.h"

VDataWriter::VDataWriter(IDataStore& store)
    : VWriteOperations(DataViewDetail::LockForWriting(&store))
{
}

VDataWriter::VDataWriter(const std::shared_ptr<IDataStore>& store)
    : VWriteOperations(DataViewDetail::LockForWriting(store.get()))
{
}

VDataWriter::~VDataWriter()
{
    if (m_pDataStore != nullptr) {
        m_pDataStore->ReleaseWriteLock();
    }
}
