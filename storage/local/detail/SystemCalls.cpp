#include <storage/local/detail/SystemCalls.hpp>

#include <atomic>
#include <cstdio>
#include <dirent.h>
#include <linux/fs.h>
#include <sys/eventfd.h>
#include <sys/inotify.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace foundation::storage::local::detail {

constinit SystemCalls const realSystemCalls{
    .openat = [](int folder, char const* path, int flags, mode_t mode) { return ::openat(folder, path, flags, mode); },
    .openat2 = [](int folder, char const* path, open_how const* how,
                  std::size_t size) { return static_cast<int>(::syscall(SYS_openat2, folder, path, how, size)); },
    .close = ::close,
    .dup = [](int descriptor) { return ::fcntl(descriptor, F_DUPFD_CLOEXEC, 0); },
    .fcntl = [](int descriptor, int command, int argument) { return ::fcntl(descriptor, command, argument); },
    .read = ::read,
    .write = ::write,
    .lseek = ::lseek,
    .fadvise = ::posix_fadvise,
    .ftruncate = ::ftruncate,
    .fallocate = ::fallocate,
    .copy_file_range = ::copy_file_range,
    .ficlone = [](int to, int from) { return ::ioctl(to, FICLONE, from); },
    .fsync = ::fsync,
    .fdatasync = ::fdatasync,
    .syncfs = ::syncfs,
    .getdents64 = ::getdents64,
    .statx = ::statx,
    .faccessat = ::faccessat,
    .fchmod = ::fchmod,
    .fchmodat = ::fchmodat,
    .fchownat = ::fchownat,
    .utimensat = ::utimensat,
    .readlinkat = ::readlinkat,
    .listxattr = ::listxattr,
    .getxattr = ::getxattr,
    .flistxattr = ::flistxattr,
    .fgetxattr = ::fgetxattr,
    .fsetxattr = ::fsetxattr,
    .mkdirat = ::mkdirat,
    .unlinkat = ::unlinkat,
    .linkat = ::linkat,
    .symlinkat = ::symlinkat,
    .renameat2 = ::renameat2,
    .inotify_init1 = ::inotify_init1,
    .inotify_add_watch = ::inotify_add_watch,
    .inotify_rm_watch = ::inotify_rm_watch,
    .eventfd = [](unsigned count, int flags) { return ::eventfd(count, flags); },
    .poll = ::poll,
};

namespace {

constinit std::atomic<SystemCalls const*> inUse{&realSystemCalls};

} // namespace

SystemCalls const& systemCalls() noexcept
{
    return *inUse.load(std::memory_order_acquire);
}

SystemCalls const& replaceSystemCalls(SystemCalls const& calls) noexcept
{
    return *inUse.exchange(&calls, std::memory_order_acq_rel);
}

} // namespace foundation::storage::local::detail
