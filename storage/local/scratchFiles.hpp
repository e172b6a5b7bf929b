#pragma once

#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <chrono>
#include <string>
#include <string_view>

namespace foundation::storage::local {

/// A name for a file that is still being written, which nobody else picks and nobody can foretell: a random UUID and
/// ".tmp.bak".
FOUNDATION_API std::u16string makeScratchName();

/// Whether a name has the form of those: the UUID of version 4, in lower case.
FOUNDATION_API bool isScratchName(std::u16string_view name);

/// What can be told of a scratch file that a writer left, or has not finished.
enum class ScratchFileState
{
    Recent,    ///< changed so lately that its writer may be about to use it
    InUse,     ///< open in a process of this machine
    Abandoned, ///< neither
};

/// Tells whether a writer may still need a scratch file of a local folder, and changes nothing.
///
/// Meaning: a file is in use while any process, of whichever user, has it open or mapped. The kernel tells by refusing
/// a lease. Processes of other machines that have the file open over a network are not seen. Who closes a scratch file
/// before it takes its place relies on its age alone.
/// Moves to other file systems leave folders and links of such names, too. A folder is in use while any file in it is,
/// and recent while anything in it is; of a link its age alone can be told. The setting `root` of a provider is not
/// known here: any local location will do.
/// `age` is how long ago the content of the file must have changed last; for a link, and for what a folder holds, how
/// long ago anything about it must have.
///
/// Errors: `provider::Exception`. `InvalidLocation` for a location whose last name is not `<uuid>.tmp.bak`, or that
/// names no local file. `ResourceNotFound` where neither file, folder nor link stands. `PermissionDenied` for a file of
/// another user: only its owner and root are told who uses it. `UnsupportedOperation` on file systems without leases,
/// as most of those over a network are.
/// Cost: holds the lease for a moment; a process that opens the file just then waits for that long, or fails with
/// `EWOULDBLOCK` if it does not want to wait. A folder is read with all it holds.
FOUNDATION_API ScratchFileState examineScratchFile(provider::StorageIRI const& file, std::chrono::seconds age);

/// The same, and removes what is `Abandoned`, a folder with all it holds. Nobody can open a file between the look and
/// the removal; one that is renamed from its scratch name meanwhile stays.
FOUNDATION_API ScratchFileState removeAbandonedScratchFile(provider::StorageIRI const& file, std::chrono::seconds age);

} // namespace foundation::storage::local
