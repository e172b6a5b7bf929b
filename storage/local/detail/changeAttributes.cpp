#include <storage/local/detail/changeAttributes.hpp>

#include <storage/local/detail/attributes.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::StorageIRI;

namespace {

constexpr mode_t writeBits = S_IWUSR | S_IWGRP | S_IWOTH;
constexpr mode_t settableBits = 07777;

/// Opened with `O_PATH`, which needs no permission, waits for nobody, and keeps what is read and changed one file.
FileDescriptor openEntry(Root const& root, StorageIRI const& iri)
{
    FileDescriptor entry;
    if (int const error = root.open(root.pathOf(iri), O_PATH, entry))
        throwError(error, iri);
    return entry;
}

} // namespace

void setLastModified(Root const& root, StorageIRI const& iri, boost::posix_time::ptime const& time)
{
    if (time.is_special())
        throwError(ErrorCode::UnsupportedOperation, iri);
    if (int const error = setModified(openEntry(root, iri), toTimespec(time)))
        throwError(error, iri);
}

void setWritable(Root const& root, StorageIRI const& iri, bool writable)
{
    FileDescriptor const entry = openEntry(root, iri);
    Status status;
    if (int const error = getStatus(entry, status))
        throwError(error, iri);
    mode_t const mode = status.stx_mode & settableBits;
    if (int const error = setMode(entry, writable ? mode | S_IWUSR : mode & ~writeBits))
        throwError(error, iri);
}

} // namespace foundation::storage::local::detail
