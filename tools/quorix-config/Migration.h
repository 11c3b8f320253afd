#pragma once

#include "ConfigurationFile.h"

#include <cstddef>
#include <map>
#include <string>
#include <vector>

namespace QuorixConfig {

using ItemMap = std::map<VDataPath, VItem>;

/// What there is to say of an item that is carried over.
struct VMigrationLine
{
    bool IsError = false; ///< the item is left out
    std::string Text;     ///< begins with the path of the item, and of the place in its value
};

/// What carrying items over came to.
struct VMigration
{
    ItemMap Items; ///< every item that could be carried over, with both of its values
    std::vector<VMigrationLine> Lines;
    std::size_t LeftOut = 0; ///< how many items are not among them
};

/// Carries every item over into the schema that the item of the same path has in `current`, whose
/// values do not matter. What cannot be carried over is left out whole. An item that only `current`
/// has is not added: whoever loads the result has a default for it.
VMigration Migrate(const ItemMap& old, const ItemMap& current);

} // namespace QuorixConfig
