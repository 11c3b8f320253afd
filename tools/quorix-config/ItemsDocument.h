#pragma once

#include "ConfigurationFile.h"

#include <map>
#include <optional>
#include <string>

namespace QuorixConfig {

/// Returns the text of a file that holds just these items, or nothing if not every one of them can
/// be stored and written, or the text does not load as what was written. Of a real number the last
/// digits may differ, as in any file. There must be an item: a file without one is refused.
std::optional<std::string> PrintItems(const std::map<VDataPath, VItem>& items);

} // namespace QuorixConfig
