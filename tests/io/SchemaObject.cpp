#include "io/SchemaObject.h"

#include "io/BinaryLayout.h"
#include "io/IInputStream.h"
#include "io/NativeReaders.h"
#include "io/SchemaComparison.h"
#include "io/TypeWidth.h"

#include <boost/bind/bind.hpp>

#include <algorithm>
#include <cstring>
#include <new>
#include <string>

using namespace KVR;
using namespace KVR::IO;

namespace {

using ReaderPointer = std::shared_ptr<IReaderCollapsable>;

/// What a list holds in memory.
using Elements = std::vector<std::unique_ptr<VSchemaObject>>;

constexpr std::uint32_t mostUnstoredElements = 1000;

bool IsTuple(EType type)
{
    return type == EType::Tuple || type == EType::NamedTuple;
}

class VReaderElements : public IReaderCollapsable
{
public:
    VReaderElements(ReaderPointer element_, const VSchemaLayout& layout_, std::uint64_t offset)
        : element(std::move(element_)), layout(layout_)
    {
        DestinationOffset = offset;
        VSchemaObject object(layout);
        isUnstored = IO::Detail::ConsumesNothing(*element, object.Get());
    }

    bool Read(IInputStream& stream, void* destination) override
    {
        Elements& elements = *static_cast<Elements*>(destination);
        elements.clear();
        std::uint32_t count = 0;
        if (!stream.Read(&count, sizeof(count)) || (isUnstored && count > mostUnstoredElements)) {
            return false;
        }
        for (std::uint32_t i = 0; i < count; ++i) {
            elements.push_back(std::make_unique<VSchemaObject>(layout));
            void* const object = elements.back()->Get();
            if (!element->Read(stream, IO::Detail::PlaceOf(object, *element))) {
                return false;
            }
        }
        return true;
    }

private:
    const ReaderPointer element;
    const VSchemaLayout& layout;
    bool isUnstored = false;
};

ReaderPointer MakeElementsReader(const VSchemaLayout* layout, const ReaderBuildContext& context)
{
    if (context.StoredType != EType::List || context.Children.size() != 1 || layout->isTooLarge) {
        return nullptr;
    }
    return std::make_shared<VReaderElements>(context.Children.front(), *layout, context.Offset);
}

ReaderPointer MakeNothing(const ReaderBuildContext&)
{
    return nullptr;
}

/// Calls `visit` for each part of an object in its order, with the part's layout and place.
template <typename Visit>
void ForEachPart(const VSchemaLayout& layout, unsigned char* object, Visit visit)
{
    if (layout.schema.Type == EType::Array) {
        for (std::uint32_t i = 0; i < layout.schema.Count; ++i) {
            visit(layout.parts.front(), object + i * layout.parts.front().size);
        }
    } else if (IsTuple(layout.schema.Type)) {
        for (std::size_t i = 0; i < layout.parts.size(); ++i) {
            visit(layout.parts[i], object + layout.offsets[i]);
        }
    }
}

void Construct(const VSchemaLayout& layout, unsigned char* object)
{
    const ISchema& schema = layout.schema;
    if (schema.Type == EType::String) {
        new (object) std::string();
    } else if (schema.Type == EType::List) {
        new (object) Elements();
    } else if (IsEnumType(schema.Type)) {
        const std::int32_t first = schema.EnumValues.empty() ? 0 : schema.EnumValues.front().second;
        std::memcpy(object, &first, sizeof(first));
    } else if (WidthOf(schema.Type) != 0) {
        std::memset(object, 0, WidthOf(schema.Type));
    }
    ForEachPart(layout, object, &Construct);
}

void Destroy(const VSchemaLayout& layout, unsigned char* object)
{
    if (layout.schema.Type == EType::String) {
        reinterpret_cast<std::string*>(object)->~basic_string();
    } else if (layout.schema.Type == EType::List) {
        reinterpret_cast<Elements*>(object)->~Elements();
    }
    ForEachPart(layout, object, &Destroy);
}

void Append(std::vector<unsigned char>& bytes, const VSchemaLayout& layout, unsigned char* object)
{
    if (layout.schema.Type == EType::String) {
        IO::Detail::AppendString(bytes, *reinterpret_cast<const std::string*>(object));
    } else if (layout.schema.Type == EType::List) {
        const Elements& elements = *reinterpret_cast<const Elements*>(object);
        IO::Detail::AppendNumber(bytes, static_cast<std::uint32_t>(elements.size()));
        for (const std::unique_ptr<VSchemaObject>& element : elements) {
            element->AppendTo(bytes);
        }
    } else {
        bytes.insert(bytes.end(), object, object + WidthOf(layout.schema.Type));
    }
    ForEachPart(layout, object, [&bytes](const VSchemaLayout& part, unsigned char* place) {
        Append(bytes, part, place);
    });
}

} // namespace

