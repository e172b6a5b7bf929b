#pragma once

#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/provider/StorageItem.hpp>

#include <string>
#include <vector>

namespace foundation::storage::archive {

/// A file of this content in a new store in memory. Equal names are equal locations, in whatever store.
provider::StorageItem makeFile(std::string const& content, std::u16string const& name = u"archive");

void write(provider::StorageItem const& file, std::string const& content);

/// The root of the archive in a file.
provider::StorageItem openRoot(ArchiveFormat format, provider::StorageItem const& container,
                               ArchiveLimits const& limits = {});

/// The content of a file, read to its end.
std::string read(provider::StorageItem const& file);
std::string read(provider::StorageItem const& root, std::u16string const& path);

/// All paths below a folder, in the order of a recursive listing; those of folders end in '/'.
std::vector<std::u16string> pathsBelow(provider::StorageItem const& folder);

} // namespace foundation::storage::archive
