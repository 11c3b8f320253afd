#pragma once

#include "QuorixDataStore/DataViewOperations.h"
#include "QuorixDataStore/IDataWriter.h"

#include <memory>

/// A view that reads and writes what the user asks for: it holds the write lock of the store from
/// its making, which waits for earlier writers, to its end.
///
/// Made on a thread that holds a read lock of the store it fails the assertion "Fatal attempt to
/// acquire a write lock from within a read lock."; where the handler returns, the view is as one
/// that was moved from. A reading view inside a writing one is fine.
/// Have everything ready before you make one, and let it go before you do anything slow.
/// Owns: nothing; the caller keeps the store alive. Threads and failure: see `IDataReader`.
class VDataWriter : public DataViewDetail::VWriteOperations<IDataWriter>
{
public:
    explicit VDataWriter(IDataStore& store);

    /// @param store  is not kept
    explicit VDataWriter(const std::shared_ptr<IDataStore>& store);

    /// Takes the lock over; the other view is of no more use.
    VDataWriter(VDataWriter&& other) noexcept = default;

    /// Releases the lock. Unless a reader holds the same state, the changes are committed here and
    /// the listeners have run when this returns.
    ~VDataWriter() override;
};
