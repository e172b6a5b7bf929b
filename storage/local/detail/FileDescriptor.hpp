#pragma once

#include <foundation/export.hpp>

namespace foundation::storage::local::detail {

/// Owns an open file descriptor, or none.
class FOUNDATION_API FileDescriptor
{
public:
    FileDescriptor() = default;
    explicit FileDescriptor(int descriptor) noexcept : descriptor_(descriptor) {}
    FileDescriptor(FileDescriptor&& other) noexcept;
    FileDescriptor& operator=(FileDescriptor&& other) noexcept;
    ~FileDescriptor();

    bool isOpen() const noexcept { return descriptor_ >= 0; }
    int get() const noexcept { return descriptor_; }

    /// Closes; answers 0 or the `errno` of what could not be written back. The descriptor is gone in either case.
    [[nodiscard]] int close() noexcept;

private:
    int descriptor_ = -1;
};

} // namespace foundation::storage::local::detail
