#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/IProvider.hpp>

namespace foundation::storage::local::detail {

/// What became of a copy, and where it went wrong.
enum class CopyOutcome
{
    Completed,
    Aborted,
    SourceFailed,
    TargetFailed,
    AttributesFailed, ///< the target takes the content, and not the extended attributes
};

struct CopyResult
{
    CopyOutcome outcome = CopyOutcome::Completed;
    int error = 0; ///< `errno` of a failure
};

/// Copies the content of an open regular file to another, which is empty; both stand at their start.
///
/// The two share the content where the file system can do that (`FICLONE`), else the kernel copies it
/// (`copy_file_range`), and what it cannot copy is read and written. Small files are read and written at once, which
/// takes less time. Holes stay holes.
///
/// What the source held when the copy began is copied: bytes that are appended meanwhile are not, except to a shared
/// copy, and of a source that becomes shorter meanwhile the copy ends where it ends. A file that does not know its
/// size, as below `/proc`, is copied up to its end.
///
/// `interrupt`, unless it is empty, is asked before each chunk, at least once: a MiB, or what the system copies of one
/// at a time. What it throws passes.
///
/// `status` is that of the source. What was copied when the copy fails or is aborted stays in the target.
FOUNDATION_API CopyResult copyContent(FileDescriptor const& source, Status const& status, FileDescriptor const& target,
                                      provider::IProvider::Interrupt const& interrupt);

} // namespace foundation::storage::local::detail
