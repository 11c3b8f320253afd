#include "QuorixDataStore/DataPath.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <new>
#include <stdexcept>
#include <utility>

namespace {

constexpr char separator = '.';
constexpr std::string_view wildcard = "*";
constexpr std::size_t maximumSize = std::numeric_limits<std::uint32_t>::max() / 2;

std::uint64_t Combine(std::uint64_t hash, std::uint64_t value)
{
    return hash ^ (value + 0x9e3779b9 + (hash << 6) + (hash >> 2));
}

} // namespace

VDataPath::VBlock* VDataPath::Make(std::size_t components, std::size_t textSize)
{
    if (components > maximumSize || textSize > maximumSize) {
        throw std::length_error("VDataPath");
    }
    const std::size_t size = sizeof(VBlock) + components * sizeof(std::uint32_t) + textSize;
    VBlock* made = new (::operator new(size)) VBlock;
    made->ComponentCapacity = static_cast<std::uint32_t>(components);
    made->TextCapacity = static_cast<std::uint32_t>(textSize);
    return made;
}

void VDataPath::Destroy(VBlock* block)
{
    block->~VBlock();
    ::operator delete(block);
}

VDataPath::VDataPath(std::string_view text)
{
    *this = text;
}

VDataPath::VDataPath(std::initializer_list<std::string_view> components)
{
    std::size_t size = components.size();
    for (const std::string_view component : components) {
        size += component.size();
    }
    Reserve(components.size(), size);
    for (const std::string_view component : components) {
        AppendReserved(component);
    }
}

VDataPath::VDataPath(const std::vector<std::string>& components)
{
    std::size_t size = components.size();
    for (const std::string& component : components) {
        size += component.size();
    }
    Reserve(components.size(), size);
    for (const std::string& component : components) {
        AppendReserved(component);
    }
}

VDataPath::VDataPath(const VDataPath& parent, std::string_view component)
{
    Reserve(parent.Count() + 1, parent.TextSize() + component.size() + 1);
    AppendRange(parent, 0, parent.Count());
    AppendReserved(component);
}

VDataPath& VDataPath::operator=(std::string_view text)
{
    VDataPath split; // the text may be part of this path's own
    const std::size_t dots =
        static_cast<std::size_t>(std::count(text.begin(), text.end(), separator));
    split.Reserve(dots + 1, text.size());
    for (std::size_t begin = 0; begin < text.size();) {
        const std::size_t end = std::min(text.find(separator, begin), text.size());
        if (end > begin) {
            split.AppendReserved(text.substr(begin, end - begin));
        }
        begin = end + 1;
    }
    if (split.Count() == 0) {
        split = VDataPath();
    }
    return *this = std::move(split);
}

void VDataPath::Append(std::string_view component)
{
    VDataPath grown;
    const std::size_t textSize = TextSize() + component.size() + 1;
    const bool inPlace = block != nullptr &&
                         block->References.load(std::memory_order_acquire) == 1 &&
                         block->Count < block->ComponentCapacity && textSize <= block->TextCapacity;
    if (!inPlace) {
        grown.Reserve(Count() + 1 + Count() / 2, textSize + textSize / 2);
        grown.AppendRange(*this, 0, Count());
        std::swap(block, grown.block); // the component may be part of the old text, now in `grown`
    }
    AppendReserved(component);
}

void VDataPath::Append(const VDataPath& other)
{
    if (other.Empty()) {
        return;
    }
    VDataPath joined;
    joined.Reserve(Count() + other.Count(), TextSize() + other.TextSize() + 1);
    joined.AppendRange(*this, 0, Count());
    joined.AppendRange(other, 0, other.Count());
    *this = std::move(joined);
}

void VDataPath::RemoveLast()
{
    assert(!Empty());
    if (!Empty()) {
        Resize(Count() - 1);
    }
}

void VDataPath::Replace(std::size_t index, std::string_view component)
{
    assert(index < Count());
    if (index >= Count()) {
        return;
    }
    VDataPath replaced;
    replaced.Reserve(Count(), TextSize() + component.size());
    replaced.AppendRange(*this, 0, index);
    replaced.AppendReserved(component);
    replaced.AppendRange(*this, index + 1, Count());
    *this = std::move(replaced);
}

void VDataPath::Resize(std::size_t count)
{
    if (count == Count()) {
        return;
    }
    const std::size_t kept = std::min(count, Count());
    VDataPath resized;
    resized.Reserve(count, TextSize() + count);
    resized.AppendRange(*this, 0, kept);
    for (std::size_t index = kept; index < count; ++index) {
        resized.AppendReserved(std::string_view());
    }
    *this = std::move(resized);
}

std::string_view VDataPath::Last() const
{
    return Empty() ? std::string_view() : block->Component(block->Count - 1);
}

std::string VDataPath::Text() const
{
    return block == nullptr ? std::string() : std::string(block->Text(), block->TextSize());
}

bool VDataPath::Matches(const VDataPath& other) const
{
    const VDataPath& shorter = Count() <= other.Count() ? *this : other;
    const VDataPath& longer = Count() <= other.Count() ? other : *this;
    if (shorter.Empty()) {
        return false;
    }
    if (shorter.Count() < longer.Count() && shorter.Last() != wildcard) {
        return false;
    }
    for (std::size_t index = 0; index < shorter.Count(); ++index) {
        const std::string_view left = shorter.Component(index);
        const std::string_view right = longer.Component(index);
        if (left != right && left != wildcard && right != wildcard) {
            return false;
        }
    }
    return true;
}

