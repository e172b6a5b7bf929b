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
    idle_.reserve(mostIdle);
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
        try {
            stream->seek(static_cast<long>(offset), std::ios_base::beg);
            if (readFully(*stream, buffer, wanted) != wanted)
                throw Fault(Reason::Changed);
        } catch (...) {
            giveBack(nullptr);
            throw;
        }
        giveBack(std::move(stream));
        return wanted;
    });
}

/// To be given back, or nothing in its place where it is of no more use.
StreamSource::Stream StreamSource::borrow() const
{
    std::unique_lock lock(mutex_);
    if (idle_.empty() && !isReplaced_) {
        lock.unlock();
        Stream another = openAnother();
        lock.lock();
        if (another != nullptr) {
            ++lent_;
            return another;
        }
        isReplaced_ = true;
    }
    returned_.wait(lock, [this] { return !idle_.empty() || lent_ == 0; });
    if (idle_.empty())
        throw Fault(Reason::Changed);
    Stream stream = std::move(idle_.back());
    idle_.pop_back();
    ++lent_;
    return stream;
}

/// Nothing where the file is another one.
StreamSource::Stream StreamSource::openAnother() const
{
    Stream stream = file_.openReadOnlyStream();
    FileAttributes const now = file_.getFileAttributes();
    bool const isSame =
        now.getSize() == attributes_.getSize() && now.getLastModified() == attributes_.getLastModified();
    return isSame ? std::move(stream) : nullptr;
}

/// Drops the stream where many are idle. That is done unlocked, as it may take its time.
void StreamSource::giveBack(Stream stream) const noexcept
{
    std::lock_guard const lock(mutex_);
    --lent_;
    if (stream != nullptr && idle_.size() < mostIdle)
        idle_.push_back(std::move(stream));
    returned_.notify_all();
}

} // namespace foundation::storage::archive::detail
