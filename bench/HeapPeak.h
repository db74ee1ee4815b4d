// The heap's use and peak in a benchmark program: include it in exactly one
// source of the program, which then replaces the global operator new and
// delete. heapPeak is reset by the benchmark before the step it measures.
#ifndef VELTMARQUIST_BENCH_HEAPPEAK_H
#define VELTMARQUIST_BENCH_HEAPPEAK_H

#include <malloc.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace heappeak {

inline std::atomic<long long> heapNow{0}, heapPeak{0};

inline void* allocate(std::size_t size)
{
    void* pointer = std::malloc(size == 0 ? 1 : size);
    if (pointer == nullptr)
        throw std::bad_alloc();
    const long long now = heapNow += static_cast<long long>(malloc_usable_size(pointer));
    for (long long peak = heapPeak; now > peak && !heapPeak.compare_exchange_weak(peak, now);) {
    }
    return pointer;
}

inline void release(void* pointer)
{
    if (pointer == nullptr)
        return;
    heapNow -= static_cast<long long>(malloc_usable_size(pointer));
    std::free(pointer);
}

// Starts a measurement: the peak from here on, above what is in use now.
inline long long startPeak()
{
    heapPeak = heapNow.load();
    return heapNow;
}

} // namespace heappeak

void* operator new(std::size_t size)
{
    return heappeak::allocate(size);
}
void* operator new[](std::size_t size)
{
    return heappeak::allocate(size);
}
void operator delete(void* pointer) noexcept
{
    heappeak::release(pointer);
}
void operator delete[](void* pointer) noexcept
{
    heappeak::release(pointer);
}
void operator delete(void* pointer, std::size_t) noexcept
{
    heappeak::release(pointer);
}
void operator delete[](void* pointer, std::size_t) noexcept
{
    heappeak::release(pointer);
}

#endif // VELTMARQUIST_BENCH_HEAPPEAK_H
