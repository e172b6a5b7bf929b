#pragma once

namespace foundation::storage::archive {

/// The kinds of archives that can be read. Compression of a whole archive is found out, not said.
enum class ArchiveFormat
{
    Zip,
};

} // namespace foundation::storage::archive
