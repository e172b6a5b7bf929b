#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/archive/detail/Archive.hpp>
#include <storage/archive/detail/Draft.hpp>
#include <storage/archive/detail/Index.hpp>
#include <storage/archive/detail/Packed.hpp>

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace foundation::storage::archive::detail {

/// What the index does not say of an entry.
struct PendingNode
{
    Index::Id previousSibling = Node::none;

    /// The entry of the old archive whose content this has, unless there is a newer one.
    Index::Id origin = Node::none;
    PackedPtr packed;             ///< content that is not in the archive yet
    std::shared_ptr<Draft> draft; ///< content that is being written, and newer than all other

    bool isAlive = true;
    bool isDated = false; ///< its time is not that of the old archive
};

/// The tree of an archive with changes that the archive does not have yet.
///
/// Entries of the old archive keep their ids, and ids of removed ones are not given away again. What is removed counts
/// no longer for the limits. Names are to be safe.
/// Errors: `Fault` for what goes beyond the limits; nothing has changed then.
/// Threads: its user guards it, but for `node` and `path` of entries that stay as they are.
class FOUNDATION_API PendingTree
{
public:
    using Id = Index::Id;

    /// `base` is empty where there is no archive yet.
    PendingTree(std::shared_ptr<Archive const> base, ArchiveLimits const& limits);

    std::shared_ptr<Archive const> const& base() const { return base_; }
    Index const& index() const { return index_; }
    bool isOfBase(Id id) const { return id < baseSize_; }
    bool isAlive(Id id) const { return nodes_[id].isAlive; }

    PendingNode const& node(Id id) const { return nodes_[id]; }

    /// For who changes it; whatever is seen by others counts as a change of the tree, to be told by `markChanged`.
    PendingNode& edit(Id id) { return nodes_[id]; }

    bool isChanged() const { return isChanged_; }
    void markChanged() { isChanged_ = true; }
    void markUnchanged() { isChanged_ = false; }

    /// Adds an entry that is not there yet, with the time of now.
    Id add(Id folder, std::u16string_view name, EntryKind kind);

    /// Removes an entry with all below it.
    void remove(Id id);

    void move(Id id, Id folder, std::u16string_view name);

    /// Moves an entry to where another one is, which goes. That needs no room.
    void replace(Id target, Id id);

    /// Throws `Fault` where an entry of that name could not be added.
    void requireRoom(std::u16string_view name) const;

    void setModified(Id id, std::int64_t time);

    /// Gives a file content that replaces what it had.
    void setContent(Id file, PackedPtr packed);

    /// Gives a file what its draft holds, packed, and the time of that. The draft stays.
    void takeDraft(Id file, PackedPtr packed);

    /// Gives a file the content and the mode of an entry of the old archive.
    void setOrigin(Id file, Id origin);

    std::uint64_t size(Id file) const;
    std::int64_t modified(Id id) const;

    bool isBelow(Id id, Id folder) const;
    bool isEmpty(Id folder) const { return index_.at(folder).firstChild == Node::none; }

    /// From the root, without a separator in front.
    std::u16string path(Id id) const;

    /// How many names there are from the root to an entry, its own included.
    std::size_t depth(Id id) const;

    /// How far it goes down below an entry.
    struct Extent
    {
        std::size_t depth = 0; ///< names on the way to the deepest entry
        std::size_t bytes = 0; ///< of the longest path in UTF-8, with a separator before each name
    };

    Extent extentBelow(Id id) const;

    /// The entries that are in a folder now.
    std::vector<Id> children(Id folder) const;

private:
    void requireSpace(std::size_t entries, std::size_t text) const;
    void relocate(Id id, Id folder, std::u16string const& name);
    void rename(Id id, std::u16string const& name);
    void dropOldNames(std::size_t needed);
    void link(Id id, Id folder);
    void unlink(Id id);
    void occupySlot(Id id);
    void freeSlot(Id id);
    void growSlots();

    std::shared_ptr<Archive const> const base_;
    ArchiveLimits const limits_;
    Index index_;
    std::size_t const baseSize_;
    std::size_t alive_;
    std::size_t text_ = 0; ///< UTF-16 units of the names of what is there
    std::vector<PendingNode> nodes_;
    bool isChanged_ = false;
};

} // namespace foundation::storage::archive::detail
