#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/Content.hpp>
#include <storage/archive/detail/Index.hpp>
#include <storage/provider/StorageItem.hpp>

#include <memory>

namespace foundation::storage::archive::detail {

/// An archive as it was when its index was read, and what reads the content of its entries.
///
/// Ownership: content shares the archive, which goes with its last user.
/// Threads: any number at once.
class FOUNDATION_API Archive : public std::enable_shared_from_this<Archive>
{
public:
    virtual ~Archive() = default;

    Index const& index() const { return index_; }

    /// Whether the archive is damaged behind what the index holds.
    bool isIncomplete() const { return isIncomplete_; }

    /// The content of a file, from its beginning. Throws `Fault`; of limits, those on the content.
    virtual std::unique_ptr<Content> open(Index::Id file) const = 0;

    /// Whether content can be read at any place at once. Throws `Fault`.
    virtual bool isRandomAccess(Index::Id file) const = 0;

    /// Whether archives of this format can be changed.
    virtual bool isWritable() const { return false; }

protected:
    Index index_;
    bool isIncomplete_ = false;
};

/// Reads the index of an archive. Errors: what opening the container throws; `Fault`.
FOUNDATION_API std::shared_ptr<Archive const> openArchive(ArchiveFormat format, provider::StorageItem const& container,
                                                          ArchiveLimits const& limits);

/// Throws `Fault` for what is more highly compressed than allowed.
FOUNDATION_API void requireRatio(ArchiveLimits const& limits, std::uint64_t size, std::uint64_t sizeInArchive);

/// Throws `Fault` for content that is larger, or more highly compressed, than allowed.
FOUNDATION_API void requireWithinLimits(ArchiveLimits const& limits, std::uint64_t size, std::uint64_t sizeInArchive);

} // namespace foundation::storage::archive::detail
