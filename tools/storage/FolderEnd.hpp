#pragma once

#include <tools/storage/Place.hpp>

namespace foundation::storage::tool {

/// What is left to do for the copy of a folder when all is copied that it holds.
struct FolderEnd
{
    Place source;
    Place target;
    bool isNew;         ///< made for this copy
    bool keepsMetadata; ///< the time of the last change, and between local folders extended attributes

    /// Throws `Failure`.
    void finish() const;
};

/// Lets nobody see in a new folder what its source does not show, as far as stores have permissions. Throws `Failure`.
void beginFolder(Place const& source, Place const& target);

} // namespace foundation::storage::tool
