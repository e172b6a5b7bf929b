#include <storage/memory/detail/MemoryListing.hpp>

#include <utility>

namespace foundation::storage::memory::detail {

using provider::FileAttributes;
using provider::FolderAttributes;
using provider::FolderEntry;

namespace {

bool isFile(FoundEntry const& found)
{
    return asFile(&found.node) != nullptr;
}

} // namespace

MemoryListing::MemoryListing(std::shared_ptr<Tree const> tree, StorageIRI const& folder, Selection selection)
    : tree_(std::move(tree)), selection_(std::move(selection)), levels_{Level{Cursor{tree_->folder(folder)}, 0}}
{
    next();
}

void MemoryListing::next()
{
    entry_.reset();
    while (std::optional<FoundEntry> const found = advance()) {
        if (isWanted(*found))
            entry_.emplace(makeEntry(path_ + found->name, *found));
        if (selection_.depth == Depth::AllBelow && !isFile(*found))
            descend(*found);
        if (entry_)
            return;
    }
}

void MemoryListing::reset()
{
    levels_.erase(levels_.begin() + 1, levels_.end());
    levels_.front().cursor = Cursor{levels_.front().cursor.folder};
    path_.clear();
    next();
}

/// Goes on in the innermost folder, and from its end in the one that it lies in. The outermost stays.
std::optional<FoundEntry> MemoryListing::advance()
{
    for (;;) {
        if (std::optional<FoundEntry> found = tree_->advance(levels_.back().cursor))
            return found;
        if (levels_.size() == 1)
            return std::nullopt;
        levels_.pop_back();
        path_.resize(levels_.back().pathLength);
    }
}

void MemoryListing::descend(FoundEntry const& found)
{
    path_ += found.name + u'/';
    levels_.push_back({Cursor{std::get<FolderPtr>(found.node)}, path_.size()});
}

bool MemoryListing::isWanted(FoundEntry const& found) const
{
    if (selection_.entries != Entries::All && (selection_.entries == Entries::Files) != isFile(found))
        return false;
    return !selection_.pattern || selection_.pattern->matches(found.name);
}

FolderEntry MemoryListing::makeEntry(std::u16string name, FoundEntry const& found) const
{
    Status const& status = found.status;
    if (selection_.detail == Detail::NamesOnly)
        return {std::move(name), isFile(found) ? FolderEntry::EntryType::File : FolderEntry::EntryType::Folder};
    if (isFile(found))
        return {std::move(name), FileAttributes(status.size, status.lastModified, status.writable)};
    return {std::move(name), FolderAttributes(status.lastModified, status.writable)};
}

} // namespace foundation::storage::memory::detail
