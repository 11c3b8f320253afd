#pragma once

#include "ControlStreamClient/Error.h"

#include <utility>
#include <variant>

namespace ControlStream {

/// What came of a request: its result, or the error that took its place.
///
/// Threads: a plain value.
template <typename TResult>
class VOutcome
{
public:
    VOutcome(TResult result) : content(std::move(result)) {}
    VOutcome(VError error) : content(std::move(error)) {}

    /// Whether there is a result.
    explicit operator bool() const { return content.index() == 0; }

    /// Returns the result. Throws the error where there is none.
    const TResult& Get() const&
    {
        ThrowError();
        return *std::get_if<0>(&content);
    }
    TResult Get() &&
    {
        ThrowError();
        return std::move(*std::get_if<0>(&content));
    }

    /// Returns the error, null where there is a result.
    const VError* Error() const { return std::get_if<1>(&content); }

private:
    void ThrowError() const
    {
        if (const VError* error = Error()) {
            throw VError(*error);
        }
    }

    std::variant<TResult, VError> content;
};

} // namespace ControlStream
