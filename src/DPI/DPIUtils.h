#pragma once

#include "DPI/Export.h"

namespace DPIUtils {

/// Scales a length in pixels of a display with 96 dots per inch to the primary screen, rounded to
/// the nearest pixel. A process without a GUI application or screen gets the length back. [gui]
KVR_DPI_EXPORT int Scale(int length);

} // namespace DPIUtils
