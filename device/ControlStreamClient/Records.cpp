#include "ControlStreamClient/Records.h"

#include <algorithm>

namespace ControlStream {

std::string GetValue(const VParameters& parameters, const std::string& name)
{
    const auto found =
        std::find_if(parameters.begin(), parameters.end(),
                     [&name](const VParameter& parameter) { return parameter.Name == name; });
    return found == parameters.end() ? std::string() : found->Value;
}

} // namespace ControlStream
