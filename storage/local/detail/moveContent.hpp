#pragma once

#include <storage/local/detail/MoveWatch.hpp>
#include <storage/local/detail/copyContent.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>

namespace foundation::storage::local::detail {

// The copies that moves from one file system to another are made of. A failure is `EBUSY` at the source where that has
// changed since `source` was asked for, from `getFullStatus`.

/// What the failure of such a move is told with.
[[noreturn]] void throwAtSource(int error, provider::StorageIRI const& source);

/// Throws for a copy that failed, as `requireCopied` does.
void requireMoved(CopyResult const& result, provider::StorageIRI const& from, provider::StorageIRI const& to);

/// Whether nobody has changed a file or link, nor anything about it but the time of its last access.
bool isUnchanged(Status const& before, Status const& now);

/// Whether it is the same file with the same content and permissions; its names may have changed.
bool hasSameContent(Status const& before, Status const& now);

/// Makes an open file, empty and for reading and writing, a copy of another: its content, owner, permissions, times and
/// extended attributes of the user. Returns when the content is on the disk, and was read back from there and compared
/// with that of the source; the times are not yet on the disk.
[[nodiscard]] CopyResult moveContent(FileDescriptor const& file, Status const& source, FileDescriptor const& target,
                                     MoveWatch const& watch);

/// Makes a copy of a link where nothing is: what it says, its owner and its times. What fails may leave it.
[[nodiscard]] CopyResult moveLink(At const& link, Status const& source, At const& target);

} // namespace foundation::storage::local::detail
