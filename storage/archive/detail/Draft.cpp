#include <storage/archive/detail/Draft.hpp>

#include <algorithm>
#include <cstring>
#include <ctime>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

std::int64_t currentTime()
{
    return static_cast<std::int64_t>(std::time(nullptr)) * 1'000'000;
}

std::uint64_t Draft::write(std::optional<std::uint64_t> offset, char const* data, std::size_t count)
{
    std::lock_guard const lock(mutex_);
    std::uint64_t const begin = offset.value_or(size_);
    if (begin > mostBytes_ || count > mostBytes_ - begin)
        throw Fault(Reason::EntryTooLarge);
    store(begin, data, count);
    size_ = std::max(size_, begin + count);
    ++version_;
    modified_ = currentTime();
    return begin + count;
}

void Draft::store(std::uint64_t offset, char const* data, std::size_t count)
{
    if (file_ == nullptr && offset + count > mostMemory) {
        auto file = std::make_unique<TemporaryFile>();
        file->writeAt(0, memory_.data(), memory_.size());
        file->writeAt(offset, data, count);
        file_ = std::move(file);
        memory_ = {};
        return;
    }
    if (file_ != nullptr) {
        file_->writeAt(offset, data, count);
        return;
    }
    if (memory_.size() < offset + count)
        memory_.resize(offset + count);
    std::memcpy(memory_.data() + offset, data, count);
}

void Draft::truncate()
{
    std::lock_guard const lock(mutex_);
    file_.reset();
    memory_ = {};
    size_ = 0;
    ++version_;
    modified_ = currentTime();
}

std::uint64_t Draft::size() const
{
    std::lock_guard const lock(mutex_);
    return size_;
}

std::size_t Draft::read(std::uint64_t offset, char* buffer, std::size_t count) const
{
    std::lock_guard const lock(mutex_);
    return readLocked(offset, buffer, count);
}

std::size_t Draft::readLocked(std::uint64_t offset, char* buffer, std::size_t count) const
{
    if (offset >= size_)
        return 0;
    count = static_cast<std::size_t>(std::min<std::uint64_t>(count, size_ - offset));
    if (file_ != nullptr)
        file_->readAt(offset, buffer, count);
    else
        std::memcpy(buffer, memory_.data() + offset, count);
    return count;
}

std::int64_t Draft::modified() const
{
    std::lock_guard const lock(mutex_);
    return modified_;
}

void Draft::setModified(std::int64_t time)
{
    std::lock_guard const lock(mutex_);
    modified_ = time;
}

std::uint64_t Draft::version() const
{
    std::lock_guard const lock(mutex_);
    return version_;
}

} // namespace foundation::storage::archive::detail
