#pragma once

#include <tools/storage/CopyRun.hpp>
#include <tools/storage/TreeCursor.hpp>

#include <memory>
#include <vector>

namespace foundation::storage::tool {

/// Walks through folders, depth first and in the order of the listings, makes them at the target, and has a run copy
/// the files that they hold.
///
/// Links to folders, broken links and special files are complained about and passed over, and links are never followed
/// below the target either. An existing folder is merged with. Through local folders it goes as `TreeCursor` does, at
/// both ends, and files are copied from and to the very folders that it stood in.
class TreeCopier
{
public:
    TreeCopier(Stores const& stores, CopyRun& run) : stores_(stores), run_(run) {}

    /// Has complained about what cannot be copied, and has asked for the rest, when it returns.
    void copy(Place const& source, Place const& target);

private:
    bool begin(Place const& source, Place const& target);
    bool step();
    void copyEntry(ListedName const& entry);
    void enter(ListedName const& entry, Place const& source, Place const& target);
    void arrive(bool isFresh);
    void leave();
    void leaveBoth();
    void fail(Failure const& failure);
    void keep(Place const& place);

    Stores const& stores_;
    CopyRun& run_;
    std::unique_ptr<TreeCursor> source_;
    std::unique_ptr<TreeCursor> target_;
    std::vector<bool>
        areFresh_; ///< of the folders on the way: whether it was made at the target, and held nothing then
    std::vector<std::weak_ptr<void const>> held_; ///< folders that copies not yet done may need
};

} // namespace foundation::storage::tool
