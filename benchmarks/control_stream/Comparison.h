#pragma once

#include "Statistics.h"

#include <nlohmann/json.hpp>

#include <functional>
#include <string>
#include <vector>

namespace ControlStreamBenchmark {

/// What a figure's ratio should come to. It is reported, and decides nothing.
struct VAim
{
    std::string Figure;
    double Ratio;
    bool IsUpperBound;
};

/// The names under which the two sides of a comparison are reported.
struct VSides
{
    std::string First = "host";
    std::string Second = "limit";
};

/// Takes samples of two sides in turn, `rounds` times each, after one of each that does not count,
/// since the machine's speed drifts by more than the sides differ.
///
/// @return for each side the median of each figure, and for each figure that both have the median
/// of the ratios, first to second, of samples taken one after the other, with the least and the
/// greatest
nlohmann::ordered_json Compare(int rounds, const std::vector<VAim>& aims,
                               const std::function<VFigures()>& first,
                               const std::function<VFigures()>& second, const VSides& sides = {});

} // namespace ControlStreamBenchmark
