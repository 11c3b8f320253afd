#pragma once

#include "ControlStreamClient/Records.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace ControlStream {

using EventHandler = std::function<void(const VEvent&)>;

/// Functions that are called with events, each with those of one name or with all.
///
/// Owns: the functions. Threads: every operation [any]. A function runs with no lock held, and may
/// add and remove functions, itself included; one that is being called on another thread may end
/// after its removal.
class VEventHandlers
{
public:
    /// Adds a function behind those that are there.
    ///
    /// @param name     of the events, compared exactly; empty for all events
    /// @param handler  an empty one is never called
    /// @return what Remove takes, never 0
    std::uint64_t Add(const std::string& name, EventHandler handler);

    /// An unknown id changes nothing.
    void Remove(std::uint64_t id);

    /// Calls the functions for this event, in the order in which they were added. What one throws
    /// passes through; those behind it are not called then.
    void Call(const VEvent& event) const;

private:
    struct VEntry
    {
        std::uint64_t Id;
        std::string Name;
        EventHandler Handler;
    };
    using Entries = std::vector<std::shared_ptr<const VEntry>>;

    std::shared_ptr<const Entries> Present() const;

    mutable std::mutex mutex;
    std::shared_ptr<const Entries> entries = std::make_shared<Entries>(); // guarded by mutex
    std::uint64_t lastId = 0;                                             // guarded by mutex
};

} // namespace ControlStream
