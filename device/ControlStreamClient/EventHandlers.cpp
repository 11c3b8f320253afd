#include "ControlStreamClient/EventHandlers.h"

#include <algorithm>
#include <utility>

namespace ControlStream {

std::uint64_t VEventHandlers::Add(const std::string& name, EventHandler handler)
{
    const std::lock_guard<std::mutex> lock(mutex);
    auto changed = std::make_shared<Entries>(*entries);
    changed->push_back(std::make_shared<const VEntry>(VEntry{++lastId, name, std::move(handler)}));
    entries = std::move(changed);
    return lastId;
}

void VEventHandlers::Remove(std::uint64_t id)
{
    std::shared_ptr<const Entries> replaced; // a function may call back when it is destroyed
    const std::lock_guard<std::mutex> lock(mutex);
    auto changed = std::make_shared<Entries>(*entries);
    changed->erase(std::remove_if(changed->begin(), changed->end(),
                                  [id](const auto& entry) { return entry->Id == id; }),
                   changed->end());
    replaced = std::exchange(entries, std::move(changed));
}

void VEventHandlers::Call(const VEvent& event) const
{
    const std::shared_ptr<const Entries> present = Present();
    for (const auto& entry : *present) {
        if (entry->Handler && (entry->Name.empty() || entry->Name == event.Name)) {
            entry->Handler(event);
        }
    }
}

std::shared_ptr<const VEventHandlers::Entries> VEventHandlers::Present() const
{
    const std::lock_guard<std::mutex> lock(mutex);
    return entries;
}

} // namespace ControlStream
