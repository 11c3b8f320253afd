#pragma once

#include "QuorixDataStore/DataViewOperations.h"
#include "QuorixDataStore/IDataReader.h"

#include <memory>

/// A view that reads: it holds a read lock of the store from its making to its end.
///
/// Make it on the stack, in a tight scope, and use and destroy it on the thread that made it: on
/// another one its end would release nothing, and the lock would be held for ever.
/// Owns: nothing; the caller keeps the store alive. Failure: see `IDataReader`.
class VDataReader : public DataViewDetail::VReadOperations<IDataReader, const IDataStore>
{
public:
    explicit VDataReader(const IDataStore& store);

    /// @param store  is not kept
    explicit VDataReader(const std::shared_ptr<const IDataStore>& store);

    /// Takes the lock over; the other view is of no more use.
    VDataReader(VDataReader&& other) noexcept = default;

    /// Releases the lock, which may commit another thread's changes here and call the listeners.
    ~VDataReader() override;
};
