// Allocation of the scratch buffers of one CalculateChart call. Not exported:
// the tests link the library's static core and replace the allocator to
// check what a host sees when memory runs out.
#ifndef VELTMARQUIST_SCRATCHALLOCATION_H
#define VELTMARQUIST_SCRATCHALLOCATION_H

#include <cstddef>

namespace scratch {

// Zero-filled allocation (calloc semantics); null on failure.
using Allocator = void* (*)(std::size_t count, std::size_t size);
// Replaces the allocator; null restores the default (std::calloc). Returns the previous one.
Allocator setAllocator(Allocator allocator);
void* allocate(std::size_t count, std::size_t size);
void release(void* buffer);

} // namespace scratch

#endif // VELTMARQUIST_SCRATCHALLOCATION_H
