#pragma once

#include "UtilsRapidXml/IVersion.h"

#include <cstddef>

/// What a configuration file is made of: the elements and attributes by name, and what each of them
/// is to those who write such a file by hand.
namespace DataStoreFileFormat {

struct VElementDescription
{
    const char* Name;
    const char* Documentation;
};

struct VAttributeDescription
{
    const char* Name;
    const char* TypeName;
    bool Required;
    const char* Documentation;
};

constexpr VElementDescription Configuration = {"Configuration",
                                               "The root node of a Quorix configuration file."};
constexpr VElementDescription Node = {
    "Node", "A component of a data path. This can own one or more child Nodes or a single child "
            "Item."};
constexpr VElementDescription Item = {
    "Item", "A data item with a value. This represents a value in the configuration."};

// Deliberate: one colon in the type name of the version and two in all others, as files'
// descriptions have always had it.
constexpr VAttributeDescription Version = {"version", "xsd:string", false,
                                           "The format version of the file"};
constexpr VAttributeDescription NodeName = {"name", "xsd::string", true,
                                            "The name of the data path component"};
constexpr VAttributeDescription ItemName = {"name", "xsd::string", true,
                                            "The name of the data item."};
constexpr VAttributeDescription Format = {"format", "xsd::string", true,
                                          "The format of the value held by the data item"};
constexpr VAttributeDescription Proposed = {
    "value-proposed", "xsd::string", false,
    "The data items proposed value. If 'value-verified' was missing, this is the value used to "
    "update the current configuration when loading."};
// Deliberate: "proposed" stands here too, as it does in every description that was handed out.
constexpr VAttributeDescription Verified = {
    "value-verified", "xsd::string", false,
    "The data items proposed value. If present, this is the value used to update the current "
    "configuration when loading."};

/// The only version that is written and accepted.
constexpr UtilsRapidXml::IVersion CurrentVersion{2, 0};

/// The version of a file that does not name one. It is not accepted.
constexpr UtilsRapidXml::IVersion UnnamedVersion{1, 0};

/// How much text the data paths of one file's items may have together. A file could otherwise
/// repeat one very long path in each of its items, and fill the memory from a few megabytes.
constexpr std::size_t GreatestPathText = std::size_t(256) << 20;

/// From this many components on, a further one counts as more text than it has. A store goes along
/// the whole path for each item, so that a few megabytes could keep it busy for minutes.
constexpr std::size_t ManyComponents = 32;
constexpr std::size_t FurtherComponentSize = 64;

} // namespace DataStoreFileFormat
