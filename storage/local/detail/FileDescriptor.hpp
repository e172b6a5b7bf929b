#pragma once

#include <foundation/export.hpp>

#include <utility>

namespace foundation::storage::local::detail {

/// Owns an open file descriptor, or none.
class FOUNDATION_API FileDescriptor
{
public:
    FileDescriptor() = default;
    explicit FileDescriptor(int descriptor) noexcept : descriptor_(descriptor) {}
    FileDescriptor(FileDescriptor&& other) noexcept : descriptor_(std::exchange(other.descriptor_, -1)) {}
    FileDescriptor& operator=(FileDescriptor&& other) noexcept
    {
        std::swap(descriptor_, other.descriptor_);
        return *this;
    }
    ~FileDescriptor()
    {
        if (isOpen())
            static_cast<void>(close());
    }

    bool isOpen() const noexcept { return descriptor_ >= 0; }
    int get() const noexcept { return descriptor_; }

    /// Closes; answers 0 or the `errno` of what could not be written back. The descriptor is gone in either case.
    [[nodiscard]] int close() noexcept;

private:
    int descriptor_ = -1;
};

} // namespace foundation::storage::local::detail
