#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/Content.hpp>
#include <storage/archive/detail/Draft.hpp>
#include <storage/archive/detail/PackStore.hpp>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

namespace foundation::storage::archive::detail {

/// Content that waits for the archive to be written, as it will stand there: deflated, or stored where that is not
/// smaller. It never changes.
///
/// Ownership: shares the store that keeps its bytes.
/// Threads: any number at once.
class FOUNDATION_API Packed
{
public:
    explicit Packed(std::shared_ptr<PackStore> store) : store_(std::move(store)) {}
    ~Packed();
    Packed(Packed const&) = delete;
    Packed& operator=(Packed const&) = delete;

    std::uint64_t size() const { return size_; }
    std::uint64_t packedSize() const { return packedSize_; }
    std::uint32_t checksum() const { return checksum_; }
    bool isStored() const { return isStored_; }

    /// Bytes as they will stand in the archive; fewer than `count` only at the end. Throws `Fault`.
    std::size_t readPacked(std::uint64_t offset, char* buffer, std::size_t count) const;

private:
    friend class Packer;

    void append(char const* data, std::size_t count);

    std::shared_ptr<PackStore> const store_;
    std::vector<PackStore::Piece> pieces_; ///< all but the last have one size
    std::uint64_t size_ = 0;
    std::uint64_t packedSize_ = 0;
    std::uint32_t checksum_ = 0;
    bool isStored_ = true;
};

using PackedPtr = std::shared_ptr<Packed const>;

enum class Packing
{
    Smallest, ///< deflated where that is smaller
    Fastest,  ///< stored
};

/// Packs the content of a file as it is at one moment. `version` becomes that of the draft then.
///
/// Content is packed no more highly than `limits` allow whoever reads it.
/// Errors: `Fault`; `EntryTooLarge` for content that would not be read again.
/// Cost: deflates at level 6, in the thread that calls.
FOUNDATION_API PackedPtr pack(Draft const& draft, std::shared_ptr<PackStore> const& store, ArchiveLimits const& limits,
                              Packing packing, std::uint64_t& version);

/// The content from its beginning.
FOUNDATION_API std::unique_ptr<Content> openPacked(PackedPtr packed);

} // namespace foundation::storage::archive::detail
