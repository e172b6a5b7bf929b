#pragma once

#include <storage/local/detail/FileDescriptor.hpp>

#include <fcntl.h>
#include <filesystem>

namespace foundation::tests::support {

/// Whether the file system of a folder can make files without names.
inline bool hasNamelessFiles(std::filesystem::path const& folder)
{
    int const flags = O_RDWR | O_TMPFILE | O_CLOEXEC;
    return storage::local::detail::FileDescriptor(::open(folder.c_str(), flags, 0600)).isOpen();
}

} // namespace foundation::tests::support
