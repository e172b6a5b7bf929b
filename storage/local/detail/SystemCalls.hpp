#pragma once

#include <foundation/export.hpp>

#include <cerrno>
#include <cstddef>
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/types.h>

namespace foundation::storage::local::detail {

/// Every call that this provider makes to the operating system, as a table that tests put their own functions into.
///
/// Each function behaves as the POSIX or Linux call of its name: -1 and `errno` for a failure, except `fadvise`, whose
/// result nobody looks at.
struct SystemCalls
{
    int (*openat)(int folder, char const* path, int flags, mode_t mode);
    int (*close)(int descriptor);
    ssize_t (*read)(int descriptor, void* buffer, std::size_t count);
    ssize_t (*write)(int descriptor, void const* data, std::size_t count);
    off_t (*lseek)(int descriptor, off_t offset, int origin);
    int (*fadvise)(int descriptor, off_t offset, off_t length, int advice);
    ssize_t (*getdents64)(int descriptor, void* buffer, std::size_t size);
    int (*statx)(int folder, char const* path, int flags, unsigned mask, struct statx* result);
    int (*faccessat)(int folder, char const* path, int mode, int flags);
    int (*mkdirat)(int folder, char const* path, mode_t mode);
    int (*unlinkat)(int folder, char const* path, int flags);
    int (*linkat)(int fromFolder, char const* from, int toFolder, char const* to, int flags);
    int (*renameat2)(int fromFolder, char const* from, int toFolder, char const* to, unsigned flags);
};

/// The calls of the operating system.
FOUNDATION_API extern SystemCalls const realSystemCalls;

/// The table in use.
FOUNDATION_API SystemCalls const& systemCalls() noexcept;

/// Puts another table in use, for the whole process, and answers the one that was. For tests; the table must outlive
/// its use.
FOUNDATION_API SystemCalls const& replaceSystemCalls(SystemCalls const& calls) noexcept;

/// Makes a call again for as long as a signal interrupts it.
template <typename Call>
auto retried(Call const& call)
{
    auto result = call();
    while (result == -1 && errno == EINTR)
        result = call();
    return result;
}

} // namespace foundation::storage::local::detail
