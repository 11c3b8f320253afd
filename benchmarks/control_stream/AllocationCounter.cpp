// Preloaded into a server by benchmark_control_stream: counts what the server asks of its heap into
// a page that both processes map. It calls the C library's own allocator underneath, so the counted
// server's heap behaves as it does without the counter.

#include "AllocationCounts.h"

#include <malloc.h>
#include <sys/mman.h>

#include <cerrno>
#include <cstddef>
#include <cstdlib>

// The C library's allocator under its second name, which no preloaded library hides.
extern "C" {
void* __libc_malloc(std::size_t size);                      // NOLINT(bugprone-reserved-identifier)
void* __libc_calloc(std::size_t count, std::size_t size);   // NOLINT(bugprone-reserved-identifier)
void* __libc_realloc(void* block, std::size_t size);        // NOLINT(bugprone-reserved-identifier)
void* __libc_memalign(std::size_t align, std::size_t size); // NOLINT(bugprone-reserved-identifier)
void __libc_free(void* block);                              // NOLINT(bugprone-reserved-identifier)
}

namespace {

using ControlStreamBenchmark::VAllocationCounts;

// Takes the counts until the constructor below has mapped the shared page, and for good in a
// process that was given none.
VAllocationCounts ownCounts;
std::atomic<VAllocationCounts*> counts{&ownCounts};

__attribute__((constructor)) void MapSharedCounts()
{
    const char* text = std::getenv(ControlStreamBenchmark::allocationCountsVariable);
    if (text == nullptr) {
        return;
    }
    const int descriptor = static_cast<int>(std::strtol(text, nullptr, 10));
    void* page =
        mmap(nullptr, sizeof(VAllocationCounts), PROT_READ | PROT_WRITE, MAP_SHARED, descriptor, 0);
    if (page != MAP_FAILED) {
        counts = static_cast<VAllocationCounts*>(page);
    }
}

void* Count(void* block)
{
    if (block != nullptr) {
        const auto size = static_cast<std::int64_t>(malloc_usable_size(block));
        VAllocationCounts* page = counts.load(std::memory_order_relaxed);
        page->Allocations.fetch_add(1, std::memory_order_relaxed);
        page->AllocatedBytes.fetch_add(size, std::memory_order_relaxed);
        page->LiveBytes.fetch_add(size, std::memory_order_relaxed);
    }
    return block;
}

void Uncount(std::size_t size)
{
    counts.load(std::memory_order_relaxed)
        ->LiveBytes.fetch_sub(static_cast<std::int64_t>(size), std::memory_order_relaxed);
}

} // namespace

extern "C" {

void* malloc(std::size_t size)
{
    return Count(__libc_malloc(size));
}

void* calloc(std::size_t count, std::size_t size)
{
    return Count(__libc_calloc(count, size));
}

void* realloc(void* block, std::size_t size)
{
    const std::size_t oldSize = block == nullptr ? 0 : malloc_usable_size(block);
    void* newBlock = __libc_realloc(block, size);
    if (newBlock != nullptr || size == 0) {
        Uncount(oldSize);
    }
    return Count(newBlock);
}

void* memalign(std::size_t alignment, std::size_t size)
{
    return Count(__libc_memalign(alignment, size));
}

void* aligned_alloc(std::size_t alignment, std::size_t size)
{
    return Count(__libc_memalign(alignment, size));
}

int posix_memalign(void** result, std::size_t alignment, std::size_t size)
{
    void* block = Count(__libc_memalign(alignment, size));
    if (block == nullptr) {
        return ENOMEM;
    }
    *result = block;
    return 0;
}

void free(void* block)
{
    if (block != nullptr) {
        Uncount(malloc_usable_size(block));
    }
    __libc_free(block);
}

} // extern "C"