bool VDataPath::StartsWith(const VDataPath& prefix) const
{
    if (prefix.Count() > Count()) {
        return false;
    }
    for (std::size_t index = 0; index < prefix.Count(); ++index) {
        if (Component(index) != prefix.Component(index)) {
            return false;
        }
    }
    return true;
}

VDataPath VDataPath::WithoutWildcards() const
{
    if (!HasWildcard()) {
        return *this;
    }
    VDataPath result;
    for (std::size_t index = 0; index < Count(); ++index) {
        if (Component(index) != wildcard) {
            result.Append(Component(index));
        }
    }
    return result;
}

VDataPath VDataPath::CommonPrefix(const VDataPath& other) const
{
    const std::size_t limit = std::min(Count(), other.Count());
    std::size_t shared = 0;
    while (shared < limit && Component(shared) == other.Component(shared)) {
        ++shared;
    }
    return Left(shared);
}

VDataPath VDataPath::Left(std::size_t count) const
{
    return count == Count() ? *this : SubRange(0, count);
}

VDataPath VDataPath::SubRange(std::size_t begin, std::size_t end) const
{
    VDataPath result;
    if (begin >= end || begin >= Count() || end > Count()) {
        return result;
    }
    result.Reserve(end - begin, block->Ends()[end - 1] - block->Begin(begin));
    result.AppendRange(*this, begin, end);
    return result;
}

std::uint64_t VDataPath::Hash() const
{
    std::uint64_t result = 0;
    for (std::size_t index = 0; index < Count(); ++index) {
        std::uint64_t hash = 0;
        for (const char byte : Component(index)) {
            // Bytes count as signed numbers, on every platform.
            hash = Combine(hash, static_cast<std::uint64_t>(
                                     static_cast<std::int64_t>(static_cast<signed char>(byte))));
        }
        result = Combine(result, hash);
    }
    return result;
}

std::size_t VDataPath::QuickHash() const
{
    constexpr std::uint64_t mixing = 0x9E3779B97F4A7C15; // odd, with its ones spread out
    const std::size_t size = TextSize();
    const char* const text = block == nullptr ? nullptr : block->Text();
    std::uint64_t hash = size;
    for (std::size_t position = 0; position < size; position += sizeof hash) {
        std::uint64_t word = 0;
        std::memcpy(&word, text + position, std::min(sizeof word, size - position));
        hash = (hash ^ word) * mixing;
        hash ^= hash >> 32;
    }
    return static_cast<std::size_t>(hash);
}

void VDataPath::ShrinkToFit()
{
    if (block == nullptr || (block->ComponentCapacity == block->Count &&
                             block->TextCapacity <= block->TextSize() + sizeof(void*))) {
        return;
    }
    VDataPath fitting;
    fitting.Reserve(Count(), TextSize());
    fitting.AppendRange(*this, 0, Count());
    *this = std::move(fitting);
}

bool operator==(const VDataPath& left, const VDataPath& right)
{
    if (left.block == right.block) {
        return true;
    }
    if (left.Count() != right.Count() || left.TextSize() != right.TextSize()) {
        return false;
    }
    // The same text with the separators at the same places is the same list.
    const std::size_t count = left.block->Count;
    return std::memcmp(left.block->Ends(), right.block->Ends(), count * sizeof(std::uint32_t)) ==
               0 &&
           std::memcmp(left.block->Text(), right.block->Text(), left.block->TextSize()) == 0;
}

bool operator<(const VDataPath& left, const VDataPath& right)
{
    if (left.block == right.block) {
        return false;
    }
    const std::size_t limit = std::min(left.Count(), right.Count());
    for (std::size_t index = 0; index < limit; ++index) {
        const int order = left.Component(index).compare(right.Component(index));
        if (order != 0) {
            return order < 0;
        }
    }
    return left.Count() < right.Count();
}

std::size_t VDataPath::TextSize() const
{
    return block == nullptr ? 0 : block->TextSize();
}

/// Makes the block of an empty path, with room for what `AppendReserved` will be given.
void VDataPath::Reserve(std::size_t components, std::size_t textSize)
{
    assert(block == nullptr);
    if (components > 0) {
        block = Make(components, textSize);
    }
}

/// Appends to a block that nobody shares and that has the room.
void VDataPath::AppendReserved(std::string_view component)
{
    assert(block != nullptr && block->Count < block->ComponentCapacity);
    std::size_t end = block->TextSize();
    if (block->Count > 0) {
        block->Text()[end] = separator;
        ++end;
    }
    assert(end + component.size() <= block->TextCapacity);
    if (!component.empty()) {
        std::memcpy(block->Text() + end, component.data(), component.size());
    }
    block->Ends()[block->Count] = static_cast<std::uint32_t>(end + component.size());
    ++block->Count;
    block->Wildcard = block->Wildcard || component == wildcard;
}

void VDataPath::AppendRange(const VDataPath& other, std::size_t begin, std::size_t end)
{
    for (std::size_t index = begin; index < end; ++index) {
        AppendReserved(other.Component(index));
    }
}
