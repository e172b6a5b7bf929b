#include <storage/local/detail/FileDescriptor.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <cerrno>
#include <utility>

namespace foundation::storage::local::detail {

int FileDescriptor::close() noexcept
{
    if (!isOpen())
        return 0;
    // Linux gives the descriptor up before anything can interrupt, so that a second attempt could hit another file.
    int const result = systemCalls().close(std::exchange(descriptor_, -1));
    return result == -1 && errno != EINTR ? errno : 0;
}

} // namespace foundation::storage::local::detail
