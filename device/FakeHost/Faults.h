#pragma once

#include "FakeHost/ByteProxy.h"

#include <chrono>
#include <cstdint>
#include <limits>
#include <memory>
#include <optional>

namespace FakeHost {

/// What goes wrong on the way between a device and its host. Several may be chosen together.
struct VFaults
{
    std::chrono::milliseconds Delay{};         ///< of everything that the host says
    std::optional<std::uint64_t> CutAfter;     ///< closes behind so many bytes of the host's
    std::optional<std::uint64_t> GarbageAfter; ///< after so many, what follows is noise
    bool NeverReplies = false;                 ///< the host's bytes are swallowed
    bool NeverReads = false;                   ///< the device's bytes are left in the network
    unsigned Connections = std::numeric_limits<unsigned>::max(); ///< so many are faulty, the first
                                                                 ///< ones; those behind are sound

    bool Any() const
    {
        return Delay.count() > 0 || CutAfter || GarbageAfter || NeverReplies || NeverReads;
    }
};

/// Makes the filter for a connection, 1 being the first.
std::unique_ptr<IByteFilter> MakeFaultFilter(const VFaults& faults, unsigned connection);

} // namespace FakeHost
