#pragma once

#include "utils/IString.h"

/// A string whose text may also be read in place.
class IStringDirect : public IString
{
public:
    /// Returns the zero-terminated text, which is valid until the string changes. Never null.
    virtual const char* CStr() const = 0;
};
