#pragma once

#include <cstddef>
#include <cstdint>

namespace foundation::storage::archive {

/// How far an archive is trusted. What goes beyond is refused with an `ArchiveException` that says which limit it was.
///
/// The defaults let through what people keep in archives, and stop those that are made to exhaust whoever reads them.
struct ArchiveLimits
{
    /// Files, folders and links in one archive, folders that only paths name included.
    std::uint32_t entries = 1'000'000;

    /// Memory for the index of one archive, in bytes.
    std::size_t indexBytes = std::size_t{256} << 20;

    /// Folders within each other. What lies deeper is shown in the root, with its path as one name.
    unsigned depth = 512;

    /// Archives within each other, this one included.
    unsigned nesting = 8;

    /// The content of one entry, in bytes.
    std::uint64_t entryBytes = std::uint64_t{256} << 30;

    /// Bytes of content for each byte in the archive. Deflate reaches 1030, for nothing but zeros. With 0 nothing is
    /// let through but content of up to `bytesOfAnyRatio`.
    std::uint32_t ratio = 1000;

    /// Content up to this many bytes is let through, whatever its ratio.
    std::uint64_t bytesOfAnyRatio = std::uint64_t{64} << 20;

    /// An archive that cannot be read at any place, because it lies compressed in another or in a store without seek,
    /// is kept in memory up to this many bytes, and beyond that in an unlinked file of the folder for temporary files.
    std::size_t spoolMemory = std::size_t{16} << 20;

    /// The size of such an archive, in bytes.
    std::uint64_t spoolBytes = std::uint64_t{16} << 30;
};

} // namespace foundation::storage::archive
