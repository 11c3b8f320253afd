#pragma once

#include "utils/IStringDirect.h"

#include <string>

/// A standard string that other libraries can fill and read.
///
/// Threads: as `std::string`. Failure: as `std::string`, length and memory errors included.
class VStringStd : public IStringDirect, public std::string
{
public:
    using std::string::string;
    VStringStd() = default;
    VStringStd(const std::string& text) : std::string(text) {}

    void Assign(const char* text) override;
    void CopyTo(IString& target) const override;
    const char* CStr() const override;
};
