#pragma once

#include <QString>

#include <cstdint>
#include <utility>
#include <vector>

namespace QuorixHost {

/// Returns every greyscale mode with the name that the store's schema gives it.
std::vector<std::pair<std::int32_t, QString>> GreyscaleModes();

/// Returns the name of a mode; a number that is none stands for itself.
QString GreyscaleName(std::int32_t number);

} // namespace QuorixHost
