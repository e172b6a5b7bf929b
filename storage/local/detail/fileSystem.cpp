#include <storage/local/detail/fileSystem.hpp>

#include <cerrno>

namespace foundation::storage::local::detail {

namespace {

constexpr mode_t newFileMode = 0666;
constexpr mode_t newFolderMode = 0777;
constexpr unsigned wantedFields = STATX_TYPE | STATX_MODE | STATX_NLINK | STATX_INO | STATX_SIZE | STATX_MTIME;

template <typename Call>
int errorOf(Call const& call)
{
    return retried(call) == -1 ? errno : 0;
}

/// What is to be mounted on demand is not mounted for being looked at, or a listing could mount all the world.
int askStatus(int folder, char const* path, int flags, Status& status)
{
    return errorOf([&] { return systemCalls().statx(folder, path, flags | AT_NO_AUTOMOUNT, wantedFields, &status); });
}

int flagsOf(Links links)
{
    return links == Links::Keep ? AT_SYMLINK_NOFOLLOW : 0;
}

} // namespace

int openFile(std::string const& path, int flags, FileDescriptor& file)
{
    int const descriptor =
        retried([&] { return systemCalls().openat(AT_FDCWD, path.c_str(), flags | O_CLOEXEC, newFileMode); });
    int const error = descriptor == -1 ? errno : 0;
    file = FileDescriptor(descriptor);
    return error;
}

int getStatus(std::string const& path, Links links, Status& status)
{
    return askStatus(AT_FDCWD, path.c_str(), flagsOf(links), status);
}

int getStatus(FileDescriptor const& folder, char const* name, Links links, Status& status)
{
    return askStatus(folder.get(), name, flagsOf(links), status);
}

int getStatus(FileDescriptor const& file, Status& status)
{
    return askStatus(file.get(), "", AT_EMPTY_PATH, status);
}

int checkAccess(std::string const& path, int mode)
{
    return errorOf([&] { return systemCalls().faccessat(AT_FDCWD, path.c_str(), mode, AT_EACCESS); });
}

int makeFolder(std::string const& path)
{
    return errorOf([&] { return systemCalls().mkdirat(AT_FDCWD, path.c_str(), newFolderMode); });
}

int removeName(std::string const& path)
{
    return errorOf([&] { return systemCalls().unlinkat(AT_FDCWD, path.c_str(), 0); });
}

int removeEmptyFolder(std::string const& path)
{
    return errorOf([&] { return systemCalls().unlinkat(AT_FDCWD, path.c_str(), AT_REMOVEDIR); });
}

int addName(std::string const& path, std::string const& secondPath)
{
    return errorOf([&] { return systemCalls().linkat(AT_FDCWD, path.c_str(), AT_FDCWD, secondPath.c_str(), 0); });
}

int renameEntry(std::string const& from, std::string const& to, unsigned flags)
{
    return errorOf([&] { return systemCalls().renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), flags); });
}

bool isSameFile(Status const& left, Status const& right)
{
    return left.stx_ino == right.stx_ino && left.stx_dev_major == right.stx_dev_major &&
           left.stx_dev_minor == right.stx_dev_minor;
}

bool leadsToFolder(std::string const& path)
{
    Status status;
    return getStatus(path, Links::Follow, status) == 0 && isFolder(status);
}

} // namespace foundation::storage::local::detail
