#pragma once

#include "notification/Shared.h"

#include <memory>
#include <type_traits>
#include <utility>

namespace MakeSharedDetail {

/// The one concrete form of a class that derives from `KVR::VShared`.
template <typename T>
class VSharedFinal : public T
{
public:
    template <typename... Args>
    explicit VSharedFinal(Args&&... arguments) : T(std::forward<Args>(arguments)...)
    {
    }

private:
    void MadeByMakeShared() final {}
};

} // namespace MakeSharedDetail

namespace KVR {

/// Makes an object of a class that derives from `VShared`, and runs its `OnCreated` once
/// `shared_from_this` works.
///
/// @throw whatever the constructor or `OnCreated` throws; nothing is left of the object then
/// @return never null
template <typename T, typename... Args>
std::shared_ptr<T> MakeShared(Args&&... arguments)
{
    static_assert(std::is_base_of<VShared, T>::value, "only classes that derive from VShared");

    const auto object =
        std::make_shared<MakeSharedDetail::VSharedFinal<T>>(std::forward<Args>(arguments)...);
    // Through the base, since a class may have made its override private.
    static_cast<VShared&>(*object).OnCreated();
    return object;
}

} // namespace KVR
