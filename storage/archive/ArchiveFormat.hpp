#pragma once

namespace foundation::storage::archive {

/// The kinds of archives that can be read. Compression of a whole archive is found out, not said.
enum class ArchiveFormat
{
    Zip,
    Tar, ///< plain, or compressed as a whole by gzip, bzip2, xz, lzma or zstd
    SevenZip,
    Iso,  ///< ISO 9660 with Rock Ridge or Joliet
    Cpio, ///< as Tar
};

} // namespace foundation::storage::archive
