#include "QuorixDataStore/IDataStore.h"
#include "QuorixDataStore/IDataVerifyReader.h"
#include "QuorixDataStore/IDataVerifyWriter.h"
#include "support/VirtualSlot.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <initializer_list>

// Hosts call these interfaces by slot.

namespace {

using TestSupport::destructorSlots;
using TestSupport::SlotOf;

/// Expects the slots to follow each other without a gap.
void ExpectInOrder(std::size_t next, std::initializer_list<std::size_t> slots)
{
    for (const std::size_t slot : slots) {
        EXPECT_EQ(next, slot);
        ++next;
    }
}

TEST(DataStoreSlots, OfTheStoreAreInOrder)
{
    using Listeners = VDataListeners& (IDataStore::*)(const VDataPath&);
    using ReadListeners = const VDataListeners& (IDataStore::*)(const VDataPath&) const;

    ExpectInOrder(destructorSlots, {SlotOf(&IDataStore::AcquireReadLock),
                                    SlotOf(&IDataStore::ReleaseReadLock),
                                    SlotOf(&IDataStore::AcquireWriteLock),
                                    SlotOf(&IDataStore::ReleaseWriteLock),
                                    SlotOf(static_cast<Listeners>(&IDataStore::GetListeners)),
                                    SlotOf(static_cast<ReadListeners>(&IDataStore::GetListeners)),
                                    SlotOf(&IDataStore::FindTokens),
                                    SlotOf(&IDataStore::GetChildCount),
                                    SlotOf(&IDataStore::HasChild),
                                    SlotOf(&IDataStore::GetChildren),
                                    SlotOf(&IDataStore::HasValue),
                                    SlotOf(&IDataStore::GetValue),
                                    SlotOf(&IDataStore::GetSchema),
                                    SlotOf(&IDataStore::GetFlags),
                                    SlotOf(&IDataStore::GetPathChangeId),
                                    SlotOf(&IDataStore::GetItemChangeId),
                                    SlotOf(&IDataStore::GetCurrentChangeId),
                                    SlotOf(&IDataStore::SetValue),
                                    SlotOf(&IDataStore::SetValues),
                                    SlotOf(&IDataStore::Remove),
                                    SlotOf(&IDataStore::RemoveAll),
                                    SlotOf(&IDataStore::RemoveAllRestorable),
                                    SlotOf(&IDataStore::SetFlags)});
}

TEST(DataStoreSlots, OfAReaderAreInOrder)
{
    using GetOut = bool (IDataReader::*)(const VDataToken&, VDataValue&) const;
    using GetByValue = VDataValue (IDataReader::*)(const VDataToken&) const;

    ExpectInOrder(destructorSlots,
                  {SlotOf(&IDataReader::GetDataStore), SlotOf(&IDataReader::FindTokens),
                   SlotOf(&IDataReader::GetChildCount), SlotOf(&IDataReader::HasChild),
                   SlotOf(&IDataReader::GetChildren), SlotOf(&IDataReader::HasValue),
                   SlotOf(static_cast<GetOut>(&IDataReader::GetValue)),
                   SlotOf(static_cast<GetByValue>(&IDataReader::GetValue)),
                   SlotOf(&IDataReader::GetSchema), SlotOf(&IDataReader::GetFlags),
                   SlotOf(&IDataReader::GetPathChangeId), SlotOf(&IDataReader::GetItemChangeId),
                   SlotOf(&IDataReader::GetCurrentChangeId)});
}

TEST(DataStoreSlots, OfAWriterAreInOrder)
{
    using Store = IDataStore& (IDataWriter::*)();
    using OfToken = VDataListeners& (IDataWriter::*)(const VDataToken&);
    using OfPath = VDataListeners& (IDataWriter::*)(const VDataPath&);
    const std::size_t first = SlotOf(static_cast<Store>(&IDataWriter::GetDataStore));

    ExpectInOrder(first,
                  {first, SlotOf(static_cast<OfToken>(&IDataWriter::GetListeners)),
                   SlotOf(static_cast<OfPath>(&IDataWriter::GetListeners)),
                   SlotOf(&IDataWriter::SetValue), SlotOf(&IDataWriter::Remove),
                   SlotOf(&IDataWriter::RemoveAll), SlotOf(&IDataWriter::RemoveAllRestorable),
                   SlotOf(&IDataWriter::SetFlags)});
}

TEST(DataStoreSlots, OfTheVerifyViewsAreInOrder)
{
    const std::size_t first = SlotOf(&IDataVerifyReader::GetProposedValue);

    ExpectInOrder(first, {first, SlotOf(&IDataVerifyReader::GetVerifiedValue),
                          SlotOf(&IDataVerifyWriter::SetProposedValue),
                          SlotOf(&IDataVerifyWriter::SetVerifiedValue)});
}

} // namespace
