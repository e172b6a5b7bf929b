#include <storage/local/detail/LocalByteStream.hpp>

#include <storage/local/detail/SystemCalls.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/openRegularFile.hpp>

#include <cerrno>
#include <cstdio>
#include <system_error>
#include <utility>

namespace foundation::storage::local::detail {

using namespace provider;

namespace {

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

DescriptorStream::DescriptorStream(int descriptor, std::string path) : descriptor_(descriptor), path_(std::move(path))
{}

void DescriptorStream::requireOpen(char const* attempt, long count) const
{
    if (descriptor_ == -1)
        throw LocalStreamFailure(std::string(attempt) + " closed stream of", path_, EBADF);
    if (count < 0)
        throw LocalStreamFailure(attempt, path_, EINVAL);
}

long DescriptorStream::doRead(char* buffer, long count)
{
    requireOpen("read", count);
    if (count == 0)
        return 0;
    long const result =
        retried([&] { return systemCalls().read(descriptor_, buffer, static_cast<std::size_t>(count)); });
    if (result == -1)
        throw LocalStreamFailure("read", path_, errno);
    return result == 0 ? -1 : result;
}

long DescriptorStream::doWrite(char const* data, long count)
{
    requireOpen("write", count);
    if (count == 0)
        return 0;
    long const result =
        retried([&] { return systemCalls().write(descriptor_, data, static_cast<std::size_t>(count)); });
    if (result == -1)
        throw LocalStreamFailure("write", path_, errno);
    return result;
}

long DescriptorStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    requireOpen("seek in");
    long const position = systemCalls().lseek(descriptor_, offset, toOrigin(direction));
    if (position == -1)
        throw LocalStreamFailure("seek in", path_, errno);
    return position;
}

LocalByteStream::LocalByteStream(FileDescriptor file, std::string path)
    : DescriptorStream(file.get(), std::move(path)), file_(std::move(file))
{}

void LocalByteStream::doClose()
{
    forgetDescriptor();
    if (int const error = file_.close())
        throw LocalStreamFailure("close", path(), error);
}

int openFlags(ByteStreamOpenOptions const& options)
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

std::unique_ptr<ByteStream> openForReading(Root const& root, StorageIRI const& iri)
{
    std::string path = root.pathOf(iri);
    FileDescriptor file = openRegularFile(root, path, O_RDONLY, iri).file;
    systemCalls().fadvise(file.get(), 0, 0, POSIX_FADV_SEQUENTIAL);
    return std::make_unique<LocalByteStream>(std::move(file), std::move(path));
}

std::unique_ptr<ByteStream> openForWriting(Root const& root, StorageIRI const& iri,
                                           ByteStreamOpenOptions const& options)
{
    std::string path = root.pathOf(iri);
    FileDescriptor file = openRegularFile(root, path, openFlags(options), iri).file;
    return std::make_unique<LocalByteStream>(std::move(file), std::move(path));
}

} // namespace foundation::storage::local::detail
