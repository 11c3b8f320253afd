#include "Items.h"

#include "Variant/Interning.h"

#include <algorithm>
#include <cstring>
#include <numeric>
#include <random>

namespace {

const char* const sections[] = {"Settings", "Hardware", "Timecode", "Calibration", "Network"};
const char* const names[] = {
    "StrobeIntensity", "Threshold", "ShutterDuration", "GreyscaleMode",   "UserId",
    "DisplayType",     "Gain",      "Connected",       "ConnectionCount", "ContributingTimecode"};

} // namespace

VItems::VItems(std::size_t count)
{
    for (std::size_t index = 0; index < count; ++index) {
        const std::size_t device = index / itemsPerDevice;
        const std::size_t value = index % itemsPerDevice;
        const VDataPath path{"Device", "qx:" + std::to_string(device), sections[value / 10],
                             names[value % 10]};
        Texts.push_back(path.Text());
        Tokens.emplace_back(path);
    }
    Random.resize(count);
    std::iota(Random.begin(), Random.end(), std::size_t(0));
    std::shuffle(Random.begin(), Random.end(), std::mt19937(1));
}

std::size_t VItems::Next()
{
    next = next + 1 < Random.size() ? next + 1 : 0;
    return Random[next];
}

VDataValue MakeNumber(double number)
{
    static const KVR::IO::ISchema& schema = KVR::IO::GetUniquePodSchema(KVR::IO::EType::Float64);
    VDataValue value{&schema, std::vector<unsigned char>(sizeof number)};
    std::memcpy(value.Bytes.data(), &number, sizeof number);
    return value;
}
