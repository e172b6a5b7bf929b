#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Archive.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/archive/detail/ZipHandle.hpp>

#include <cstddef>
#include <memory>
#include <mutex>
#include <vector>

namespace foundation::storage::archive::detail {

/// A zip.
///
/// Threads: those that read at the same time use handles of their own, as far as there are processors; each handle
/// holds libzip's directory of the archive, some 250 bytes for an entry.
class FOUNDATION_API ZipArchive final : public Archive
{
public:
    /// `modified`: microseconds since 1970, for what has no time of its own. Throws `Fault`.
    ZipArchive(std::shared_ptr<Source const> source, ArchiveLimits const& limits, std::int64_t modified);

    std::unique_ptr<Content> open(Index::Id file) const override;
    bool isRandomAccess(Index::Id file) const override;

    /// Not with a program in front, which would be lost.
    bool isWritable() const override { return beginsAsZip_; }

    std::shared_ptr<Source const> const& source() const { return source_; }

    /// How many entries the directory has.
    std::uint64_t size() const { return size_; }

    static std::uint64_t locatorOf(std::uint64_t number, bool isStored)
    {
        return number << 1 | (isStored ? storedBit : 0);
    }

    /// Which of them a node stands for, unless it has no locator.
    static std::uint64_t numberOf(Node const& node) { return node.locator >> 1; }

    /// Whether its content stands there as it is.
    static bool isStored(Node const& node) { return (node.locator & storedBit) != 0; }

    /// A handle, shared with others only where as many are in use as may be.
    class Lease
    {
    public:
        explicit Lease(std::shared_ptr<ZipArchive const> archive);
        ~Lease();
        Lease(Lease const&) = delete;
        Lease& operator=(Lease const&) = delete;

        ZipHandle& handle() const { return *handle_; }

    private:
        std::shared_ptr<ZipArchive const> archive_;
        std::size_t slot_;
        ZipHandle* handle_;
    };

private:
    static constexpr std::uint64_t storedBit = 1;

    struct Slot
    {
        std::unique_ptr<ZipHandle> handle; ///< nothing until the first user has made it
        unsigned users = 0;
    };

    std::size_t takeSlot() const;
    ZipHandle* handleOf(std::size_t slot) const;
    void release(std::size_t slot) const noexcept;

    std::shared_ptr<Source const> const source_;
    ArchiveLimits const limits_;
    bool const beginsAsZip_;
    std::uint64_t size_ = 0; ///< entries in the directory
    mutable std::mutex mutex_;
    mutable std::vector<Slot> slots_;
};

} // namespace foundation::storage::archive::detail
