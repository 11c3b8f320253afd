#include "utils/FormatMessage.h"

#include <boost/format.hpp>

#include <locale>

namespace KVR {

// Of this file alone, but in the namespace of its argument, where Boost.Format looks for it.
static std::ostream& operator<<(std::ostream& stream, const VFormatArgument& argument)
{
    argument.WriteTo(stream);
    return stream;
}

bool TryFormatMessage(std::string& text, const char* format, const VFormatArgument* arguments,
                      std::size_t count)
{
    try {
        // A global locale with grouping would print 1.234 for 1234.
        boost::format message(format, std::locale::classic());
        for (std::size_t i = 0; i < count; ++i) {
            message % arguments[i];
        }
        text = message.str();
        return true;
    } catch (...) {
        // The format does not fit, or an argument's own operator threw: the line says which format.
        text = std::string("Cannot Format Log Message \"") + format + "\"";
        return false;
    }
}

} // namespace KVR
