#include <storage/archive/detail/StreamSource.hpp>

#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;
using Reason = ArchiveException::Reason;

namespace {

/// Each holds a descriptor while nobody reads.
constexpr std::size_t mostIdle = 8;

std::size_t readFully(ByteStream& stream, char* buffer, std::size_t count)
{
    std::size_t done = 0;
    while (done < count) {
        long const read = stream.read(buffer + done, static_cast<long>(count - done));
        if (read == -1)
            break;
        if (read <= 0 || static_cast<std::size_t>(read) > count - done)
            throw Fault(Reason::StoreFailed);
        done += static_cast<std::size_t>(read);
    }
    return done;
}

} // namespace

StreamSource::StreamSource(StorageItem const& file, Stream first, std::uint64_t size)
    : file_(file), attributes_(file.getFileAttributes()), size_(size)
{
    idle_.push_back(std::move(first));
}

StreamSource::~StreamSource() = default;

std::size_t StreamSource::readAt(std::uint64_t offset, char* buffer, std::size_t count) const
{
    if (offset >= size_ || count == 0)
        return 0;
    std::size_t const wanted = static_cast<std::size_t>(std::min<std::uint64_t>(count, size_ - offset));
    return inStore([&] {
        Stream stream = borrow();
        stream->seek(static_cast<long>(offset), std::ios_base::beg);
        std::size_t const read = readFully(*stream, buffer, wanted);
        if (read != wanted)
            throw Fault(Reason::Changed);
        giveBack(std::move(stream));
        return read;
    });
}

StreamSource::Stream StreamSource::borrow() const
{
    {
        std::lock_guard const lock(mutex_);
        if (!idle_.empty()) {
            Stream stream = std::move(idle_.back());
            idle_.pop_back();
            return stream;
        }
    }
    Stream stream = file_.openReadOnlyStream();
    FileAttributes const now = file_.getFileAttributes();
    if (now.getSize() != attributes_.getSize() || now.getLastModified() != attributes_.getLastModified())
        throw Fault(Reason::Changed);
    return stream;
}

/// Drops the stream where many are idle. That is done unlocked, as it may take its time.
void StreamSource::giveBack(Stream stream) const
{
    std::lock_guard const lock(mutex_);
    if (idle_.size() < mostIdle)
        idle_.push_back(std::move(stream));
}

} // namespace foundation::storage::archive::detail
