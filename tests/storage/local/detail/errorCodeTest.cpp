#include <storage/local/detail/errorCode.hpp>

#include <gtest/gtest.h>

#include <cerrno>
#include <map>
#include <string.h>

namespace foundation::storage::local::detail {
namespace {

using provider::ErrorCode;

std::map<int, ErrorCode> const known{
    {ENOENT, ErrorCode::ResourceNotFound},
    {ENOTDIR, ErrorCode::ResourceNotFound},
    {EEXIST, ErrorCode::ResourceAlreadyExists},
    {ENOTEMPTY, ErrorCode::FolderNotEmpty},
    {EROFS, ErrorCode::PermissionDenied},
    {EACCES, ErrorCode::PermissionDenied},
    {EPERM, ErrorCode::PermissionDenied},
    {ENOSPC, ErrorCode::NoSpaceLeft},
    {EDQUOT, ErrorCode::NoSpaceLeft},
    {EMLINK, ErrorCode::NoSpaceLeft},
    {EFBIG, ErrorCode::FileTooLarge},
    {EOVERFLOW, ErrorCode::FileTooLarge},
    {EMFILE, ErrorCode::ResourceInUse},
    {ENFILE, ErrorCode::ResourceInUse},
    {ENOMEM, ErrorCode::ResourceInUse},
    {EAGAIN, ErrorCode::ResourceInUse},
    {EBUSY, ErrorCode::ResourceInUse},
    {ETXTBSY, ErrorCode::ResourceInUse},
    {EINVAL, ErrorCode::InvalidLocation},
    {ENAMETOOLONG, ErrorCode::InvalidLocation},
    {ELOOP, ErrorCode::InvalidLocation},
    {EISDIR, ErrorCode::InvalidLocation},
    {EILSEQ, ErrorCode::InvalidLocation},
    {EIO, ErrorCode::IOError},
    {EREMOTEIO, ErrorCode::IOError},
    {EBADMSG, ErrorCode::IOError},
    {EUCLEAN, ErrorCode::IOError},
    {ESTALE, ErrorCode::IOError},
    {ENXIO, ErrorCode::IOError},
    {ENODEV, ErrorCode::IOError},
    {EBADF, ErrorCode::InternalError},
    {EFAULT, ErrorCode::InternalError},
    {E2BIG, ErrorCode::UnsupportedOperation},
    {ENOSYS, ErrorCode::UnsupportedOperation},
    {EOPNOTSUPP, ErrorCode::UnsupportedOperation},
    {EXDEV, ErrorCode::UnsupportedOperation},
};

TEST(ToErrorCode, MapsEveryErrnoAsTheTableSaysAndAllOthersToUnknown)
{
    for (int error = -1; error <= 200; ++error) {
        auto const row = known.find(error);
        ErrorCode const expected = row == known.end() ? ErrorCode::Unknown : row->second;
        EXPECT_EQ(toErrorCode(error), expected) << error << " " << strerrorname_np(error);
    }
}

} // namespace
} // namespace foundation::storage::local::detail
