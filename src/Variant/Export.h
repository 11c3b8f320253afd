#pragma once

/// Marks what the shared library `Variant` hands out; everything else in it stays hidden.
#define KVR_VARIANT_EXPORT __attribute__((visibility("default")))
