#pragma once

#include <cstdint>
#include <string_view>

namespace ControlStreamServer {

/// Returns the text by which a result code goes on the wire, "Error: Unknown return code" for one
/// that has none. The code itself never goes there. [any]
std::wstring_view ResultText(std::int32_t code);

} // namespace ControlStreamServer
