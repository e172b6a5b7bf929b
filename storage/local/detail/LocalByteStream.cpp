#include <storage/local/detail/LocalByteStream.hpp>

#include <storage/local/detail/SystemCalls.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>

#include <cerrno>
#include <cstdio>
#include <system_error>
#include <utility>

namespace foundation::storage::local::detail {

using namespace provider;

namespace {

/// Without `O_NONBLOCK` opening a pipe would wait for somebody at its other end. It means nothing to a file.
constexpr int commonFlags = O_NOCTTY | O_NONBLOCK;

int flagsOf(ByteStreamOpenOptions const& options)
{
    int flags = options.access == ByteStreamAccess::ReadWrite ? O_RDWR : O_WRONLY;
    if (options.create == ByteStreamCreate::Create)
        flags |= O_CREAT;
    if (options.truncate == ByteStreamTruncate::TruncateExisting)
        flags |= O_TRUNC;
    if (options.append == ByteStreamAppend::Append)
        flags |= O_APPEND;
    return flags;
}

[[noreturn]] void throwCannotOpen(int error, StorageIRI const& iri)
{
    if (error == EISDIR)
        throwError(ErrorCode::ResourceNotFound, iri);
    if (error == ENXIO || error == ENODEV)
        throwError(ErrorCode::UnsupportedOperation, iri);
    throwError(error, iri);
}

void requireRegularFile(FileDescriptor const& file, StorageIRI const& iri)
{
    Status status;
    if (int const error = getStatus(file, status))
        throwError(error, iri);
    if (isFolder(status))
        throwError(ErrorCode::ResourceNotFound, iri);
    if (!S_ISREG(status.stx_mode))
        throwError(ErrorCode::UnsupportedOperation, iri);
}

FileDescriptor openContent(Root const& root, std::string const& path, int flags, StorageIRI const& iri)
{
    FileDescriptor file;
    if (int const error = root.open(path, flags | commonFlags, file))
        throwCannotOpen(error, iri);
    requireRegularFile(file, iri);
    return file;
}

int toOrigin(std::ios_base::seekdir direction)
{
    if (direction == std::ios_base::beg)
        return SEEK_SET;
    return direction == std::ios_base::cur ? SEEK_CUR : SEEK_END;
}

} // namespace

LocalStreamFailure::LocalStreamFailure(std::string const& attempt, std::string const& path, int error)
    : ByteStreamFailure("Cannot " + attempt + " \"" + path + "\"", std::error_code(error, std::generic_category()),
                        error == EBADF ? ErrorCode::IOError : toErrorCode(error))
{}

core::except::IException* LocalStreamFailure::clone() const
{
    return new LocalStreamFailure(*this);
}

void LocalStreamFailure::rethrow() const
{
    throw LocalStreamFailure(*this);
}

LocalByteStream::LocalByteStream(FileDescriptor file, std::string path) : file_(std::move(file)), path_(std::move(path))
{}

void LocalByteStream::requireOpen(char const* attempt, long count) const
{
    if (!file_.isOpen())
        throw LocalStreamFailure(std::string(attempt) + " closed stream of", path_, EBADF);
    if (count < 0)
        throw LocalStreamFailure(attempt, path_, EINVAL);
}

long LocalByteStream::doRead(char* buffer, long count)
{
    requireOpen("read", count);
    if (count == 0)
        return 0;
    long const result =
        retried([&] { return systemCalls().read(file_.get(), buffer, static_cast<std::size_t>(count)); });
    if (result == -1)
        throw LocalStreamFailure("read", path_, errno);
    return result == 0 ? -1 : result;
}

long LocalByteStream::doWrite(char const* data, long count)
{
    requireOpen("write", count);
    if (count == 0)
        return 0;
    long const result =
        retried([&] { return systemCalls().write(file_.get(), data, static_cast<std::size_t>(count)); });
    if (result == -1)
        throw LocalStreamFailure("write", path_, errno);
    return result;
}

long LocalByteStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    requireOpen("seek in");
    long const position = systemCalls().lseek(file_.get(), offset, toOrigin(direction));
    if (position == -1)
        throw LocalStreamFailure("seek in", path_, errno);
    return position;
}

void LocalByteStream::doClose()
{
    if (int const error = file_.close())
        throw LocalStreamFailure("close", path_, error);
}

std::unique_ptr<ByteStream> openForReading(Root const& root, StorageIRI const& iri)
{
    std::string path = root.pathOf(iri);
    FileDescriptor file = openContent(root, path, O_RDONLY, iri);
    systemCalls().fadvise(file.get(), 0, 0, POSIX_FADV_SEQUENTIAL);
    return std::make_unique<LocalByteStream>(std::move(file), std::move(path));
}

std::unique_ptr<ByteStream> openForWriting(Root const& root, StorageIRI const& iri,
                                           ByteStreamOpenOptions const& options)
{
    std::string path = root.pathOf(iri);
    FileDescriptor file = openContent(root, path, flagsOf(options), iri);
    return std::make_unique<LocalByteStream>(std::move(file), std::move(path));
}

} // namespace foundation::storage::local::detail
