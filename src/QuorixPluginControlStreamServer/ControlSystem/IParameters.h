#pragma once

#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <utility>

namespace ControlSystem {

/// The only carrier of values between devices, server and providers: the input of a command, its
/// reply, and the content of an event.
///
/// Names and values are wide text of 16-bit code units. Every value is text, formatted by the
/// provider that owns it. Threads: a plain value, for one thread at a time.
class IParameters
{
public:
    using Values = std::map<std::wstring, std::wstring, std::less<>>;
    using const_iterator = Values::const_iterator;

    /// Returns a copy of the value under `name`, or the empty text where there is none: an absent
    /// parameter cannot be told from an empty one.
    std::wstring Get(std::wstring_view name) const
    {
        const auto found = values.find(name);
        return found == values.end() ? std::wstring() : found->second;
    }

    /// Inserts the value under `name`, or overwrites the one that is there.
    void Set(std::wstring name, std::wstring value)
    {
        values.insert_or_assign(std::move(name), std::move(value));
    }

    /// Iterates over pairs of name and value, ordered by the code units of the names.
    const_iterator begin() const { return values.begin(); }
    const_iterator end() const { return values.end(); }

private:
    Values values;
};

} // namespace ControlSystem
