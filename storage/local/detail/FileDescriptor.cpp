#include <storage/local/detail/FileDescriptor.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <cerrno>
#include <utility>

namespace foundation::storage::local::detail {

FileDescriptor::FileDescriptor(FileDescriptor&& other) noexcept : descriptor_(std::exchange(other.descriptor_, -1)) {}

FileDescriptor& FileDescriptor::operator=(FileDescriptor&& other) noexcept
{
    std::swap(descriptor_, other.descriptor_);
    return *this;
}

FileDescriptor::~FileDescriptor()
{
    static_cast<void>(close());
}

int FileDescriptor::close() noexcept
{
    if (!isOpen())
        return 0;
    // Linux gives the descriptor up before anything can interrupt, so that a second attempt could hit another file.
    int const result = systemCalls().close(std::exchange(descriptor_, -1));
    return result == -1 && errno != EINTR ? errno : 0;
}

} // namespace foundation::storage::local::detail
