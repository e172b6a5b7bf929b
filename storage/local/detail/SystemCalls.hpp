#pragma once

#include <foundation/export.hpp>

#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <fcntl.h>
#include <linux/openat2.h>
#include <poll.h>
#include <sys/stat.h>
#include <sys/types.h>

namespace foundation::storage::local::detail {

/// Every call that this provider makes to the operating system, as a table that tests put their own functions into.
///
/// Each function behaves as the POSIX or Linux call of its name: -1 and `errno` for a failure, except `fadvise`, whose
/// result nobody looks at, and `dup`, whose result is closed on exec. `ficlone` is the request `FICLONE` of `ioctl`.
struct SystemCalls
{
    int (*openat)(int folder, char const* path, int flags, mode_t mode);
    int (*openat2)(int folder, char const* path, open_how const* how, std::size_t size);
    int (*close)(int descriptor);
    int (*dup)(int descriptor);
    int (*fcntl)(int descriptor, int command, int argument);
    ssize_t (*read)(int descriptor, void* buffer, std::size_t count);
    ssize_t (*write)(int descriptor, void const* data, std::size_t count);
    off_t (*lseek)(int descriptor, off_t offset, int origin);
    int (*fadvise)(int descriptor, off_t offset, off_t length, int advice);
    int (*ftruncate)(int descriptor, off_t length);
    int (*fallocate)(int descriptor, int mode, off_t offset, off_t length);
    ssize_t (*copy_file_range)(int from, off64_t* fromOffset, int to, off64_t* toOffset, std::size_t count,
                               unsigned flags);
    int (*ficlone)(int to, int from);

    int (*fsync)(int descriptor);
    int (*fdatasync)(int descriptor);
    int (*syncfs)(int descriptor);

    ssize_t (*getdents64)(int descriptor, void* buffer, std::size_t size);
    int (*statx)(int folder, char const* path, int flags, unsigned mask, struct statx* result);
    int (*faccessat)(int folder, char const* path, int mode, int flags);
    int (*fchmod)(int descriptor, mode_t mode);
    int (*fchmodat)(int folder, char const* path, mode_t mode, int flags);
    int (*fchownat)(int folder, char const* path, uid_t owner, gid_t group, int flags);
    int (*utimensat)(int folder, char const* path, timespec const* times, int flags);
    ssize_t (*readlinkat)(int folder, char const* path, char* buffer, std::size_t size);

    ssize_t (*listxattr)(char const* path, char* list, std::size_t size);
    ssize_t (*getxattr)(char const* path, char const* name, void* value, std::size_t size);
    ssize_t (*flistxattr)(int descriptor, char* list, std::size_t size);
    ssize_t (*fgetxattr)(int descriptor, char const* name, void* value, std::size_t size);
    int (*fsetxattr)(int descriptor, char const* name, void const* value, std::size_t size, int flags);

    int (*mkdirat)(int folder, char const* path, mode_t mode);
    int (*unlinkat)(int folder, char const* path, int flags);
    int (*linkat)(int fromFolder, char const* from, int toFolder, char const* to, int flags);
    int (*symlinkat)(char const* target, int folder, char const* path);
    int (*renameat2)(int fromFolder, char const* from, int toFolder, char const* to, unsigned flags);

    int (*inotify_init1)(int flags);
    int (*inotify_add_watch)(int descriptor, char const* path, std::uint32_t mask);
    int (*inotify_rm_watch)(int descriptor, int watch);
    int (*eventfd)(unsigned count, int flags);
    int (*poll)(pollfd* descriptors, nfds_t count, int timeout);
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

/// The same; answers 0 or `errno`.
template <typename Call>
int errorOf(Call const& call)
{
    return retried(call) == -1 ? errno : 0;
}

} // namespace foundation::storage::local::detail