VSchemaLayout::VSchemaLayout(const ISchema& schema_) : schema(schema_)
{
    for (const ISchema::SubSchema& part : schema.SubSchemas) {
        parts.emplace_back(part.second);
    }
    if (schema.Type == EType::String) {
        size = sizeof(std::string);
        alignment = alignof(std::string);
    } else if (schema.Type == EType::List) {
        size = sizeof(Elements);
        alignment = alignof(Elements);
    } else if (schema.Type == EType::Array) {
        PlaceElements();
    } else if (IsTuple(schema.Type)) {
        PlaceMembers();
    } else {
        size = IsEnumType(schema.Type) ? 4 : WidthOf(schema.Type);
        alignment = std::max<std::uint64_t>(size, 1);
    }
    isTooLarge = isTooLarge || size > MostBytes;
}

void VSchemaLayout::PlaceElements()
{
    if (parts.size() != 1) {
        isTooLarge = true; // it has no layout at all
        return;
    }
    alignment = parts.front().alignment;
    size = parts.front().isTooLarge ? MostBytes + 1 : parts.front().size * schema.Count;
    isTooLarge = schema.Count > MostBytes; // also of elements without bytes
}

void VSchemaLayout::PlaceMembers()
{
    for (const VSchemaLayout& part : parts) {
        alignment = std::max(alignment, part.alignment);
        size = (size + part.alignment - 1) / part.alignment * part.alignment;
        offsets.push_back(size);
        size += part.size;
        isTooLarge = isTooLarge || part.isTooLarge;
    }
    size = (size + alignment - 1) / alignment * alignment;
}

ReaderBuildNode VSchemaLayout::MakeNode(std::uint64_t offset) const
{
    using boost::placeholders::_1;
    ReaderBuildNode node;
    node.Offset = offset;
    for (std::size_t i = 0; i < parts.size(); ++i) {
        node.Children.push_back(parts[i].MakeNode(i < offsets.size() ? offsets[i] : 0));
    }
    if (schema.Type == EType::String) {
        node.MakeReader = &IO::Detail::MakeStringReader;
    } else if (schema.Type == EType::List && parts.size() == 1) {
        node.MakeReader = boost::bind(&MakeElementsReader, &parts.front(), _1);
    } else if (schema.Type == EType::Array && parts.size() == 1) {
        node.MakeReader =
            boost::bind(&IO::Detail::MakeArrayReader, parts.front().size, schema.Count, _1);
    } else if (IsTuple(schema.Type)) {
        node.MakeReader = boost::bind(&IO::Detail::MakeTupleReader, schema.Type, _1);
    } else if (WidthOf(schema.Type) != 0) {
        node.MakeReader = boost::bind(&IO::Detail::MakeNumberReader, schema.Type, _1);
    } else {
        node.MakeReader = &MakeNothing;
    }
    return node;
}

VSchemaObject::VSchemaObject(const VSchemaLayout& layout_)
    : layout(layout_), memory(new std::max_align_t[layout_.size / sizeof(std::max_align_t) + 1])
{
    Construct(layout, reinterpret_cast<unsigned char*>(memory.get()));
}

VSchemaObject::~VSchemaObject()
{
    Destroy(layout, reinterpret_cast<unsigned char*>(memory.get()));
}

void VSchemaObject::AppendTo(std::vector<unsigned char>& bytes) const
{
    Append(bytes, layout, reinterpret_cast<unsigned char*>(memory.get()));
}
