#pragma once

#include <memory>
#include <utility>

namespace NotificationSystem {

/// A function object that calls the object it shares. Bound with its arguments it travels through a
/// postal service, and keeps the container of functions alive until it is delivered.
template <typename R, typename T>
class VCallableSharedPtr
{
public:
    typedef R result_type; // boost::bind asks for it

    /// @param object  never null
    explicit VCallableSharedPtr(std::shared_ptr<T> object) : target(std::move(object)) {}

    template <typename... Args>
    R operator()(Args&&... arguments) const
    {
        return (*target)(std::forward<Args>(arguments)...);
    }

private:
    std::shared_ptr<T> target;
};

} // namespace NotificationSystem
