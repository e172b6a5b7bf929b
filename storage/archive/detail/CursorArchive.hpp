#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Archive.hpp>
#include <storage/archive/detail/Cursor.hpp>
#include <storage/archive/detail/Source.hpp>

#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

namespace foundation::storage::archive::detail {

/// An archive that libarchive reads from its beginning to its end.
///
/// Entries that are read in the order of the archive are read in one go: a cursor that was used waits for somebody who
/// wants what comes behind it.
class FOUNDATION_API CursorArchive final : public Archive
{
public:
    /// `modified`: microseconds since 1970, for what has no time of its own. Throws `Fault`.
    CursorArchive(ArchiveFormat format, std::shared_ptr<Source const> source, ArchiveLimits const& limits,
                  std::int64_t modified);

    std::unique_ptr<Content> open(Index::Id file) const override;
    bool isRandomAccess(Index::Id file) const override;

    /// A cursor that stands before the content of an entry.
    std::unique_ptr<Cursor> takeCursor(std::uint64_t number, std::uint64_t size) const;
    void giveBack(std::unique_ptr<Cursor> cursor) const;

private:
    std::unique_ptr<Cursor> newCursor() const;
    std::size_t mostIdle() const;
    std::unique_ptr<Cursor> takeIdle(std::uint64_t number) const;
    std::unique_ptr<Cursor> takeOldest() const;
    void readIndex(std::int64_t modified);
    void readEntries(IndexBuilder& builder, Cursor& cursor, std::int64_t modified) const;
    bool isCompressedInImage(std::uint64_t offset) const;
    std::uint64_t numberAt(std::uint64_t offset, std::uint64_t size) const;
    std::unique_ptr<Content> openPlain(std::uint64_t offset, std::uint64_t size) const;

    ArchiveFormat const format_;
    std::shared_ptr<Source const> const source_;
    ArchiveLimits const limits_;
    bool const isCompressed_;
    mutable std::mutex mutex_;
    mutable std::vector<std::unique_ptr<Cursor>> idle_;
};

} // namespace foundation::storage::archive::detail
