#pragma once

#include "io/IInputStream.h"
#include "io/IReader.h"
#include "io/ReaderBuildNode.h"

#include <algorithm>
#include <cstdint>
#include <memory>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

// The readers of C++ objects, and who makes them. What an object is made of is known to
// io/NativeTypes.h.

namespace KVR {
namespace IO {
namespace Detail {

/// How many bytes a list or a text is given room for before the first of them arrived: its stored
/// count may be damaged and ask for 32 GiB. A shorter one is read as one copy.
constexpr std::uint64_t MostBytesUnseen = std::uint64_t{16} * 1024 * 1024;

/// How many elements a list may have that no stored bytes stand behind, such as those of a type all
/// of whose members are new: only its count tells how many there are.
constexpr std::uint32_t MostUnstoredElements = std::uint32_t{1} << 16;

/// Returns where in an object a part lies, or null for a part that has no place in it.
inline void* PlaceOf(void* object, const IReaderCollapsable& part)
{
    return part.DestinationOffset == IReaderCollapsable::NoOffset
               ? nullptr
               : static_cast<unsigned char*>(object) + part.DestinationOffset;
}

/// True if elements of `size` bytes, one behind the other, are just the stored bytes. A reader
/// without a flat size is no packed element of no bytes: it may consume any number.
inline bool IsPacked(const IReaderCollapsable& element, std::uint64_t size)
{
    return element.FlatSize != 0 && element.FlatSize == size && element.DestinationOffset == 0;
}

/// Reads bytes that an object holds just as they are stored.
class VReaderCopy : public IReaderCollapsable
{
public:
    VReaderCopy(std::uint64_t destinationOffset, std::uint32_t size);
    bool Read(IInputStream& stream, void* destination) override;
};

/// Makes a reader of a Bool, a number or an enum of the current type. The object of an enum holds a
/// number of the width of its type.
///
/// Deliberate: a Bool is no part of a run of bytes. Stored bytes are anything, and a `bool` must be
/// 0 or 1. An enum that fits neither as a signed nor as an unsigned number makes reading fail.
///
/// @return null if the stored type is not readable as the current one
std::shared_ptr<IReaderCollapsable> MakeNumberReader(EType currentType,
                                                     const ReaderBuildContext& context);

/// Makes a reader that fills a std::string.
std::shared_ptr<IReaderCollapsable> MakeStringReader(const ReaderBuildContext& context);

/// Makes a reader of the parts of a tuple, in which neighbours that are flat, in the stream and in
/// the object alike, are read as one run. What is stepped over ends a run.
std::shared_ptr<IReaderCollapsable> MakeTupleReader(EType currentType,
                                                    const ReaderBuildContext& context);

/// Makes a reader of `count` elements that lie `stride` bytes apart, as one run if they are flat
/// without gaps.
std::shared_ptr<IReaderCollapsable> MakeArrayReader(std::uint64_t stride, std::uint32_t count,
                                                    const ReaderBuildContext& context);

/// True if a reader consumes no bytes, whatever is stored. It is tried, on a stream that has none.
///
/// @param object  an object of the type that the reader fills; what it holds is lost
bool ConsumesNothing(IReaderCollapsable& reader, void* object);

/// Adds a line for each enum whose numbers changed and which is not stored in 32 bits, before and
/// now, since VReaderMappedEnum reads no others. The schemas must have passed CompareSchemas.
void FindUnmappableEnums(const ISchema& stored, const ISchema& current,
                         std::vector<std::string>& errors, const std::string& path);

/// Fills a std::vector.
template <typename T>
class VReaderVector : public IReaderCollapsable
{
public:
    VReaderVector(std::shared_ptr<IReaderCollapsable> element_, std::uint64_t destinationOffset)
        : element(std::move(element_)), isPacked(IsPacked(*element, sizeof(T)))
    {
        DestinationOffset = destinationOffset;
        const auto object = std::make_unique<T>();
        isUnstored = ConsumesNothing(*element, object.get());
    }

    bool Read(IInputStream& stream, void* destination) override
    {
        std::vector<T>& elements = *static_cast<std::vector<T>*>(destination);
        std::uint32_t count = 0;
        if (!stream.Read(&count, sizeof(count)) || (isUnstored && count > MostUnstoredElements)) {
            return false;
        }
        if constexpr (!std::is_same<T, bool>::value) {
            if (isPacked) {
                return ReadAtOnce(stream, elements, count);
            }
        }
        return ReadEach(stream, elements, count);
    }

private:
    /// Reads one run, or several that double where the count is great.
    static bool ReadAtOnce(IInputStream& stream, std::vector<T>& elements, std::size_t count)
    {
        std::size_t done = 0;
        while (done < count) {
            const std::size_t block = std::min(count - done, std::max(done, mostUnseen));
            elements.resize(done + block);
            if (!stream.Read(elements.data() + done, block * sizeof(T))) {
                return false;
            }
            done += block;
        }
        elements.resize(count);
        return true;
    }

    /// Every element begins anew, so that members which are not stored are those of a new object,
    /// and not what another value left.
    bool ReadEach(IInputStream& stream, std::vector<T>& elements, std::size_t count)
    {
        elements.clear();
        elements.reserve(std::min(count, mostUnseen));
        for (std::size_t i = 0; i < count; ++i) {
            if constexpr (std::is_same<T, bool>::value) {
                bool one = false;
                if (!element->Read(stream, PlaceOf(&one, *element))) {
                    return false;
                }
                elements.push_back(one);
            } else {
                elements.emplace_back();
                if (!element->Read(stream, PlaceOf(&elements.back(), *element))) {
                    return false;
                }
            }
        }
        return true;
    }

    static constexpr std::size_t mostUnseen =
        std::max<std::size_t>(1, static_cast<std::size_t>(MostBytesUnseen / sizeof(T)));

    const std::shared_ptr<IReaderCollapsable> element;
    const bool isPacked;
    bool isUnstored = false;
};

/// Makes a reader that fills a std::vector of T.
template <typename T>
std::shared_ptr<IReaderCollapsable> MakeVectorReader(const ReaderBuildContext& context)
{
    if (context.StoredType != EType::List || context.Children.size() != 1) {
        return nullptr;
    }
    return std::make_shared<VReaderVector<T>>(context.Children.front(), context.Offset);
}

} // namespace Detail
} // namespace IO
} // namespace KVR
