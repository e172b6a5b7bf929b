#include "Allocations.hpp"

#include <malloc.h>

#include <cstddef>
#include <cstdlib>
#include <new>

namespace {

// The benchmarks that count run in one thread.
std::uint64_t count = 0;

} // namespace

std::uint64_t bench::allocations()
{
    return count;
}

std::uint64_t bench::heapBytes()
{
    struct mallinfo2 const info = mallinfo2();
    return info.uordblks + info.hblkhd;
}

void* operator new(std::size_t size)
{
    ++count;
    if (void* const memory = std::malloc(size))
        return memory;
    throw std::bad_alloc();
}

void operator delete(void* memory) noexcept
{
    std::free(memory);
}

void operator delete(void* memory, std::size_t) noexcept
{
    std::free(memory);
}
