// Allocation of the scratch buffers of one CalculateChart call, through an
// allocator the tests may replace.
#include "ScratchAllocation.h"

#include <cstdlib>

namespace scratch {
namespace {
Allocator currentAllocator = nullptr;
}

Allocator setAllocator(Allocator allocator)
{
    const Allocator previous = currentAllocator;
    currentAllocator = allocator;
    return previous;
}

void* allocate(std::size_t count, std::size_t size)
{
    return currentAllocator != nullptr ? currentAllocator(count, size) : std::calloc(count, size);
}

void release(void* buffer)
{
    std::free(buffer);
}
} // namespace scratch

