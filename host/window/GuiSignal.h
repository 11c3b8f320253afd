#pragma once

#include <boost/function.hpp>

#include <memory>

namespace QuorixHost {

/// Has a function called on the event loop after any thread has asked for it; several wishes before
/// the loop turns make one call.
///
/// Threads: made and destroyed [gui]; what Waker returns [any], also after this object has gone,
/// and then without effect.
class VGuiSignal
{
public:
    /// @param function  called on the event loop, with no lock held
    explicit VGuiSignal(boost::function<void()> function);
    ~VGuiSignal();

    VGuiSignal(const VGuiSignal&) = delete;
    VGuiSignal& operator=(const VGuiSignal&) = delete;

    boost::function<void()> Waker() const;

private:
    struct VGate;

    const std::shared_ptr<VGate> gate;
};

} // namespace QuorixHost
