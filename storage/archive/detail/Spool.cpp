#include <storage/archive/detail/Spool.hpp>

#include <algorithm>
#include <cstring>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t chunk = std::size_t{256} << 10;

} // namespace

Spool::Spool(provider::ByteStream& stream, ArchiveLimits const& limits)
{
    std::vector<char> buffer(chunk);
    for (;;) {
        long const read = inStore([&] { return stream.read(buffer.data(), static_cast<long>(buffer.size())); });
        if (read == -1)
            break;
        if (read <= 0 || static_cast<std::size_t>(read) > buffer.size())
            throw Fault(Reason::StoreFailed);
        append(buffer.data(), static_cast<std::size_t>(read), limits);
    }
}

Spool::~Spool() = default;

void Spool::append(char const* data, std::size_t count, ArchiveLimits const& limits)
{
    if (count > limits.spoolBytes || size_ > limits.spoolBytes - count)
        throw Fault(Reason::SpoolTooLarge);
    if (file_ == nullptr && memory_.size() + count > limits.spoolMemory)
        moveToFile();
    if (file_ == nullptr)
        memory_.insert(memory_.end(), data, data + count);
    else
        file_->writeAt(size_, data, count);
    size_ += count;
}

void Spool::moveToFile()
{
    file_ = std::make_unique<TemporaryFile>();
    file_->writeAt(0, memory_.data(), memory_.size());
    memory_ = {};
}

std::size_t Spool::readAt(std::uint64_t offset, char* buffer, std::size_t count) const
{
    if (offset >= size_)
        return 0;
    std::size_t const wanted = static_cast<std::size_t>(std::min<std::uint64_t>(count, size_ - offset));
    if (file_ == nullptr)
        std::memcpy(buffer, memory_.data() + offset, wanted);
    else
        file_->readAt(offset, buffer, wanted);
    return wanted;
}

} // namespace foundation::storage::archive::detail
