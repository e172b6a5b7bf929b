#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>

namespace foundation::storage::local::detail {

// They wait until something is on the disk, and answer 0 or `errno`.

/// Syncs a file, or the names in a folder. Where the file system does not sync one by itself, all of the file system
/// that holds `file` is synced; that is open for reading or writing.
[[nodiscard]] int sync(FileDescriptor const& what, FileDescriptor const& file);

/// Syncs the file system that holds an open file.
[[nodiscard]] int syncFileSystem(FileDescriptor const& file);

/// Syncs the folder that holds a new entry.
[[nodiscard]] int syncFolderOf(Root const& root, std::string const& path);

/// Syncs the folder that an entry was moved to, and then the one that it came from: in this order a power failure can
/// leave it with both names, never without one.
[[nodiscard]] int syncFoldersOf(Root const& root, std::string const& from, std::string const& to);

/// Throws the `DurabilityException` for the `errno` of a sync that came after a change.
[[noreturn]] void throwNotDurable(int error, provider::StorageIRI const& target);

} // namespace foundation::storage::local::detail
