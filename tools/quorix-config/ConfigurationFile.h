#pragma once

#include "QuorixDataStore/DataPath.h"
#include "io/DataValue.h"

#include <cstddef>
#include <iosfwd>
#include <map>
#include <string>
#include <vector>

namespace QuorixConfig {

/// The greatest file that is taken: a wrong path shall not fill the memory.
constexpr std::size_t greatestFile = std::size_t(512) << 20;

/// The two values of an item; either may be empty.
struct VItem
{
    const KVR::IO::ISchema* Schema = nullptr;
    VDataValue Proposed;
    VDataValue Verified;

    /// Returns the value that a user of the item would see.
    const VDataValue& Current() const { return Proposed.Empty() ? Verified : Proposed; }
};

bool operator==(const VItem& left, const VItem& right);

/// A configuration file as it was loaded: by the code that every host loads it with.
struct VConfigurationFile
{
    std::vector<std::string> Errors; ///< without any the file is as it should be
    std::vector<std::string> Warnings;
    std::map<VDataPath, VItem> Items;

    /// Returns the item whose path has this text, null if there is none.
    const VItem* Find(const std::string& pathText) const;
};

/// Loads a file; what is wrong with it is among the errors.
VConfigurationFile LoadFile(const std::string& path);

/// Loads the text of a file.
VConfigurationFile LoadText(std::string text);

/// Loads a file for a subcommand whose business is with the items, and tells of everything that is
/// wrong with it.
///
/// @return false if there is an error
bool LoadForUse(const std::string& path, VConfigurationFile& file, std::ostream& errors);

} // namespace QuorixConfig
