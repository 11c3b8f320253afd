#include "io/NativeReaders.h"

#include "io/EnumMapping.h"
#include "io/SchemaComparison.h"

#include <cstring>
#include <limits>
#include <type_traits>
#include <utility>

namespace KVR {
namespace IO {
namespace Detail {

namespace {

using ReaderPointer = std::shared_ptr<IReaderCollapsable>;

constexpr std::uint64_t mostFlatBytes = std::numeric_limits<std::uint32_t>::max();

/// Reads one stored number at its bytes and writes the current one; false if it does not fit.
using Conversion = bool (*)(const unsigned char* stored, void* current);

template <typename Stored, typename Current>
bool ConvertNumber(const unsigned char* bytes, void* destination)
{
    Stored stored;
    std::memcpy(&stored, bytes, sizeof(stored));
    // NOLINTNEXTLINE(bugprone-signed-char-misuse): a number of eight bits is no character
    const auto current = static_cast<Current>(stored);
    std::memcpy(destination, &current, sizeof(current));
    return true;
}

template <typename Current>
bool ConvertBool(const unsigned char* bytes, void* destination)
{
    const auto current = static_cast<Current>(*bytes != 0);
    std::memcpy(destination, &current, sizeof(current));
    return true;
}

template <typename Stored, typename Current>
bool ConvertEnum(const unsigned char* bytes, void* destination)
{
    Stored stored;
    std::memcpy(&stored, bytes, sizeof(stored));
    using Limits = std::numeric_limits<Current>;
    constexpr std::int64_t greatest =
        std::numeric_limits<typename std::make_unsigned<Current>::type>::max();
    // NOLINTNEXTLINE(bugprone-signed-char-misuse): a number of eight bits is no character
    const std::int64_t number = stored;
    return number >= Limits::min() && number <= greatest &&
           ConvertNumber<Stored, Current>(bytes, destination);
}

struct StoredForm
{
    std::uint32_t size;
    Conversion conversion;
};

template <typename Stored, typename Current>
StoredForm FormOf()
{
    return {sizeof(Stored), &ConvertNumber<Stored, Current>};
}

/// The form of a stored number; only what is readable as the current type is asked for.
template <typename Current>
StoredForm FindNumber(EType stored)
{
    switch (stored) {
    case EType::Int8:
        return FormOf<std::int8_t, Current>();
    case EType::Int16:
        return FormOf<std::int16_t, Current>();
    case EType::Int32:
        return FormOf<std::int32_t, Current>();
    case EType::Int64:
        return FormOf<std::int64_t, Current>();
    case EType::UInt8:
        return FormOf<std::uint8_t, Current>();
    case EType::UInt16:
        return FormOf<std::uint16_t, Current>();
    case EType::UInt32:
        return FormOf<std::uint32_t, Current>();
    case EType::UInt64:
        return FormOf<std::uint64_t, Current>();
    default:
        return {1, &ConvertBool<Current>};
    }
}

template <typename Current>
StoredForm FindReal(EType stored)
{
    return stored == EType::Float32 ? FormOf<float, Current>() : FormOf<double, Current>();
}

template <typename Current>
StoredForm FindEnum(EType stored)
{
    switch (stored) {
    case EType::Enum8:
        return {1, &ConvertEnum<std::int8_t, Current>};
    case EType::Enum16:
        return {2, &ConvertEnum<std::int16_t, Current>};
    default:
        return {4, &ConvertEnum<std::int32_t, Current>};
    }
}

StoredForm FindForm(EType stored, EType current)
{
    switch (current) {
    case EType::Int8:
        return FindNumber<std::int8_t>(stored);
    case EType::Int16:
        return FindNumber<std::int16_t>(stored);
    case EType::Int32:
        return FindNumber<std::int32_t>(stored);
    case EType::Int64:
        return FindNumber<std::int64_t>(stored);
    case EType::UInt8:
        return FindNumber<std::uint8_t>(stored);
    case EType::UInt16:
        return FindNumber<std::uint16_t>(stored);
    case EType::UInt32:
        return FindNumber<std::uint32_t>(stored);
    case EType::UInt64:
        return FindNumber<std::uint64_t>(stored);
    case EType::Float32:
        return FindReal<float>(stored);
    case EType::Float64:
        return FindReal<double>(stored);
    case EType::Enum8:
        return FindEnum<std::int8_t>(stored);
    case EType::Enum16:
        return FindEnum<std::int16_t>(stored);
    case EType::Enum32:
        return FindEnum<std::int32_t>(stored);
    default:
        return {1, &ConvertBool<bool>};
    }
}

/// Reads a number that an object holds in another form than the stored one.
class VReaderConvert : public IReaderCollapsable
{
public:
    VReaderConvert(std::uint64_t destinationOffset, const StoredForm& form_) : form(form_)
    {
        DestinationOffset = destinationOffset;
    }

