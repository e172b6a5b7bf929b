#pragma once

#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

namespace foundation::storage::local {

// A folder is copied by whoever copies what is in it: made, prepared, filled, and finished.
//
// Links are followed at neither end. Errors: `provider::Exception` at the end that failed.

/// Gives a local folder that was just made the permission bits of another that it has, beside all that its owner needs
/// to fill it, so that nobody sees in the copy what the source does not show.
FOUNDATION_API void prepareFolderCopy(provider::StorageIRI const& source, provider::StorageIRI const& target);

/// What a finished copy of a folder has of its source.
struct FolderCopyOptions
{
    bool keepsPermissions = false; ///< only of one that was made and prepared
    bool keepsMetadata = false;    ///< the time of the last change to the nanosecond, extended attributes of the user
};

/// Ends the copy of a local folder, once it holds all that it is to hold.
///
/// Extended attributes that the target cannot keep are a failure with a `ReasonInfo`; then neither permissions nor
/// time are changed.
FOUNDATION_API void finishFolderCopy(provider::StorageIRI const& source, provider::StorageIRI const& target,
                                     FolderCopyOptions const& options);

} // namespace foundation::storage::local
