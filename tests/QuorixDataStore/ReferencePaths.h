#pragma once

#include "ReferenceStore.h"

#include <algorithm>
#include <cstddef>

namespace StoreTest {

inline bool StartsWith(const Names& path, const Names& prefix)
{
    return path.size() >= prefix.size() && std::equal(prefix.begin(), prefix.end(), path.begin());
}

/// True if a pattern names a path: "*" is one component, a last one any number of further ones.
inline bool NamesPath(const Names& pattern, const Names& path)
{
    if (pattern.empty() || pattern.size() > path.size() ||
        (pattern.size() < path.size() && pattern.back() != "*")) {
        return false;
    }
    for (std::size_t index = 0; index < pattern.size(); ++index) {
        if (pattern[index] != "*" && pattern[index] != path[index]) {
            return false;
        }
    }
    return true;
}

} // namespace StoreTest
