#include <storage/archive/detail/TemporaryFile.hpp>

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <string>
#include <unistd.h>

namespace foundation::storage::archive::detail {

using provider::ErrorCode;
using Reason = ArchiveException::Reason;

namespace {

[[noreturn]] void throwSystemError(int error)
{
    if (error == ENOSPC || error == EDQUOT)
        throw Fault(Reason::StoreFailed, ErrorCode::NoSpaceLeft);
    if (error == EMFILE || error == ENFILE || error == ENOMEM)
        throw Fault(Reason::StoreFailed, ErrorCode::ResourceInUse);
    throw Fault(Reason::StoreFailed, error == EACCES ? ErrorCode::PermissionDenied : ErrorCode::IOError);
}

/// A name is needed for a moment where the file system cannot do without.
int openNamedThenUnlink(std::string const& folder)
{
    std::string path = folder + "/foundation-archive-XXXXXX";
    int const file = ::mkostemp(path.data(), O_CLOEXEC);
    if (file != -1)
        ::unlink(path.c_str());
    return file;
}

int openTemporaryFile()
{
    char const* const told = std::getenv("TMPDIR");
    std::string const folder = told == nullptr || *told == '\0' ? "/tmp" : told;
    int file = ::open(folder.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
    if (file == -1 && (errno == EOPNOTSUPP || errno == EISDIR))
        file = openNamedThenUnlink(folder);
    if (file == -1)
        throwSystemError(errno);
    return file;
}

} // namespace

TemporaryFile::TemporaryFile() : file_(openTemporaryFile()) {}

TemporaryFile::~TemporaryFile()
{
    ::close(file_);
}

void TemporaryFile::writeAt(std::uint64_t offset, char const* data, std::size_t count)
{
    while (count > 0) {
        ssize_t const written = ::pwrite(file_, data, count, static_cast<off_t>(offset));
        if (written == -1 && errno == EINTR)
            continue;
        if (written == -1)
            throwSystemError(errno);
        data += written;
        offset += static_cast<std::uint64_t>(written);
        count -= static_cast<std::size_t>(written);
    }
}

void TemporaryFile::readAt(std::uint64_t offset, char* buffer, std::size_t count) const
{
    while (count > 0) {
        ssize_t const read = ::pread(file_, buffer, count, static_cast<off_t>(offset));
        if (read == -1 && errno == EINTR)
            continue;
        if (read <= 0)
            throwSystemError(read == 0 ? EIO : errno);
        buffer += read;
        offset += static_cast<std::uint64_t>(read);
        count -= static_cast<std::size_t>(read);
    }
}

void TemporaryFile::forget(std::uint64_t offset, std::uint64_t count) noexcept
{
    ::fallocate(file_, FALLOC_FL_PUNCH_HOLE | FALLOC_FL_KEEP_SIZE, static_cast<off_t>(offset),
                static_cast<off_t>(count));
}

} // namespace foundation::storage::archive::detail
