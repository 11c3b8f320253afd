#include "QuorixDataStoreTypes/GreyscaleMode.h"

#include "Variant/Interning.h"

namespace {

constexpr char typeDescription[] =
    "The camera greyscale modes. \\note The names match the values used in UI but we still need a "
    "prefix to clarify what the values are for.";

KVR::IO::ISchema DescribeGreyscaleMode()
{
    const auto entry = [](const char* name, EGreyscaleMode mode) {
        return KVR::IO::ISchema::EnumValue(name, static_cast<std::int32_t>(mode));
    };

    KVR::IO::ISchema schema;
    schema.Type = KVR::IO::EType::Enum32;
    schema.TypeName = "EGreyscaleMode";
    schema.EnumValues = {
        entry("Auto", EGreyscaleMode::Auto),   entry("None", EGreyscaleMode::None),
        entry("All", EGreyscaleMode::All),     entry("Only", EGreyscaleMode::Only),
        entry("Edges", EGreyscaleMode::Edges), entry("NoEdges", EGreyscaleMode::NoEdges)};
    schema.Docs = {
        typeDescription,
        "Sends greyscale blobs instead of centroids if the blob is below specified circularity,",
        "No greyscale or edges will be sent.",
        "All greyscale and edges will be sent in addition to centroids.",
        "All greyscale and edges will be sent but no centroids.",
        "Only edge data will be sent.",
        "No edge data will be sent, only greyscale and centroids.",
    };
    return schema;
}

} // namespace

const KVR::IO::ISchema& GreyscaleModeSchema()
{
    static const KVR::IO::ISchema& schema = KVR::IO::GetUniqueSchema(DescribeGreyscaleMode());
    return schema;
}
