#pragma once

#include <boost/function.hpp>

#include <cstddef>

namespace KVR {

/// A place for one function of a signature, which its owner calls.
///
/// Threads: every operation [any], also from the function itself; what it changes takes effect from
/// the next call.
template <typename Sig>
class ICallback
{
public:
    /// Stores a function in place of any earlier one.
    virtual void Set(boost::function<Sig> function) = 0;

    /// Drops the function. @return 1 if one was stored, else 0
    virtual std::size_t Clear() = 0;

    /// @return whether a function is stored, also if its weak target has died
    virtual bool IsSet() const = 0;

    virtual ~ICallback() = default;
};

} // namespace KVR