    bool Read(IInputStream& stream, void* destination) override
    {
        unsigned char bytes[sizeof(std::uint64_t)];
        return stream.Read(bytes, form.size) && form.conversion(bytes, destination);
    }

private:
    const StoredForm form;
};

class VReaderString : public IReaderCollapsable
{
public:
    explicit VReaderString(std::uint64_t destinationOffset)
    {
        DestinationOffset = destinationOffset;
    }

    bool Read(IInputStream& stream, void* destination) override
    {
        std::string& text = *static_cast<std::string*>(destination);
        std::uint32_t stored = 0;
        if (!stream.Read(&stored, sizeof(stored))) {
            return false;
        }
        const std::size_t count = stored;
        std::size_t done = 0;
        while (done < count) {
            const std::size_t block =
                std::min(count - done, std::max<std::size_t>(done, MostBytesUnseen));
            text.resize(done + block);
            if (!stream.Read(&text[done], block)) {
                return false;
            }
            done += block;
        }
        text.resize(count);
        return true;
    }
};

/// A run of bytes that is copied, or a part that has a reader of its own.
struct TupleStep
{
    std::uint64_t offset = 0; // of the run, or of the object to which the part belongs
    std::uint32_t size = 0;
    ReaderPointer reader; // null for a run
};

class VReaderTuple : public IReaderCollapsable
{
public:
    VReaderTuple(std::uint64_t destinationOffset, std::vector<TupleStep> steps_)
        : steps(std::move(steps_))
    {
        DestinationOffset = destinationOffset;
    }

    bool Read(IInputStream& stream, void* destination) override
    {
        auto* const object = static_cast<unsigned char*>(destination);
        for (const TupleStep& step : steps) {
            void* const place = object + step.offset;
            const bool good = step.reader == nullptr
                                  ? stream.Read(place, step.size)
                                  : step.reader->Read(stream, PlaceOf(place, *step.reader));
            if (!good) {
                return false;
            }
        }
        return true;
    }

    const std::vector<TupleStep>& GetSteps() const { return steps; }

private:
    const std::vector<TupleStep> steps;
};

bool IsExtendedBy(const TupleStep& run, const TupleStep& next)
{
    return run.reader == nullptr && next.reader == nullptr &&
           run.offset + run.size == next.offset &&
           std::uint64_t{run.size} + next.size <= mostFlatBytes;
}

void AddStep(std::vector<TupleStep>& steps, const TupleStep& next)
{
    if (!steps.empty() && IsExtendedBy(steps.back(), next)) {
        steps.back().size += next.size;
    } else {
        steps.push_back(next);
    }
}

/// Returns the steps of all parts. A tuple among them gives its own, so that runs also join across
/// its ends.
std::vector<TupleStep> MakeSteps(const std::vector<ReaderPointer>& parts)
{
    std::vector<TupleStep> steps;
    for (const ReaderPointer& part : parts) {
        const bool isFlat =
            part->FlatSize != 0 && part->DestinationOffset != IReaderCollapsable::NoOffset;
        if (isFlat) {
            AddStep(steps, {part->DestinationOffset, part->FlatSize, nullptr});
        } else if (const auto* tuple = dynamic_cast<const VReaderTuple*>(part.get())) {
            for (const TupleStep& step : tuple->GetSteps()) {
                AddStep(steps, {tuple->DestinationOffset + step.offset, step.size, step.reader});
            }
        } else {
            AddStep(steps, {0, 0, part});
        }
    }
    return steps;
}

class VReaderArray : public IReaderCollapsable
{
public:
    VReaderArray(std::uint64_t destinationOffset, ReaderPointer element_, std::uint64_t stride_,
                 std::uint32_t count_)
        : element(std::move(element_)), stride(stride_), count(count_)
    {
        DestinationOffset = destinationOffset;
    }

