#pragma once

#include <new>
#include <sys/mman.h>

namespace foundation::tests::support {

/// A `T` that this process shares with the children that it makes from now on, and that outlives them.
template <typename T>
class SharedMemory
{
public:
    SharedMemory() : memory_(::mmap(nullptr, sizeof(T), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0))
    {
        if (memory_ == MAP_FAILED)
            throw std::bad_alloc();
        object_ = new (memory_) T();
    }
    ~SharedMemory() { ::munmap(memory_, sizeof(T)); }
    SharedMemory(SharedMemory const&) = delete;
    SharedMemory& operator=(SharedMemory const&) = delete;

    T& operator*() const { return *object_; }
    T* operator->() const { return object_; }

private:
    void* memory_;
    T* object_;
};

} // namespace foundation::tests::support
