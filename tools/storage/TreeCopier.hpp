#pragma once

#include <tools/storage/CopyRun.hpp>
#include <tools/storage/FolderStack.hpp>

namespace foundation::storage::tool {

/// Walks through folders, depth first and in the order of the listings, makes them at the target, and has a run copy
/// the files that they hold.
///
/// Links to folders, broken links and special files are complained about and passed over, and links are never followed
/// below the target either. An existing folder is merged with.
class TreeCopier
{
public:
    explicit TreeCopier(CopyRun& run);

    /// Has complained about what cannot be copied, and has asked for the rest, when it returns.
    void copy(Place const& source, Place const& target);

private:
    void step();
    void copyEntry(FolderLevel const& level, ListedName const& entry);
    void enter(Place const& source, Place const& target);

    CopyRun& run_;
    FolderStack levels_;
};

} // namespace foundation::storage::tool
