#pragma once

#include <fl/filesystem/upath.hpp>
#include <foundation/export.hpp>

namespace fl::filesystem {

/// The one path of something that exists: absolute, without links, "." and "..".
///
/// Meaning: `volume` names the volume to look on where a system has several; Linux has one tree, and it is not looked
/// at. The working directory is never consulted. Names that are not UTF-8 are written as `from_native_bytes` does.
/// Errors: `AccessDenied` (`EACCES`, `EPERM`), `PathNotFound` (`ENOENT`, `ENOTDIR`), `InvalidArgument` (`EINVAL`,
/// `ENAMETOOLONG`, `ELOOP`; a path that is relative, holds a NUL or is not UTF-16), `SystemError` (all others).
/// Source: POSIX `realpath`.
[[nodiscard]] FOUNDATION_API upath get_pathname_from_volume(upath const& path, upath const& volume);

} // namespace fl::filesystem