    bool Read(IInputStream& stream, void* destination) override
    {
        auto* object = static_cast<unsigned char*>(destination);
        for (std::uint32_t i = 0; i < count; ++i, object += stride) {
            if (!element->Read(stream, PlaceOf(object, *element))) {
                return false;
            }
        }
        return true;
    }

private:
    const ReaderPointer element;
    const std::uint64_t stride;
    const std::uint32_t count;
};

bool IsMapped(const ISchema& stored, const ISchema& current)
{
    EnumMapping mapping;
    std::vector<std::string> errors;
    return BuildEnumMapping(stored, current, mapping, errors) && !mapping.empty();
}

std::string NameStep(const std::string& name)
{
    return name.empty() ? std::string() : "." + name;
}

std::string IndexStep(std::size_t index)
{
    return "[" + std::to_string(index) + "]";
}

class VEmptyStream : public IInputStream
{
public:
    bool Read(void*, std::size_t count) override
    {
        isPastEnd = isPastEnd || count != 0;
        return count == 0;
    }

    bool IsPastEnd() const override { return isPastEnd; }

private:
    bool isPastEnd = false;
};

} // namespace

VReaderCopy::VReaderCopy(std::uint64_t destinationOffset, std::uint32_t size)
{
    DestinationOffset = destinationOffset;
    FlatSize = size;
}

bool VReaderCopy::Read(IInputStream& stream, void* destination)
{
    return stream.Read(destination, FlatSize);
}

ReaderPointer MakeNumberReader(EType currentType, const ReaderBuildContext& context)
{
    if (!IsReadableAs(context.StoredType, currentType)) {
        return nullptr;
    }
    const StoredForm form = FindForm(context.StoredType, currentType);
    if (context.StoredType == currentType && currentType != EType::Bool) {
        return std::make_shared<VReaderCopy>(context.Offset, form.size);
    }
    return std::make_shared<VReaderConvert>(context.Offset, form);
}

ReaderPointer MakeStringReader(const ReaderBuildContext& context)
{
    return context.StoredType == EType::String ? std::make_shared<VReaderString>(context.Offset)
                                               : nullptr;
}

ReaderPointer MakeTupleReader(EType currentType, const ReaderBuildContext& context)
{
    if (!IsReadableAs(context.StoredType, currentType)) {
        return nullptr;
    }
    std::vector<TupleStep> steps = MakeSteps(context.Children);
    if (steps.size() == 1 && steps.front().reader == nullptr) {
        return std::make_shared<VReaderCopy>(context.Offset + steps.front().offset,
                                             steps.front().size);
    }
    return std::make_shared<VReaderTuple>(context.Offset, std::move(steps));
}

ReaderPointer MakeArrayReader(std::uint64_t stride, std::uint32_t count,
                              const ReaderBuildContext& context)
{
    if (context.StoredType != EType::Array || context.Children.size() != 1) {
        return nullptr;
    }
    const ReaderPointer& element = context.Children.front();
    const bool fits = count != 0 && stride <= mostFlatBytes / count;
    if (fits && IsPacked(*element, stride)) {
        return std::make_shared<VReaderCopy>(context.Offset,
                                             static_cast<std::uint32_t>(stride * count));
    }
    return std::make_shared<VReaderArray>(context.Offset, element, stride, count);
}

bool ConsumesNothing(IReaderCollapsable& reader, void* object)
{
    VEmptyStream stream;
    return reader.Read(stream, PlaceOf(object, reader));
}

void FindUnmappableEnums(const ISchema& stored, const ISchema& current,
                         std::vector<std::string>& errors, const std::string& outerPath)
{
    const std::string path =
        stored.TypeName.empty() ? outerPath : outerPath + "<" + stored.TypeName + ">";
    if (IsEnumType(stored.Type)) {
        if (IsMapped(stored, current) &&
            (stored.Type != EType::Enum32 || current.Type != EType::Enum32)) {
            errors.push_back(path + ": Enum was renumbered and is not stored in 32 bits");
        }
        return;
    }
    const bool isNamed = stored.Type == EType::NamedTuple;
    const VMemberIndex storedMembers(stored);
    for (std::size_t i = 0; i < current.SubSchemas.size(); ++i) {
        const ISchema::SubSchema& part = current.SubSchemas[i];
        const std::size_t index = isNamed ? storedMembers.Find(part.first) : i;
        if (index < stored.SubSchemas.size()) { // else it is a new member
            FindUnmappableEnums(stored.SubSchemas[index].second, part.second, errors,
                                path + (isNamed ? NameStep(part.first) : IndexStep(i)));
        }
    }
}

} // namespace Detail
} // namespace IO
} // namespace KVR
