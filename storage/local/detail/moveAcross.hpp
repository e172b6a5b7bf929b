#pragma once

#include <storage/local/detail/MoveWatch.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>

namespace foundation::storage::local::detail {

// Moves to another file system: a copy is made beside the target, put on the disk, read back and compared, renamed onto
// the target, and only then the source goes.
//
// Until the copy stands at the target, a failure leaves both ends as they were. After that nothing is lost either: what
// of the source cannot be removed, or has changed meanwhile, stays.
//
// Interrupted by the watch, they leave nothing of the copy; it is not asked any more once that stands at the target.
//
// Errors: `Exception` naming the end that failed; `ResourceInUse` naming the source that changed meanwhile;
// `UnsupportedOperation` for what is neither file, folder nor link. `DurabilityException` when the copy stands at the
// target and the sync of its folder failed: the source stays.

/// Moves a file, or a link itself. Nothing but a file or link stands at the target if `policy` replaces.
void moveFileAcross(Root const& root, provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy policy, MoveWatch const& watch);

/// Moves a folder to where nothing is. Names of one file become files of their own.
/// Cost: memory for about 100 bytes for each entry; all of it is read three times, and its content twice.
void moveFolderAcross(Root const& root, provider::StorageIRI const& from, provider::StorageIRI const& to,
                      MoveWatch const& watch);

} // namespace foundation::storage::local::detail
