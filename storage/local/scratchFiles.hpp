#pragma once

#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <chrono>

namespace foundation::storage::local {

/// What can be told of a scratch file that a writer left, or has not finished.
enum class ScratchFileState
{
    Recent,    ///< changed so lately that its writer may be about to use it
    InUse,     ///< open in a process of this machine
    Abandoned, ///< neither
};

/// Tells whether a writer may still need a scratch file of a local folder, and changes nothing.
///
/// Meaning: a file is in use while any process, of whichever user, has it open or mapped; the providers of this library
/// keep theirs open up to the rename. The kernel tells by refusing a lease. Processes of other machines that have the
/// file open over a network are not seen.
/// `age` is how long ago the content of the file must have changed last.
///
/// Errors: `provider::Exception`. `InvalidLocation` for a location whose last name is not `<uuid>.tmp.bak`, or that
/// names no local file. `ResourceNotFound` where no file stands, a link included. `PermissionDenied` for a file of
/// another user: only its owner and root are told who uses it. `UnsupportedOperation` on file systems without leases,
/// as most of those over a network are.
/// Cost: holds the lease for a moment; a process that opens the file just then waits for that long.
FOUNDATION_API ScratchFileState examineScratchFile(provider::StorageIRI const& file, std::chrono::seconds age);

/// The same, and removes a file that is `Abandoned`, which nobody can open between the look and the removal. A file
/// that is renamed from its scratch name meanwhile stays.
FOUNDATION_API ScratchFileState removeAbandonedScratchFile(provider::StorageIRI const& file, std::chrono::seconds age);

} // namespace foundation::storage::local
