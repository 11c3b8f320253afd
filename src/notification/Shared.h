#pragma once

#include <memory>

namespace KVR {

/// Base of objects that must be inside a `std::shared_ptr` before they start work.
///
/// Every class that derives from it is abstract, and `MakeShared` makes the only concrete form of
/// each, so that no such object can be made on the stack or by a plain `new`.
class VShared : public std::enable_shared_from_this<VShared>
{
public:
    /// Runs once, right after construction, on the thread of `MakeShared`. Overridden to start work
    /// that needs `shared_from_this`, which a constructor has not got.
    virtual void OnCreated() {}

    /// Reserved: nobody overrides or calls it. It keeps the slots of the operations after it.
    virtual void OnReserved() {}

private:
    /// Has no use but to make deriving classes abstract.
    virtual void MadeByMakeShared() = 0;

public:
    virtual ~VShared() = default;
};

} // namespace KVR
