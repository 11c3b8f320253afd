#pragma once

/// Marks what host and plug-in find in the one shared copy of this library; all else is hidden.
#define KVR_DPI_EXPORT __attribute__((visibility("default")))
