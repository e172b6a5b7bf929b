#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Index.hpp>
#include <storage/archive/detail/TemporaryFile.hpp>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

namespace foundation::storage::archive::detail {

/// The time, as entries have it: microseconds since 1970, UTC, whole seconds.
FOUNDATION_API std::int64_t currentTime();

/// The content of a file while it is written: in memory up to a limit, beyond that in a temporary file.
///
/// Errors: `Fault`; nothing has changed then.
/// Threads: any number at once, every operation is done as a whole.
class FOUNDATION_API Draft
{
public:
    static constexpr std::size_t mostMemory = std::size_t{1} << 20;

    /// `mostBytes`: a write that would make it larger is `EntryTooLarge`.
    explicit Draft(std::uint64_t mostBytes = largestSize) : mostBytes_(std::min(mostBytes, largestSize)) {}
    Draft(Draft const&) = delete;
    Draft& operator=(Draft const&) = delete;

    /// Writes at `offset`, or at the end as it is then where there is none. Answers where the bytes written end. What
    /// lies between the end and `offset` becomes zeros.
    std::uint64_t write(std::optional<std::uint64_t> offset, char const* data, std::size_t count);
    void truncate();

    std::uint64_t size() const;

    /// How many bytes were read, fewer than `count` only at the end.
    std::size_t read(std::uint64_t offset, char* buffer, std::size_t count) const;

    std::int64_t modified() const;
    void setModified(std::int64_t time);

    /// Counts changes of the content.
    std::uint64_t version() const;

    /// The content as it is while this lives; who writes waits.
    class Frozen
    {
    public:
        explicit Frozen(Draft const& draft) : draft_(draft), lock_(draft.mutex_) {}

        std::uint64_t size() const { return draft_.size_; }
        std::uint64_t version() const { return draft_.version_; }
        std::size_t read(std::uint64_t offset, char* buffer, std::size_t count) const
        {
            return draft_.readLocked(offset, buffer, count);
        }

    private:
        Draft const& draft_;
        std::lock_guard<std::mutex> lock_;
    };

    /// Guarded by the lock of the tree: the file that is written, if it is still there; how many streams write it; and
    /// the version of this whose content the file has.
    Index::Id node = Node::none;
    unsigned writers = 0;
    std::optional<std::uint64_t> settledVersion;
    bool isLost = false; ///< somebody else took the file out of the archive

private:
    std::size_t readLocked(std::uint64_t offset, char* buffer, std::size_t count) const;
    void store(std::uint64_t offset, char const* data, std::size_t count);

    /// What a stream can seek to.
    static constexpr std::uint64_t largestSize = std::uint64_t{1} << 62;

    std::uint64_t const mostBytes_;
    mutable std::mutex mutex_;
    std::vector<char> memory_;
    std::unique_ptr<TemporaryFile> file_;
    std::uint64_t size_ = 0;
    std::uint64_t version_ = 0;
    std::int64_t modified_ = currentTime();
};

} // namespace foundation::storage::archive::detail
