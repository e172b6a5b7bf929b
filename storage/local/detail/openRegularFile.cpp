#include <storage/local/detail/openRegularFile.hpp>

#include <storage/local/detail/errorCode.hpp>

#include <cerrno>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::StorageIRI;

namespace {

/// Without `O_NONBLOCK` opening a pipe would wait for somebody at its other end. It means nothing to a file.
constexpr int commonFlags = O_NOCTTY | O_NONBLOCK;

[[noreturn]] void throwCannotOpen(int error, StorageIRI const& iri)
{
    if (error == EISDIR)
        throwError(ErrorCode::ResourceNotFound, iri);
    if (error == ENXIO || error == ENODEV)
        throwError(ErrorCode::UnsupportedOperation, iri);
    throwError(error, iri);
}

void requireRegularFile(Status const& status, StorageIRI const& iri)
{
    if (isFolder(status))
        throwError(ErrorCode::ResourceNotFound, iri);
    if (!S_ISREG(status.stx_mode))
        throwError(ErrorCode::UnsupportedOperation, iri);
}

} // namespace

OpenedFile openRegularFile(Root const& root, std::string const& path, int flags, StorageIRI const& iri, mode_t mode)
{
    OpenedFile opened;
    if (int const error = root.open(path, flags | commonFlags, opened.file, mode))
        throwCannotOpen(error, iri);
    if (int const error = getStatus(opened.file, opened.status))
        throwError(error, iri);
    requireRegularFile(opened.status, iri);
    return opened;
}

} // namespace foundation::storage::local::detail
