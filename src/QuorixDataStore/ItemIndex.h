#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

struct VDataItem;

/// Finds items by their identifiers, which are given out upwards, in three steps of a fixed size.
///
/// Threads: as the committed tree. Memory: what has become empty goes; only the list of branches
/// stays, which grows by one pointer for each 262,144 identifiers that were ever given out.
class VItemIndex
{
public:
    /// Returns the item, or null. 0 is no identifier.
    VDataItem* Find(std::uint64_t identifier) const
    {
        const std::uint64_t branch = identifier / (fanOut * fanOut);
        if (branch >= branches.size() || !branches[branch]) {
            return nullptr;
        }
        const VPage* page = branches[branch]->Entries[identifier / fanOut % fanOut].get();
        return page == nullptr ? nullptr : page->Entries[identifier % fanOut];
    }

    void Insert(std::uint64_t identifier, VDataItem* item)
    {
        const std::uint64_t branch = identifier / (fanOut * fanOut);
        if (branch >= branches.size()) {
            branches.resize(branch + 1);
        }
        if (!branches[branch]) {
            branches[branch] = std::make_unique<VBranch>();
        }
        std::unique_ptr<VPage>& page = branches[branch]->Entries[identifier / fanOut % fanOut];
        if (!page) {
            page = std::make_unique<VPage>();
            ++branches[branch]->Used;
        }
        page->Entries[identifier % fanOut] = item;
        ++page->Used;
    }

    void Erase(std::uint64_t identifier)
    {
        if (Find(identifier) == nullptr) {
            return;
        }
        std::unique_ptr<VBranch>& branch = branches[identifier / (fanOut * fanOut)];
        std::unique_ptr<VPage>& page = branch->Entries[identifier / fanOut % fanOut];
        page->Entries[identifier % fanOut] = nullptr;
        if (--page->Used > 0) {
            return;
        }
        page.reset();
        if (--branch->Used == 0) {
            branch.reset();
        }
    }

private:
    static constexpr std::size_t fanOut = 512;

    template <typename Entry>
    struct VTable
    {
        std::array<Entry, fanOut> Entries{};
        std::size_t Used = 0;
    };

    using VPage = VTable<VDataItem*>;
    using VBranch = VTable<std::unique_ptr<VPage>>;

    std::vector<std::unique_ptr<VBranch>> branches;
};
