#pragma once

#include <unordered_map>

/// The key codes for which QML's `Keys` has a signal of its own, with the signals' signatures.
extern const std::unordered_map<int, const char*> QmlKeysSignalMetaMethodLookup;
