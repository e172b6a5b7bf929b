#include <storage/local/detail/fileSystem.hpp>

#include <array>
#include <cstdio>
#include <fcntl.h>
#include <string>
#include <unistd.h>

namespace foundation::storage::local::detail {

namespace {

constexpr unsigned wantedFields =
    STATX_TYPE | STATX_MODE | STATX_NLINK | STATX_INO | STATX_SIZE | STATX_MTIME | STATX_BLOCKS;

/// What is to be mounted on demand is not mounted for being looked at, or a listing could mount all the world.
int askStatus(At const& at, int flags, Status& status, unsigned fields = wantedFields)
{
    return errorOf([&] { return systemCalls().statx(at.folder, at.path, flags | AT_NO_AUTOMOUNT, fields, &status); });
}

std::string pathOf(FileDescriptor const& file)
{
    return "/proc/self/fd/" + std::to_string(file.get());
}

/// What is open cannot be missing: it is /proc that is.
int notForWantOfProc(int error)
{
    return error == ENOENT ? EOPNOTSUPP : error;
}

template <typename Call>
int sizeOf(Call const& call, std::size_t& size)
{
    ssize_t const result = retried(call);
    size = result == -1 ? 0 : static_cast<std::size_t>(result);
    return result == -1 ? notForWantOfProc(errno) : 0;
}

} // namespace

int openFile(At const& at, int flags, FileDescriptor& file, mode_t mode)
{
    int const descriptor = retried([&] { return systemCalls().openat(at.folder, at.path, flags | O_CLOEXEC, mode); });
    int const error = descriptor == -1 ? errno : 0;
    file = FileDescriptor(descriptor);
    return error;
}

int getStatus(At const& at, Links links, Status& status)
{
    return askStatus(at, links == Links::Keep ? AT_SYMLINK_NOFOLLOW : 0, status);
}

int getStatus(FileDescriptor const& file, Status& status)
{
    return askStatus({file.get(), ""}, AT_EMPTY_PATH, status);
}

int getFullStatus(FileDescriptor const& file, Status& status)
{
    return askStatus({file.get(), ""}, AT_EMPTY_PATH, status, STATX_BASIC_STATS | STATX_BTIME);
}

int getFullStatus(At const& at, Links links, Status& status)
{
    int const flags = links == Links::Keep ? AT_SYMLINK_NOFOLLOW : 0;
    return askStatus(at, flags, status, STATX_BASIC_STATS | STATX_BTIME);
}

int checkAccess(At const& at, int mode)
{
    return errorOf([&] { return systemCalls().faccessat(at.folder, at.path, mode, AT_EACCESS); });
}

int checkAccess(FileDescriptor const& file, int mode)
{
    return errorOf([&] { return systemCalls().faccessat(file.get(), "", mode, AT_EACCESS | AT_EMPTY_PATH); });
}

int setMode(FileDescriptor const& file, mode_t mode)
{
    std::string const path = pathOf(file);
    return notForWantOfProc(errorOf([&] { return systemCalls().fchmodat(AT_FDCWD, path.c_str(), mode, 0); }));
}

int setModified(FileDescriptor const& file, timespec const& time)
{
    std::array<timespec, 2> const times{timespec{.tv_sec = 0, .tv_nsec = UTIME_OMIT}, time};
    return errorOf([&] { return systemCalls().utimensat(file.get(), "", times.data(), AT_EMPTY_PATH); });
}

int listAttributes(FileDescriptor const& file, char* names, std::size_t& size)
{
    std::string const path = pathOf(file);
    return sizeOf([&] { return systemCalls().listxattr(path.c_str(), names, maximumAttributeSize); }, size);
}

int getAttribute(FileDescriptor const& file, char const* name, char* value, std::size_t& size)
{
    std::string const path = pathOf(file);
    return sizeOf([&] { return systemCalls().getxattr(path.c_str(), name, value, maximumAttributeSize); }, size);
}

int makeFolder(At const& at, mode_t mode)
{
    return errorOf([&] { return systemCalls().mkdirat(at.folder, at.path, mode); });
}

int removeName(At const& at)
{
    return errorOf([&] { return systemCalls().unlinkat(at.folder, at.path, 0); });
}

int removeEmptyFolder(At const& at)
{
    return errorOf([&] { return systemCalls().unlinkat(at.folder, at.path, AT_REMOVEDIR); });
}

int addName(At const& from, At const& to)
{
    return errorOf([&] { return systemCalls().linkat(from.folder, from.path, to.folder, to.path, 0); });
}

int nameFile(FileDescriptor const& file, At const& to)
{
    int const error = errorOf([&] { return systemCalls().linkat(file.get(), "", to.folder, to.path, AT_EMPTY_PATH); });
    if (error != ENOENT)
        return error;
    std::string const self = pathOf(file);
    return errorOf([&] { return systemCalls().linkat(AT_FDCWD, self.c_str(), to.folder, to.path, AT_SYMLINK_FOLLOW); });
}

int renameEntry(At const& from, At const& to, unsigned flags)
{
    return errorOf([&] { return systemCalls().renameat2(from.folder, from.path, to.folder, to.path, flags); });
}

bool isSameFile(Status const& left, Status const& right)
{
    return left.stx_ino == right.stx_ino && left.stx_dev_major == right.stx_dev_major &&
           left.stx_dev_minor == right.stx_dev_minor;
}

} // namespace foundation::storage::local::detail
