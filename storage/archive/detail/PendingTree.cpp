#include <storage/archive/detail/PendingTree.hpp>

#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/IndexBuilder.hpp>

#include <fl/filesystem/native_name.hpp>

#include <algorithm>
#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

PendingTree::PendingTree(std::shared_ptr<Archive const> base, ArchiveLimits const& limits)
    : base_(std::move(base)),
      limits_(limits),
      index_(base_ != nullptr ? base_->index() : IndexBuilder(limits, currentTime()).finish()),
      baseSize_(base_ != nullptr ? index_.size() : 0),
      alive_(index_.size()),
      nodes_(index_.size())
{
    for (Id id = 0; id != index_.size(); ++id) {
        nodes_[id].origin = id;
        text_ += index_.at(id).nameSize;
        Id const next = index_.at(id).nextSibling;
        if (next != Node::none)
            nodes_[next].previousSibling = id;
    }
}

void PendingTree::requireRoom(std::u16string_view name) const
{
    if (alive_ > limits_.entries)
        throw Fault(Reason::TooManyEntries);
    if (nodes_.size() == Node::none)
        throw Fault(Reason::IndexTooLarge);
    requireSpace(alive_ + 1, text_ + name.size());
}

void PendingTree::requireSpace(std::size_t entries, std::size_t text) const
{
    std::size_t const bytes = entries * (sizeof(Node) + 2 * sizeof(Id)) + text * sizeof(char16_t);
    if (bytes > limits_.indexBytes || text > Node::none)
        throw Fault(Reason::IndexTooLarge);
}

PendingTree::Id PendingTree::add(Id folder, std::u16string_view name, EntryKind kind)
{
    requireRoom(name);
    Id const id = static_cast<Id>(nodes_.size());
    Node node;
    node.kind = kind;
    node.modified = currentTime();
    nodes_.emplace_back();
    index_.nodes_.push_back(node);
    ++alive_;
    rename(id, std::u16string(name));
    link(id, folder);
    if (index_.nodes_.size() * 2 > index_.slots_.size())
        growSlots();
    else
        occupySlot(id);
    isChanged_ = true;
    return id;
}

void PendingTree::remove(Id id)
{
    while (index_.at(id).firstChild != Node::none)
        remove(index_.at(id).firstChild);
    freeSlot(id);
    unlink(id);
    PendingNode& node = nodes_[id];
    node.isAlive = false;
    node.packed.reset();
    node.draft.reset();
    --alive_;
    text_ -= std::exchange(index_.nodes_[id].nameSize, 0);
    isChanged_ = true;
}

void PendingTree::move(Id id, Id folder, std::u16string_view name)
{
    std::size_t const oldSize = index_.at(id).nameSize;
    if (name.size() > oldSize)
        requireSpace(alive_, text_ - oldSize + name.size());
    relocate(id, folder, std::u16string(name));
}

void PendingTree::replace(Id target, Id id)
{
    Id const folder = index_.at(target).parent;
    std::u16string const name(index_.name(target));
    remove(target);
    relocate(id, folder, name);
}

void PendingTree::relocate(Id id, Id folder, std::u16string const& name)
{
    freeSlot(id);
    unlink(id);
    if (index_.name(id) != name)
        rename(id, name);
    link(id, folder);
    occupySlot(id);
    isChanged_ = true;
}

void PendingTree::rename(Id id, std::u16string const& name)
{
    text_ -= std::exchange(index_.nodes_[id].nameSize, 0);
    dropOldNames(name.size());
    index_.nodes_[id].nameBegin = static_cast<std::uint32_t>(index_.names_.size());
    index_.nodes_[id].nameSize = static_cast<std::uint32_t>(name.size());
    index_.names_ += name;
    text_ += name.size();
}

/// Only when they are many, so that it costs little for each change.
void PendingTree::dropOldNames(std::size_t needed)
{
    std::size_t const size = index_.names_.size() + needed;
    if (size <= 2 * (text_ + needed) + nodes_.size() && size <= Node::none)
        return;
    std::u16string names;
    names.reserve(text_ + needed);
    for (Node& node : index_.nodes_) {
        std::u16string_view const name = index_.nameOf(node);
        node.nameBegin = static_cast<std::uint32_t>(names.size());
        names += name;
    }
    index_.names_ = std::move(names);
}

void PendingTree::link(Id id, Id folder)
{
    Node& node = index_.nodes_[id];
    Node& parent = index_.nodes_[folder];
    node.parent = folder;
    node.nextSibling = Node::none;
    nodes_[id].previousSibling = parent.lastChild;
    if (parent.lastChild == Node::none)
        parent.firstChild = id;
    else
        index_.nodes_[parent.lastChild].nextSibling = id;
    parent.lastChild = id;
}

