#include "Table.h"

#include <cstdio>
#include <iomanip>
#include <iterator>
#include <string>

namespace ControlStreamBenchmark {

namespace {

using VJson = nlohmann::ordered_json;

std::string Text(double value)
{
    char text[32];
    std::snprintf(text, sizeof text, value < 100 ? "%.3g" : "%.0f", value);
    return text;
}

void PrintLine(std::ostream& out, const std::string& name, const std::string& first,
               const std::string& second, const std::string& ratio, const std::string& aim)
{
    out << std::left << std::setw(66) << name << std::right << std::setw(11) << first
        << std::setw(11) << second << std::setw(9) << ratio << "  " << aim << '\n';
}

/// @return the name of a part of `name`, or of a figure of it
std::string NameOf(std::string name, const std::string& part)
{
    name += ' ';
    return name += part;
}

std::string AimText(const VJson& aim)
{
    const bool atMost = aim.contains("at_most");
    return (atMost ? "at most " : "at least ") +
           Text(aim[atMost ? "at_most" : "at_least"].get<double>()) +
           (aim["reached"].get<bool>() ? "" : "  MISSED");
}

void PrintComparison(std::ostream& out, const std::string& name, const VJson& part)
{
    const VJson& first = part.front();
    const VJson& second = *std::next(part.begin());
    for (const auto& [figure, aim] : part["aims"].items()) {
        PrintLine(out, NameOf(name, figure), Text(first[figure].get<double>()),
                  Text(second[figure].get<double>()), Text(part["ratio"][figure].get<double>()),
                  AimText(aim));
    }
}

void PrintPart(std::ostream& out, const std::string& name, const VJson& part)
{
    if (part.contains("ratio")) {
        PrintComparison(out, name, part);
        return;
    }
    for (const auto& [key, value] : part.items()) {
        if (value.is_number()) {
            const bool hasAim = part.contains("aims") && part["aims"].contains(key);
            PrintLine(out, NameOf(name, key), Text(value.get<double>()), "", "",
                      hasAim ? AimText(part["aims"][key]) : "");
        } else if (key != "aims") {
            PrintPart(out, NameOf(name, key), value);
        }
    }
}

} // namespace

void PrintTable(std::ostream& out, const nlohmann::ordered_json& report)
{
    PrintLine(out, "benchmark and figure", "host", "limit", "ratio", "aim");
    for (const auto& [name, part] : report["benchmarks"].items()) {
        PrintPart(out, name, part);
    }
    out.flush();
}

} // namespace ControlStreamBenchmark
