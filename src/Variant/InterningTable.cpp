#include "Variant/InterningTable.h"

#include "io/SchemaEquality.h"

#include <utility>

namespace KVR {
namespace IO {

namespace {

constexpr std::size_t firstCapacity = 1024;

} // namespace

struct VInterningTable::Entry
{
    const std::uint64_t hash;
    const ISchema schema;
};

VInterningTable::Slots::Slots(std::size_t capacity)
    : mask(capacity - 1), entries(new std::atomic<const Entry*>[capacity]())
{
}

const VInterningTable::Entry* VInterningTable::Slots::Find(std::uint64_t hash,
                                                           const ISchema& schema) const
{
    for (std::size_t i = hash & mask;; i = (i + 1) & mask) {
        const Entry* entry = entries[i].load(std::memory_order_acquire);
        if (entry == nullptr) {
            return nullptr;
        }
        if (entry->hash == hash && StrictlyEqual(entry->schema, schema)) {
            return entry;
        }
    }
}

void VInterningTable::Slots::Insert(const Entry& entry)
{
    std::size_t i = entry.hash & mask;
    while (entries[i].load(std::memory_order_relaxed) != nullptr) {
        i = (i + 1) & mask;
    }
    entries[i].store(&entry, std::memory_order_release);
}

VInterningTable::VInterningTable()
{
    PublishNewSlots(firstCapacity);
}

VInterningTable::~VInterningTable() = default;

const ISchema& VInterningTable::Intern(const ISchema& schema)
{
    const std::uint64_t hash = StrictHash(schema);
    if (const Entry* known = current.load(std::memory_order_acquire)->Find(hash, schema)) {
        return known->schema;
    }

    const std::lock_guard<std::mutex> lock(mutex);
    // Looked up again: another thread may have added it, or the slots searched above were old ones.
    if (const Entry* known = published.back()->Find(hash, schema)) {
        return known->schema;
    }
    const std::size_t capacity = published.back()->mask + 1;
    if (entries.size() + 1 > capacity / 2) {
        PublishNewSlots(capacity * 2);
    }
    // Last, since nothing may fail between keeping an entry and being able to find it.
    entries.push_back(std::unique_ptr<const Entry>(new Entry{hash, schema}));
    published.back()->Insert(*entries.back());
    return entries.back()->schema;
}

void VInterningTable::PublishNewSlots(std::size_t capacity)
{
    auto slots = std::make_unique<Slots>(capacity);
    for (const std::unique_ptr<const Entry>& entry : entries) {
        slots->Insert(*entry);
    }
    published.push_back(std::move(slots));
    current.store(published.back().get(), std::memory_order_release);
}

} // namespace IO
} // namespace KVR
