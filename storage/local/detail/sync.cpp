#include <storage/local/detail/sync.hpp>

#include <storage/local/DurabilityException.hpp>
#include <storage/local/detail/SystemCalls.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/nativePath.hpp>

#include <cerrno>

namespace foundation::storage::local::detail {

using provider::ErrorCode;

namespace {

bool meansNotByItself(int error)
{
    return error == EINVAL || error == ENOSYS || error == EOPNOTSUPP;
}

/// A folder that the user may write to but not read cannot be synced by itself; an entry that was in it leads to its
/// file system as well.
int syncParent(Root const& root, std::string const& path, std::string const& entry)
{
    FileDescriptor folder;
    int error = root.open(parentOf(path), O_RDONLY | O_DIRECTORY, folder);
    if (error == 0)
        return sync(folder, folder);
    if (error != EACCES)
        return error;
    error = root.open(entry, O_RDONLY | O_NOFOLLOW | O_NOCTTY | O_NONBLOCK, folder);
    // A link cannot be opened: it is the folder that cannot be synced.
    if (error == ELOOP)
        return EACCES;
    return error != 0 ? error : syncFileSystem(folder);
}

} // namespace

int sync(FileDescriptor const& what, FileDescriptor const& file)
{
    int const error = errorOf([&] { return systemCalls().fsync(what.get()); });
    return meansNotByItself(error) ? syncFileSystem(file) : error;
}

int syncFileSystem(FileDescriptor const& file)
{
    return errorOf([&] { return systemCalls().syncfs(file.get()); });
}

int syncFolderOf(Root const& root, std::string const& path)
{
    return syncParent(root, path, path);
}

int syncFoldersOf(Root const& root, std::string const& from, std::string const& to)
{
    int const error = syncParent(root, to, to);
    return error != 0 || parentOf(from) == parentOf(to) ? error : syncParent(root, from, to);
}

void throwNotDurable(int error, provider::StorageIRI const& target)
{
    ErrorCode const code = toErrorCode(error);
    throw DurabilityException(code == ErrorCode::Unknown ? ErrorCode::IOError : code, target);
}

} // namespace foundation::storage::local::detail
