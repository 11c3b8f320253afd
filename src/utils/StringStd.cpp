#include "utils/StringStd.h"

void VStringStd::Assign(const char* text)
{
    // A copy first, since the text may be a part of what is being replaced.
    std::string copy(text != nullptr ? text : "");
    swap(copy);
}

void VStringStd::CopyTo(IString& target) const
{
    target.Assign(c_str());
}

const char* VStringStd::CStr() const
{
    return c_str();
}
