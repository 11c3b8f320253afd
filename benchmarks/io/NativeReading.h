#pragma once

#include <nlohmann/json.hpp>

#include <cstddef>

/// Measures the reading of C++ objects beside copying the same bytes, and the reader of an older
/// schema that is the current one beside the plain reader.
///
/// @param count  how many records the list has that both readers read
nlohmann::json MeasureNativeReading(unsigned rounds, std::size_t count);
