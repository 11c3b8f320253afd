#pragma once

#include <sys/resource.h>

/// Keeps a death test from leaving a core file in the folder where the tests run.
inline void NoCoreFile()
{
    const rlimit none = {0, 0};
    (void)setrlimit(RLIMIT_CORE, &none);
}
