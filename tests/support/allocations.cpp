#include <tests/support/allocations.hpp>

#include <cstdlib>
#include <malloc.h>

// Replaces the allocation functions of the whole process, so that the libraries under test are counted too.

namespace {

thread_local std::size_t calls = 0;
thread_local std::size_t callToFail = 0; // 0: none
thread_local std::ptrdiff_t living = 0;
thread_local std::ptrdiff_t bytes = 0;

std::ptrdiff_t sizeOf(void* memory)
{
    return static_cast<std::ptrdiff_t>(malloc_usable_size(memory));
}

void* allocate(std::size_t size)
{
    ++calls;
    void* const memory = calls == callToFail ? nullptr : std::malloc(size == 0 ? 1 : size);
    if (memory == nullptr)
        throw std::bad_alloc();
    ++living;
    bytes += sizeOf(memory);
    return memory;
}

void release(void* memory)
{
    if (memory != nullptr) {
        --living;
        bytes -= sizeOf(memory);
    }
    std::free(memory);
}

} // namespace

namespace foundation::tests::support {

std::size_t allocations()
{
    return calls;
}

std::ptrdiff_t livingAllocations()
{
    return living;
}

std::ptrdiff_t livingBytes()
{
    return bytes;
}

FailingAllocation::FailingAllocation(std::size_t number)
{
    callToFail = calls + number;
}

FailingAllocation::~FailingAllocation()
{
    callToFail = 0;
}

} // namespace foundation::tests::support

void* operator new(std::size_t size)
{
    return allocate(size);
}

void* operator new[](std::size_t size)
{
    return allocate(size);
}

void operator delete(void* memory) noexcept
{
    release(memory);
}

void operator delete[](void* memory) noexcept
{
    release(memory);
}

void operator delete(void* memory, std::size_t) noexcept
{
    release(memory);
}

void operator delete[](void* memory, std::size_t) noexcept
{
    release(memory);
}
