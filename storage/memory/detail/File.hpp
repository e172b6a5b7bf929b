#pragma once

#include <foundation/export.hpp>
#include <storage/memory/detail/Account.hpp>
#include <storage/memory/detail/Content.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <cstddef>
#include <cstdint>
#include <mutex>
#include <optional>

namespace foundation::storage::memory::detail {

/// The time, in UTC with microseconds.
FOUNDATION_API boost::posix_time::ptime now();

/// What is known of an entry; folders have no size.
struct Status
{
    std::uint64_t size;
    boost::posix_time::ptime lastModified;
    bool writable;
};

/// A file: its content, and what is known of it. It lives as long as a folder or a stream that writes holds it.
///
/// Errors: what would go beyond the limit of the account or beyond `maximumSize` is refused with `std::system_error`
/// (`std::errc::no_space_on_device`, `std::errc::file_too_large`); nothing has changed then.
/// Threads: any number at once; every operation is done as a whole.
class FOUNDATION_API File
{
public:
    /// What a file may hold, gaps included.
    static constexpr std::uint64_t maximumSize = std::uint64_t{1} << 40;

    /// An empty file whose content counts for `account`, which outlives it.
    explicit File(Account& account);
    File(File const&) = delete;
    File& operator=(File const&) = delete;
    ~File();

    Status status() const;

    /// The content as it is now and stays in the copy.
    Content content() const;

    std::uint64_t size() const;
    std::size_t read(std::uint64_t offset, char* buffer, std::size_t count) const;

    /// Writes at `offset`, or at the end as it is then where there is none. Answers where the bytes written end.
    std::uint64_t write(std::optional<std::uint64_t> offset, char const* data, std::size_t count);

    /// Exchanges the content as a whole.
    void exchange(Content& content);

    /// Drops the content; answers whether there was any.
    bool truncate();

    void setLastModified(boost::posix_time::ptime const& time);
    bool isWritable() const;
    void setWritable(bool writable);

private:
    void chargeGrowthTo(std::uint64_t size);

    mutable std::mutex mutex_;
    Account& account_;
    Content content_;
    boost::posix_time::ptime lastModified_;
    bool writable_ = true;
};

} // namespace foundation::storage::memory::detail
