#pragma once

#include <storage/local/detail/fileSystem.hpp>

#include <cstddef>
#include <cstdint>
#include <map>
#include <tuple>

namespace foundation::storage::local::detail {

/// What was copied, as it was then. Takes memory for about 100 bytes for each entry.
class Copied
{
public:
    void add(Status const& status)
    {
        Stamp const stamp{status.stx_size, status.stx_mtime.tv_sec, status.stx_mtime.tv_nsec, status.stx_ctime.tv_sec,
                          status.stx_ctime.tv_nsec};
        stamps_.insert_or_assign(keyOf(status), stamp);
        ++count_;
    }

    std::size_t count() const { return count_; }

    bool holds(Status const& folder) const { return stamps_.contains(keyOf(folder)); }

    bool holdsUnchanged(Status const& file) const
    {
        auto const found = stamps_.find(keyOf(file));
        return found != stamps_.end() && hasContentOf(found->second, file) &&
               found->second.changed == file.stx_ctime.tv_sec && found->second.changedPart == file.stx_ctime.tv_nsec;
    }

    /// A name of the file may have gone or changed since, which counts as a change of its attributes.
    bool holdsContentOf(Status const& file) const
    {
        auto const found = stamps_.find(keyOf(file));
        return found != stamps_.end() && hasContentOf(found->second, file);
    }

private:
    using Key = std::tuple<std::uint64_t, std::uint32_t, std::uint32_t>;

    struct Stamp
    {
        std::uint64_t size;
        std::int64_t modified;
        std::uint32_t modifiedPart;
        std::int64_t changed;
        std::uint32_t changedPart;
    };

    static Key keyOf(Status const& status) { return {status.stx_ino, status.stx_dev_major, status.stx_dev_minor}; }

    static bool hasContentOf(Stamp const& stamp, Status const& file)
    {
        return stamp.size == file.stx_size && stamp.modified == file.stx_mtime.tv_sec &&
               stamp.modifiedPart == file.stx_mtime.tv_nsec;
    }

    std::map<Key, Stamp> stamps_;
    std::size_t count_ = 0;
};

} // namespace foundation::storage::local::detail
