#pragma once

#include <nlohmann/json.hpp>

/// Measures how long it takes to find the one instance of a known schema, on one thread and on two.
///
/// @param calls  how many look-ups make a sample
nlohmann::json MeasureInterning(unsigned rounds, unsigned calls);
