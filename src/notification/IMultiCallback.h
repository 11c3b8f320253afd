#pragma once

#include <boost/function.hpp>

#include <cstddef>
#include <cstdint>

namespace KVR {

/// A list of functions of one signature that its owner calls in order of adding.
///
/// Threads: every operation may be called on any thread, also from a function of the same list;
/// what it changes takes effect from the next call.
template <typename Sig>
class IMultiCallback
{
public:
    /// Adds a function.
    ///
    /// @return an opaque handle, never 0, valid until the entry is removed
    virtual std::uint64_t Add(boost::function<Sig> function) = 0;

    /// @return how many entries were removed: 1, or 0 for an unknown handle
    virtual std::size_t Remove(std::uint64_t handle) = 0;

    /// Removes all functions. @return how many there were
    virtual std::size_t Clear() = 0;

    /// @return how many functions there are, those whose weak target has died included
    virtual std::size_t Count() const = 0;

    virtual ~IMultiCallback() = default;
};

} // namespace KVR
