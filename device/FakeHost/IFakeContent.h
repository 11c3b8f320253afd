#pragma once

#include <memory>

class IControlSystem;

namespace FakeHost {

/// What a fake host has to tell: the dispatcher behind its server.
///
/// Threads: made and destroyed by one.
class IFakeContent
{
public:
    /// Returns the dispatcher, never empty.
    virtual std::shared_ptr<IControlSystem> ControlSystem() = 0;

    /// A device has connected; called on the server's thread, before anything is read from it.
    virtual void OnDevice() = 0;

    /// The host ends: what is to be said to the devices is said now, while they hear it yet.
    virtual void SayFarewell() = 0;

    virtual ~IFakeContent() = default;
};

} // namespace FakeHost
