#include <storage/archive/detail/Spool.hpp>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <string>
#include <unistd.h>

namespace foundation::storage::archive::detail {

using provider::ErrorCode;
using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t chunk = std::size_t{256} << 10;

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

Spool::Spool(provider::ByteStream& stream, ArchiveLimits const& limits)
{
    std::vector<char> buffer(chunk);
    try {
        for (;;) {
            long const read = inStore([&] { return stream.read(buffer.data(), static_cast<long>(buffer.size())); });
            if (read == -1)
                break;
            if (read <= 0 || static_cast<std::size_t>(read) > buffer.size())
                throw Fault(Reason::StoreFailed);
            append(buffer.data(), static_cast<std::size_t>(read), limits);
        }
    } catch (...) {
        if (file_ != -1)
            ::close(file_);
        throw;
    }
}

Spool::~Spool()
{
    if (file_ != -1)
        ::close(file_);
}

void Spool::append(char const* data, std::size_t count, ArchiveLimits const& limits)
{
    if (count > limits.spoolBytes || size_ > limits.spoolBytes - count)
        throw Fault(Reason::SpoolTooLarge);
    if (file_ == -1 && memory_.size() + count > limits.spoolMemory)
        moveToFile();
    if (file_ == -1)
        memory_.insert(memory_.end(), data, data + count);
    else
        write(data, count);
    size_ += count;
}

void Spool::moveToFile()
{
    file_ = openTemporaryFile();
    write(memory_.data(), memory_.size());
    memory_ = {};
}

void Spool::write(char const* data, std::size_t count)
{
    while (count > 0) {
        ssize_t const written = ::write(file_, data, count);
        if (written == -1 && errno == EINTR)
            continue;
        if (written == -1)
            throwSystemError(errno);
        data += written;
        count -= static_cast<std::size_t>(written);
    }
}

std::size_t Spool::readAt(std::uint64_t offset, char* buffer, std::size_t count) const
{
    if (offset >= size_)
        return 0;
    std::size_t const wanted = static_cast<std::size_t>(std::min<std::uint64_t>(count, size_ - offset));
    if (file_ == -1) {
        std::memcpy(buffer, memory_.data() + offset, wanted);
        return wanted;
    }
    std::size_t done = 0;
    while (done < wanted) {
        ssize_t const read = ::pread(file_, buffer + done, wanted - done, static_cast<off_t>(offset + done));
        if (read == -1 && errno == EINTR)
            continue;
        if (read <= 0)
            throwSystemError(read == 0 ? EIO : errno);
        done += static_cast<std::size_t>(read);
    }
    return done;
}

} // namespace foundation::storage::archive::detail
