#pragma once

#include <nlohmann/json.hpp>

#include <functional>
#include <optional>
#include <vector>

/// Returns how many seconds a call takes, on the clock.
double SecondsOf(const std::function<void()>& work);

/// Returns how many seconds of a processor a call takes on the calling thread: another program on
/// the machine does not count.
double ProcessorSecondsOf(const std::function<void()>& work);

/// Returns the middle one of some numbers; there must be one.
double MedianOf(std::vector<double> numbers);

/// Returns {least, greatest} of some ratios; there must be one.
nlohmann::json RangeOf(const std::vector<double>& ratios);

/// Measures two pieces of work in turn, since the speed of a machine drifts more between two runs
/// than between two neighbouring samples.
///
/// @param operations  how many operations one call makes
/// @param aim         what the ratio of `own` to `limit` should not exceed, if there is an aim
/// @return nanoseconds of a processor for one operation of each, and the median, least and greatest
/// of the ratios
nlohmann::json Compare(unsigned rounds, double operations, const std::function<void()>& own,
                       const std::function<void()>& limit, std::optional<double> aim);
