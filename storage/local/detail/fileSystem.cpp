#include <storage/local/detail/fileSystem.hpp>

#include <cstdio>
#include <fcntl.h>
#include <unistd.h>

namespace foundation::storage::local::detail {

namespace {

constexpr unsigned wantedFields = STATX_TYPE | STATX_MODE | STATX_NLINK | STATX_INO | STATX_SIZE | STATX_MTIME;

/// What is to be mounted on demand is not mounted for being looked at, or a listing could mount all the world.
int askStatus(At const& at, int flags, Status& status)
{
    return errorOf(
        [&] { return systemCalls().statx(at.folder, at.path, flags | AT_NO_AUTOMOUNT, wantedFields, &status); });
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

int checkAccess(At const& at, int mode)
{
    return errorOf([&] { return systemCalls().faccessat(at.folder, at.path, mode, AT_EACCESS); });
}

int checkAccess(FileDescriptor const& file, int mode)
{
    return errorOf([&] { return systemCalls().faccessat(file.get(), "", mode, AT_EACCESS | AT_EMPTY_PATH); });
}

int makeFolder(At const& at)
{
    return errorOf([&] { return systemCalls().mkdirat(at.folder, at.path, newFolderMode); });
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
