#include <storage/local/detail/sync.hpp>

#include <storage/local/DurabilityException.hpp>
#include <storage/local/detail/SystemCalls.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/scratchName.hpp>

#include <cerrno>
#include <string>

namespace foundation::storage::local::detail {

using provider::ErrorCode;

namespace {

bool meansNotByItself(int error)
{
    return error == EINVAL || error == ENOSYS || error == EOPNOTSUPP;
}

bool meansNeverNameless(int error)
{
    return error == EOPNOTSUPP || error == EISDIR || error == EINVAL || error == ENOENT;
}

int openNewFile(int folder, FileDescriptor& file)
{
    int const error = openFile({folder, "."}, O_WRONLY | O_TMPFILE, file, 0);
    if (!meansNeverNameless(error))
        return error;
    std::string const name = scratchName();
    if (int const failure = openFile({folder, name.c_str()}, O_WRONLY | O_CREAT | O_EXCL, file, 0))
        return failure;
    return removeName({folder, name.c_str()});
}

/// A folder that the user may write to but not read cannot be synced by itself. A new file in it leads to its file
/// system; what else is in it need not be readable, either.
int syncFileSystemOf(int folder)
{
    FileDescriptor file;
    int const error = openNewFile(folder, file);
    return error != 0 ? error : syncFileSystem(file);
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

int syncFolder(int folder)
{
    FileDescriptor readable;
    int const error = openFile({folder, "."}, O_RDONLY | O_DIRECTORY, readable);
    if (error == EACCES)
        return syncFileSystemOf(folder);
    return error != 0 ? error : sync(readable, readable);
}

void throwNotDurable(int error, provider::StorageIRI const& target)
{
    ErrorCode const code = toErrorCode(error);
    throw DurabilityException(code == ErrorCode::Unknown ? ErrorCode::IOError : code, target);
}

} // namespace foundation::storage::local::detail
