#include <storage/memory/detail/File.hpp>

#include <chrono>
#include <system_error>
#include <utility>

namespace foundation::storage::memory::detail {

boost::posix_time::ptime now()
{
    using std::chrono::duration_cast, std::chrono::microseconds, std::chrono::system_clock;
    static boost::posix_time::ptime const epoch(boost::gregorian::date(1970, 1, 1));
    return epoch +
           boost::posix_time::microseconds(duration_cast<microseconds>(system_clock::now().time_since_epoch()).count());
}

File::File(Account& account) : account_(account), lastModified_(now()) {}

File::~File()
{
    account_.release(content_.size());
}

Status File::status() const
{
    std::lock_guard const lock(mutex_);
    return {content_.size(), lastModified_, writable_};
}

Content File::content() const
{
    std::lock_guard const lock(mutex_);
    return content_;
}

std::uint64_t File::size() const
{
    std::lock_guard const lock(mutex_);
    return content_.size();
}

std::size_t File::read(std::uint64_t offset, char* buffer, std::size_t count) const
{
    std::lock_guard const lock(mutex_);
    return content_.read(offset, buffer, count);
}

std::uint64_t File::write(std::optional<std::uint64_t> offset, char const* data, std::size_t count)
{
    std::lock_guard const lock(mutex_);
    std::uint64_t const before = content_.size();
    std::uint64_t const begin = offset.value_or(before);
    if (begin > maximumSize || count > maximumSize - begin)
        throw std::system_error(std::make_error_code(std::errc::file_too_large));
    chargeGrowthTo(begin + count);
    try {
        content_.write(begin, data, count);
    } catch (...) {
        if (begin + count > before)
            account_.release(begin + count - before);
        throw;
    }
    lastModified_ = now();
    return begin + count;
}

void File::exchange(Content& content)
{
    std::lock_guard const lock(mutex_);
    chargeGrowthTo(content.size());
    std::swap(content_, content);
    if (content.size() > content_.size())
        account_.release(content.size() - content_.size());
    lastModified_ = now();
}

bool File::truncate()
{
    Content dropped;
    std::lock_guard const lock(mutex_);
    if (content_.size() == 0)
        return false;
    std::swap(content_, dropped);
    account_.release(dropped.size());
    lastModified_ = now();
    return true;
}

void File::setLastModified(boost::posix_time::ptime const& time)
{
    std::lock_guard const lock(mutex_);
    lastModified_ = time;
}

bool File::isWritable() const
{
    std::lock_guard const lock(mutex_);
    return writable_;
}

void File::setWritable(bool writable)
{
    std::lock_guard const lock(mutex_);
    writable_ = writable;
}

void File::chargeGrowthTo(std::uint64_t size)
{
    if (size > content_.size() && !account_.charge(size - content_.size()))
        throw std::system_error(std::make_error_code(std::errc::no_space_on_device));
}

} // namespace foundation::storage::memory::detail
