#include "Comparison.h"

#include <algorithm>
#include <map>

namespace ControlStreamBenchmark {

namespace {

using VValues = std::vector<double>;

/// The values of each figure over the rounds. The figures of a sample and their order are the same
/// in every round, but for threads that come and go.
class VSeries
{
public:
    void Add(const VFigures& figures)
    {
        for (const auto& [name, value] : figures) {
            if (values.count(name) == 0) {
                names.push_back(name);
            }
            values[name].push_back(value);
        }
    }

    const std::vector<std::string>& Names() const { return names; }
    VValues Values(const std::string& name) const
    {
        const auto found = values.find(name);
        return found == values.end() ? VValues() : found->second;
    }

    nlohmann::ordered_json Medians() const
    {
        nlohmann::ordered_json medians;
        for (const std::string& name : names) {
            VValues sorted = Values(name);
            medians[name] = Median(sorted);
        }
        return medians;
    }

private:
    std::vector<std::string> names;
    std::map<std::string, VValues> values;
};

VValues Ratios(const VValues& first, const VValues& second)
{
    VValues ratios;
    for (std::size_t round = 0; round < std::min(first.size(), second.size()); ++round) {
        if (second[round] > 0) {
            ratios.push_back(first[round] / second[round]);
        }
    }
    return ratios;
}

void AddAims(nlohmann::ordered_json& result, const std::vector<VAim>& aims)
{
    for (const VAim& aim : aims) {
        const auto found = result["ratio"].find(aim.Figure);
        if (found == result["ratio"].end()) {
            continue;
        }
        const double ratio = found->get<double>();
        result["aims"][aim.Figure] = {
            {aim.IsUpperBound ? "at_most" : "at_least", aim.Ratio},
            {"reached", aim.IsUpperBound ? ratio <= aim.Ratio : ratio >= aim.Ratio}};
    }
}

} // namespace

nlohmann::ordered_json Compare(int rounds, const std::vector<VAim>& aims,
                               const std::function<VFigures()>& first,
                               const std::function<VFigures()>& second, const VSides& sides)
{
    first();
    second();
    VSeries firstSeries;
    VSeries secondSeries;
    for (int round = 0; round < rounds; ++round) {
        firstSeries.Add(first());
        secondSeries.Add(second());
    }

    nlohmann::ordered_json result;
    result[sides.First] = firstSeries.Medians();
    result[sides.Second] = secondSeries.Medians();
    for (const std::string& name : firstSeries.Names()) {
        VValues ratios = Ratios(firstSeries.Values(name), secondSeries.Values(name));
        if (!ratios.empty()) {
            result["ratio"][name] = Median(ratios); // sorts
            result["ratio_range"][name] = {ratios.front(), ratios.back()};
        }
    }
    AddAims(result, aims);
    return result;
}

} // namespace ControlStreamBenchmark
