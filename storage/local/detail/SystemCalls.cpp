#include <storage/local/detail/SystemCalls.hpp>

#include <atomic>
#include <cstdio>
#include <dirent.h>
#include <unistd.h>

namespace foundation::storage::local::detail {

constinit SystemCalls const realSystemCalls{
    .openat = [](int folder, char const* path, int flags, mode_t mode) { return ::openat(folder, path, flags, mode); },
    .close = ::close,
    .read = ::read,
    .write = ::write,
    .lseek = ::lseek,
    .fadvise = ::posix_fadvise,
    .getdents64 = ::getdents64,
    .statx = ::statx,
    .faccessat = ::faccessat,
    .mkdirat = ::mkdirat,
    .unlinkat = ::unlinkat,
    .linkat = ::linkat,
    .renameat2 = ::renameat2,
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
