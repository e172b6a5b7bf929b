#include <storage/local/detail/sync.hpp>

#include <storage/local/DurabilityException.hpp>
#include <storage/local/detail/SystemCalls.hpp>
#include <storage/local/detail/errorCode.hpp>

#include <cerrno>

namespace foundation::storage::local::detail {

using provider::ErrorCode;

namespace {

bool meansNotByItself(int error)
{
    return error == EINVAL || error == ENOSYS || error == EOPNOTSUPP;
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

void throwNotDurable(int error, provider::StorageIRI const& target)
{
    ErrorCode const code = toErrorCode(error);
    throw DurabilityException(code == ErrorCode::Unknown ? ErrorCode::IOError : code, target);
}

} // namespace foundation::storage::local::detail
