#pragma once

#include "UtilsRapidXml/RapidXml.h"

#include <optional>

/// Returns "AltToSelect" of an older user preference file, which has it as a string: false for
/// exactly "false" and true for any other.
///
/// @return empty where there is none, and for one of any other type, which reads as every item does
std::optional<bool> FindLegacyAltToSelect(const rapidxml::xml_document<char>& document);
