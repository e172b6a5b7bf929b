#include <storage/archive/detail/PendingListing.hpp>

#include <utility>

namespace foundation::storage::archive::detail {

using provider::FolderEntry;

PendingListing::PendingListing(std::shared_ptr<PendingTree const> tree, std::shared_ptr<std::mutex> mutex,
                               Index::Id folder, Selection selection)
    : tree_(std::move(tree)),
      mutex_(std::move(mutex)),
      folder_(folder),
      selection_(std::move(selection)),
      pattern_(selection_.pattern.empty() ? std::nullopt : std::optional<fl::filesystem::Wildcards>(selection_.pattern))
{
    start();
}

void PendingListing::next()
{
    std::lock_guard const lock(*mutex_);
    findNext();
}

void PendingListing::reset()
{
    std::lock_guard const lock(*mutex_);
    start();
}

void PendingListing::start()
{
    way_.clear();
    path_.clear();
    way_.push_back({folder_, tree_->children(folder_)});
    findNext();
}

void PendingListing::findNext()
{
    entry_.reset();
    while (!entry_) {
        auto const id = advance();
        if (!id)
            return;
        entry_ = makeEntry(*id);
        if (selection_.depth == Depth::AllBelow && tree_->index().at(*id).kind == EntryKind::Folder)
            enter(*id);
    }
}

/// The next entry that is still where it was; nothing at the end.
std::optional<Index::Id> PendingListing::advance()
{
    while (!way_.empty()) {
        Level& level = way_.back();
        while (level.next != level.entries.size()) {
            Index::Id const id = level.entries[level.next++];
            if (tree_->isAlive(id) && tree_->index().at(id).parent == level.folder)
                return id;
        }
        way_.pop_back();
        if (!path_.empty()) {
            path_.pop_back();
            std::size_t const slash = path_.rfind(u'/');
            path_.resize(slash == std::u16string::npos ? 0 : slash + 1);
        }
    }
    return std::nullopt;
}

void PendingListing::enter(Index::Id folder)
{
    path_.append(tree_->index().name(folder)).append(1, u'/');
    way_.push_back({folder, tree_->children(folder)});
}

/// Nothing for an entry that is not wanted.
std::optional<FolderEntry> PendingListing::makeEntry(Index::Id id) const
{
    Index const& index = tree_->index();
    if (pattern_ && !pattern_->matches(index.name(id)))
        return std::nullopt;
    std::u16string path = path_ + std::u16string(index.name(id));
    if (index.at(id).kind == EntryKind::SymbolicLink)
        id = index.follow(id).id.value_or(id);
    bool const isFolder = index.at(id).kind == EntryKind::Folder;
    if (selection_.entries != Entries::All && (selection_.entries == Entries::Folders) != isFolder)
        return std::nullopt;
    if (selection_.detail == Detail::NamesOnly)
        return FolderEntry(std::move(path), isFolder ? FolderEntry::EntryType::Folder : FolderEntry::EntryType::File);
    Node shown = index.at(id);
    shown.size = tree_->size(id);
    shown.modified = tree_->modified(id);
    if (isFolder)
        return FolderEntry(std::move(path), folderAttributes(shown, true));
    return FolderEntry(std::move(path), fileAttributes(shown, true));
}

} // namespace foundation::storage::archive::detail
