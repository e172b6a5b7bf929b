#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>

namespace foundation::storage::local::detail {

struct OpenedFile
{
    FileDescriptor file;
    Status status; ///< when it had been opened
};

/// Opens a file for its content. `path` is that of the location, from `Root::pathOf`; a file that is made gets `mode`
/// less the umask.
///
/// Opening never waits. Throws `Exception`: `ResourceNotFound` for a folder, `UnsupportedOperation` for what is neither
/// file nor folder.
OpenedFile openRegularFile(Root const& root, std::string const& path, int flags, provider::StorageIRI const& iri,
                           mode_t mode = newFileMode);

} // namespace foundation::storage::local::detail
