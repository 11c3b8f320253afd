#pragma once

#include <nlohmann/json.hpp>

#include <ostream>

namespace ControlStreamBenchmark {

/// Prints what a comparison has an aim for, and what is not compared, one figure a line.
void PrintTable(std::ostream& out, const nlohmann::ordered_json& report);

} // namespace ControlStreamBenchmark
