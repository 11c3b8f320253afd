#include "Measurements.h"

namespace ControlStreamBenchmark {

std::vector<VPlacement> RatePlacements(const VSettings& settings)
{
    if (settings.OwnCores.IsShared()) {
        return {settings.SharedCore};
    }
    return {settings.OwnCores, settings.SharedCore};
}

} // namespace ControlStreamBenchmark
