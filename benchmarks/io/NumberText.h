#pragma once

#include <nlohmann/json.hpp>

#include <cstddef>

/// Measures the text of a list of numbers beside the bare generator and parser of the same rules.
///
/// @param count  how many numbers the list has
nlohmann::json MeasureNumberText(unsigned rounds, std::size_t count);
