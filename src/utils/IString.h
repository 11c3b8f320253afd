#pragma once

/// A string that one library lets another fill, without their sharing a string class.
///
/// Threads: one at a time. The order of the operations is what the other library calls them by.
class IString
{
public:
    virtual ~IString() = default;

    /// Replaces the content.
    ///
    /// @param text  zero-terminated, may lie in this string's own content; null counts as empty
    virtual void Assign(const char* text) = 0;

    /// Assigns this string's text to `target`, which may be this string itself. What lies behind a
    /// zero in the text is not carried over.
    virtual void CopyTo(IString& target) const = 0;
};
