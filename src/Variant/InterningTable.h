#pragma once

#include "io/ISchema.h"

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

namespace KVR {
namespace IO {

/// Holds one instance of every schema that it was ever given.
///
/// Owns: the instances, and every slot array that it published; none is released before the table.
/// Threads: every operation [any]. A known schema is found without a lock. Behind a shared one, two
/// threads together found half as many as one alone (measured): taking it, each reader writes the
/// lock's own counter.
class VInterningTable
{
public:
    VInterningTable();
    ~VInterningTable();
    VInterningTable(const VInterningTable&) = delete;
    VInterningTable& operator=(const VInterningTable&) = delete;

    /// Returns the instance that strictly equals `schema`, after copying `schema` if it is new.
    const ISchema& Intern(const ISchema& schema);

private:
    struct Entry;

    /// An open hash table. A slot is filled once, from null, and never changes again; at most half
    /// of the slots are filled, so that a search ends.
    struct Slots
    {
        explicit Slots(std::size_t capacity);

        const Entry* Find(std::uint64_t hash, const ISchema& schema) const;
        void Insert(const Entry& entry);

        const std::size_t mask; // the capacity is a power of two
        const std::unique_ptr<std::atomic<const Entry*>[]> entries;
    };

    void PublishNewSlots(std::size_t capacity);

    std::mutex mutex; // guards adding: entries, published, and what Insert changes
    std::vector<std::unique_ptr<const Entry>> entries;
    std::vector<std::unique_ptr<Slots>> published; // the last is current, others may yet be read
    std::atomic<const Slots*> current{nullptr};
};

} // namespace IO
} // namespace KVR
