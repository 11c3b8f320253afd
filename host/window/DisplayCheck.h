#pragma once

#include <chrono>
#include <optional>
#include <string>

namespace QuorixHost {

/// Finds out whether Qt can bring up a window, on whatever platform it will choose. Qt itself ends
/// the process where it cannot, so a copy of this process tries it first.
///
/// To be called while this process has one thread and no QGuiApplication.
///
/// @param limit  how long a display may take to answer
/// @return nothing where a window can come up, else why none can
std::optional<std::string> DescribeMissingDisplay(std::chrono::milliseconds limit);

} // namespace QuorixHost
