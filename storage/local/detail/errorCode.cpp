#include <storage/local/detail/errorCode.hpp>

#include <storage/provider/Exception.hpp>
#include <storage/provider/ReasonInfo.hpp>

#include <cerrno>

namespace foundation::storage::local::detail {

using provider::ErrorCode;

ErrorCode toErrorCode(int error)
{
    switch (error) {
    case ENOENT:
    case ENOTDIR:
        return ErrorCode::ResourceNotFound;
    case EEXIST:
        return ErrorCode::ResourceAlreadyExists;
    case ENOTEMPTY:
        return ErrorCode::FolderNotEmpty;
    // A file system mounted read-only is a part of this store that is closed to the user, not a store without writing.
    case EROFS:
    case EACCES:
    case EPERM:
        return ErrorCode::PermissionDenied;
    case ENOSPC:
    case EDQUOT:
    case EMLINK:
        return ErrorCode::NoSpaceLeft;
    case EFBIG:
    case EOVERFLOW:
        return ErrorCode::FileTooLarge;
    // Descriptors and memory are held by somebody, too: the same operation may succeed later.
    case EMFILE:
    case ENFILE:
    case ENOMEM:
    case EAGAIN:
    case EBUSY:
    case ETXTBSY:
        return ErrorCode::ResourceInUse;
    case EINVAL:
    case ENAMETOOLONG:
    case ELOOP:
    case EISDIR:
    case EILSEQ:
        return ErrorCode::InvalidLocation;
    case EIO:
    case EREMOTEIO:
    case EBADMSG:
    case EUCLEAN:
    case ESTALE:
    case ENXIO:
    case ENODEV:
        return ErrorCode::IOError;
    case EBADF:
    case EFAULT:
        return ErrorCode::InternalError;
    case ENOSYS:
    case E2BIG:
    case EOPNOTSUPP:
    case EXDEV:
        return ErrorCode::UnsupportedOperation;
    default:
        return ErrorCode::Unknown;
    }
}

void throwError(int error, provider::StorageIRI const& iri)
{
    throwError(toErrorCode(error), iri);
}

void throwError(ErrorCode code, provider::StorageIRI const& iri)
{
    throw provider::Exception(code, iri);
}

void throwError(int error, provider::StorageIRI const& iri, char16_t const* reason)
{
    provider::Exception failure(toErrorCode(error), iri);
    failure << provider::ReasonInfo(reason);
    throw failure;
}

bool meansMissing(int error)
{
    return error == ENOENT || error == ENOTDIR || error == ELOOP || error == ENAMETOOLONG;
}

bool isUnreachable(int error)
{
    return meansMissing(error) || error == EACCES;
}

} // namespace foundation::storage::local::detail