void PendingTree::unlink(Id id)
{
    Node const& node = index_.nodes_[id];
    Node& parent = index_.nodes_[node.parent];
    Id const previous = nodes_[id].previousSibling;
    (previous == Node::none ? parent.firstChild : index_.nodes_[previous].nextSibling) = node.nextSibling;
    (node.nextSibling == Node::none ? parent.lastChild : nodes_[node.nextSibling].previousSibling) = previous;
}

void PendingTree::occupySlot(Id id)
{
    index_.slots_[index_.slotOf(index_.at(id).parent, index_.name(id))] = id;
}

/// Moves those up that had to make room for the one that goes, so that a search still ends at the first empty slot.
void PendingTree::freeSlot(Id id)
{
    std::vector<Id>& slots = index_.slots_;
    std::size_t const mask = slots.size() - 1;
    std::size_t hole = index_.slotOf(index_.at(id).parent, index_.name(id));
    for (std::size_t slot = (hole + 1) & mask; slots[slot] != Index::root; slot = (slot + 1) & mask) {
        Id const other = slots[slot];
        std::size_t const wanted = index_.hash(index_.at(other).parent, index_.name(other)) & mask;
        if (((slot - wanted) & mask) < ((slot - hole) & mask))
            continue;
        slots[hole] = other;
        hole = slot;
    }
    slots[hole] = Index::root;
}

void PendingTree::growSlots()
{
    index_.slots_.assign(index_.slots_.size() * 2, Index::root);
    for (Id id = 1; id != nodes_.size(); ++id) {
        if (nodes_[id].isAlive)
            occupySlot(id);
    }
}

void PendingTree::setModified(Id id, std::int64_t time)
{
    index_.nodes_[id].modified = time;
    nodes_[id].isDated = true;
    if (nodes_[id].draft != nullptr)
        nodes_[id].draft->setModified(time);
    isChanged_ = true;
}

void PendingTree::setContent(Id file, PackedPtr packed)
{
    index_.nodes_[file].size = packed->size();
    nodes_[file].packed = std::move(packed);
    isChanged_ = true;
}

void PendingTree::takeDraft(Id file, PackedPtr packed)
{
    setContent(file, std::move(packed));
    index_.nodes_[file].modified = nodes_[file].draft->modified();
    nodes_[file].isDated = true;
}

void PendingTree::setOrigin(Id file, Id origin)
{
    index_.nodes_[file].size = base_->index().at(origin).size;
    nodes_[file].origin = origin;
    nodes_[file].packed.reset();
    isChanged_ = true;
}

std::uint64_t PendingTree::size(Id file) const
{
    return nodes_[file].draft != nullptr ? nodes_[file].draft->size() : index_.at(file).size;
}

std::int64_t PendingTree::modified(Id id) const
{
    return nodes_[id].draft != nullptr ? nodes_[id].draft->modified() : index_.at(id).modified;
}

bool PendingTree::isBelow(Id id, Id folder) const
{
    while (id != Index::root && id != folder)
        id = index_.at(id).parent;
    return id == folder;
}

std::size_t PendingTree::depth(Id id) const
{
    std::size_t depth = 0;
    for (; id != Index::root; id = index_.at(id).parent)
        ++depth;
    return depth;
}

PendingTree::Extent PendingTree::extentBelow(Id id) const
{
    Extent extent;
    for (Id child = index_.at(id).firstChild; child != Node::none; child = index_.at(child).nextSibling) {
        Extent const below = extentBelow(child);
        std::size_t const name = 1 + fl::filesystem::to_native_bytes(index_.name(child)).size();
        extent.depth = std::max(extent.depth, 1 + below.depth);
        extent.bytes = std::max(extent.bytes, name + below.bytes);
    }
    return extent;
}

std::u16string PendingTree::path(Id id) const
{
    std::vector<Id> way;
    for (; id != Index::root; id = index_.at(id).parent)
        way.push_back(id);
    std::u16string path;
    for (auto step = way.rbegin(); step != way.rend(); ++step) {
        if (!path.empty())
            path += u'/';
        path += index_.name(*step);
    }
    return path;
}

std::vector<PendingTree::Id> PendingTree::children(Id folder) const
{
    std::vector<Id> children;
    for (Id id = index_.at(folder).firstChild; id != Node::none; id = index_.at(id).nextSibling)
        children.push_back(id);
    return children;
}

} // namespace foundation::storage::archive::detail
