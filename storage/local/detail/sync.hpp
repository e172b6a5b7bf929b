#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/provider/StorageIRI.hpp>

namespace foundation::storage::local::detail {

// They wait until something is on the disk, and answer 0 or `errno`.

/// Syncs a file, or the names in a folder. Where the file system does not sync one by itself, all of the file system
/// that holds `file` is synced; that is open for reading or writing.
[[nodiscard]] int sync(FileDescriptor const& what, FileDescriptor const& file);

/// Syncs the file system that holds an open file.
[[nodiscard]] int syncFileSystem(FileDescriptor const& file);

/// Syncs the names in an open folder, which may have been opened with `O_PATH`. Where this user may write to the folder
/// but not read it, its file system is synced.
[[nodiscard]] int syncFolder(int folder);

/// Throws the `DurabilityException` for the `errno` of a sync that came after a change.
[[noreturn]] void throwNotDurable(int error, provider::StorageIRI const& target);

} // namespace foundation::storage::local::detail
