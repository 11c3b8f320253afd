#pragma once

#include <map>
#include <string>

namespace ControlSystem {

/// The only carrier of values between devices, server and providers: the input of a command, its
/// reply, and the content of an event.
///
/// Names and values are wide text of 16-bit code units. Every value is text, formatted by the
/// provider that owns it. Threads: a plain value, for one thread at a time.
class IParameters
{
public:
    using const_iterator = std::map<std::wstring, std::wstring>::const_iterator;

    /// Returns a copy of the value under `name`, or the empty text where there is none: an absent
    /// parameter cannot be told from an empty one.
    std::wstring Get(const std::wstring& name) const
    {
        const auto found = values.find(name);
        return found == values.end() ? std::wstring() : found->second;
    }

    /// Inserts the value under `name`, or overwrites the one that is there.
    void Set(const std::wstring& name, const std::wstring& value) { values[name] = value; }

    /// Iterates over pairs of name and value, ordered by the code units of the names.
    const_iterator begin() const { return values.begin(); }
    const_iterator end() const { return values.end(); }

private:
    std::map<std::wstring, std::wstring> values;
};

} // namespace ControlSystem
