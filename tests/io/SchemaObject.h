#pragma once

#include "io/ISchema.h"
#include "io/ReaderBuildNode.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

/// How an object of a schema lies in memory: as a C++ struct would, with gaps before what needs an
/// alignment, but every enum in at least the 4 bytes that its reader may write.
struct VSchemaLayout
{
    /// Objects of greater size are not made.
    static constexpr std::uint64_t MostBytes = 1 << 20;

    explicit VSchemaLayout(const KVR::IO::ISchema& schema);

    /// Returns the tree that says how to read such an object; the layout must outlive it.
    KVR::IO::ReaderBuildNode MakeNode(std::uint64_t offset) const;

    const KVR::IO::ISchema& schema; ///< must outlive the layout
    std::vector<VSchemaLayout> parts;
    std::vector<std::uint64_t> offsets; ///< of the parts
    std::uint64_t size = 0;
    std::uint64_t alignment = 1;
    bool isTooLarge = false;

private:
    void PlaceMembers();
    void PlaceElements();
};

/// An object of a type that is known only by its schema: numbers and enums, strings, arrays, lists
/// and tuples. A new one has zeros and empty texts, but of each enum the first entry.
class VSchemaObject
{
public:
    /// The layout must outlive the object and not be too large.
    explicit VSchemaObject(const VSchemaLayout& layout);
    ~VSchemaObject();
    VSchemaObject(const VSchemaObject&) = delete;
    VSchemaObject& operator=(const VSchemaObject&) = delete;

    void* Get() { return memory.get(); }

    /// Appends the binary form of the object.
    void AppendTo(std::vector<unsigned char>& bytes) const;

private:
    const VSchemaLayout& layout;
    const std::unique_ptr<std::max_align_t[]> memory;
};
