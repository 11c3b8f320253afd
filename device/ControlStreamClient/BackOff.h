#pragma once

#include <chrono>
#include <functional>

namespace ControlStream {

/// How long to wait before a connection is tried again.
struct VBackOffOptions
{
    std::chrono::milliseconds First{100};    ///< after the first failure; then it doubles
    std::chrono::milliseconds Longest{5000}; ///< beyond which it does not grow
    double Spread = 0.25; ///< up to this share is taken off by chance, so that the devices of a
                          ///< stage do not all come at once when their host starts again
};

/// Waits that grow from failure to failure.
///
/// Threads: a plain object.
class VBackOff
{
public:
    using Chance = std::function<double()>; ///< returns a number from 0 to below 1

    explicit VBackOff(const VBackOffOptions& backOffOptions, Chance chance = &RandomChance);

    /// Returns how long to wait now.
    std::chrono::milliseconds Next();

    /// Begins anew: it worked.
    void Reset() { step = options.First; }

private:
    static double RandomChance();

    const VBackOffOptions options;
    const Chance chance;
    std::chrono::milliseconds step;
};

} // namespace ControlStream
