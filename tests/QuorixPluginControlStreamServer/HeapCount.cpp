#include "HeapCount.h"

#include <malloc.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace {

std::atomic<std::size_t> liveBytes{0};
thread_local std::size_t allocations = 0;

void* Allocate(std::size_t size, std::size_t alignment)
{
    // aligned_alloc asks for a multiple of the alignment.
    void* memory =
        alignment <= alignof(std::max_align_t)
            ? std::malloc(size > 0 ? size : 1)
            : std::aligned_alloc(alignment, (size + alignment - 1) / alignment * alignment);
    if (memory == nullptr) {
        throw std::bad_alloc();
    }
    liveBytes += malloc_usable_size(memory);
    ++allocations;
    return memory;
}

void Free(void* memory) noexcept
{
    if (memory != nullptr) {
        liveBytes -= malloc_usable_size(memory);
        std::free(memory);
    }
}

} // namespace

std::size_t LiveHeapBytes()
{
    return liveBytes;
}

std::size_t AllocationsOfThisThread()
{
    return allocations;
}

void* operator new(std::size_t size)
{
    return Allocate(size, 1);
}

void* operator new[](std::size_t size)
{
    return Allocate(size, 1);
}

void* operator new(std::size_t size, std::align_val_t alignment)
{
    return Allocate(size, static_cast<std::size_t>(alignment));
}

void* operator new[](std::size_t size, std::align_val_t alignment)
{
    return Allocate(size, static_cast<std::size_t>(alignment));
}

void operator delete(void* memory) noexcept
{
    Free(memory);
}

void operator delete[](void* memory) noexcept
{
    Free(memory);
}

void operator delete(void* memory, std::size_t /*size*/) noexcept
{
    Free(memory);
}

void operator delete[](void* memory, std::size_t /*size*/) noexcept
{
    Free(memory);
}

void operator delete(void* memory, std::align_val_t /*alignment*/) noexcept
{
    Free(memory);
}

void operator delete[](void* memory, std::align_val_t /*alignment*/) noexcept
{
    Free(memory);
}

void operator delete(void* memory, std::size_t /*size*/, std::align_val_t /*alignment*/) noexcept
{
    Free(memory);
}

void operator delete[](void* memory, std::size_t /*size*/, std::align_val_t /*alignment*/) noexcept
{
    Free(memory);
}
