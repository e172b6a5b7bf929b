#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/Source.hpp>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>

namespace foundation::storage::archive::detail {

/// The bytes of an archive without the compression that was laid round it as a whole, from beginning to end.
///
/// Errors: `Fault`; a stream that breaks off, or does not match its checksum, is `Reason::Damaged`. For one thread at a
/// time.
class FOUNDATION_API Feed
{
public:
    Feed() = default;
    Feed(Feed const&) = delete;
    Feed& operator=(Feed const&) = delete;
    virtual ~Feed() = default;

    /// The next bytes, valid until the next call; none at the end.
    virtual std::span<char const> next() = 0;

    /// Passes over bytes without reading them; answers how many, which may be none.
    virtual std::uint64_t skip(std::uint64_t count) = 0;

    /// Goes to a place; answers whether that is possible.
    virtual bool seek(std::uint64_t position) = 0;

    virtual std::uint64_t position() const = 0;

    /// The size, where it is known.
    virtual std::uint64_t size() const = 0;
};

/// Whether the whole of the source is compressed, by gzip, bzip2, xz, lzma or zstd.
FOUNDATION_API bool isCompressed(std::shared_ptr<Source const> const& source);

/// Bytes as they are, to be read at any place.
FOUNDATION_API std::unique_ptr<Feed> openPlainFeed(std::shared_ptr<Source const> source);

/// Bytes without the compression. Of limits it keeps that on the ratio.
FOUNDATION_API std::unique_ptr<Feed> openDecompressedFeed(std::shared_ptr<Source const> source,
                                                          ArchiveLimits const& limits);

} // namespace foundation::storage::archive::detail
