#include <storage/archive/detail/ArchiveListing.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <storage/archive/detail/time.hpp>

#include <utility>

namespace foundation::storage::archive::detail {

using provider::FileAttributes;
using provider::FolderAttributes;
using provider::FolderEntry;

FileAttributes fileAttributes(Node const& node, bool isWritable)
{
    return FileAttributes(node.size, toPtime(node.modified), isWritable);
}

FolderAttributes folderAttributes(Node const& node, bool isWritable)
{
    return FolderAttributes(toPtime(node.modified), isWritable);
}

ArchiveListing::ArchiveListing(std::shared_ptr<Archive const> archive, provider::StorageIRI const& container,
                               Index::Id folder, Selection selection)
    : archive_(std::move(archive)),
      container_(container),
      index_(archive_->index()),
      folder_(folder),
      selection_(std::move(selection)),
      pattern_(selection_.pattern.empty() ? std::nullopt
                                          : std::optional<fl::filesystem::Wildcards>(selection_.pattern)),
      current_(folder)
{
    next();
}

void ArchiveListing::next()
{
    entry_.reset();
    while (advance()) {
        if (isWanted()) {
            entry_.emplace(makeEntry());
            return;
        }
    }
    if (archive_->isIncomplete())
        throw ArchiveException(ArchiveException::Reason::Damaged, container_);
}

void ArchiveListing::reset()
{
    current_ = folder_;
    path_.clear();
    next();
}

/// Goes into a folder, else on to the next entry, else on from the folder that it is in. `path_` leads to the folder of
/// the current entry.
bool ArchiveListing::advance()
{
    if (current_ == Node::none)
        return false;
    Node const& node = index_.at(current_);
    bool const enters = current_ == folder_ || (selection_.depth == Depth::AllBelow && node.kind == EntryKind::Folder);
    if (enters && node.firstChild != Node::none) {
        if (current_ != folder_)
            path_.append(index_.name(current_)).append(1, u'/');
        current_ = node.firstChild;
        return true;
    }
    while (current_ != folder_ && index_.at(current_).nextSibling == Node::none) {
        current_ = index_.at(current_).parent;
        if (current_ != folder_)
            path_.resize(path_.size() - index_.name(current_).size() - 1);
    }
    current_ = current_ == folder_ ? Node::none : index_.at(current_).nextSibling;
    return current_ != Node::none;
}

/// The entry itself, or what it leads to.
Node const& ArchiveListing::shown() const
{
    Node const& node = index_.at(current_);
    if (node.kind != EntryKind::SymbolicLink)
        return node;
    Index::Place const place = index_.follow(current_);
    return place.id ? index_.at(*place.id) : node;
}

bool ArchiveListing::isWanted() const
{
    bool const isFolder = shown().kind == EntryKind::Folder;
    if (selection_.entries != Entries::All && (selection_.entries == Entries::Folders) != isFolder)
        return false;
    return !pattern_ || pattern_->matches(index_.name(current_));
}

FolderEntry ArchiveListing::makeEntry() const
{
    std::u16string path = path_;
    path += index_.name(current_);
    Node const& node = shown();
    bool const isFolder = node.kind == EntryKind::Folder;
    if (selection_.detail == Detail::NamesOnly)
        return {std::move(path), isFolder ? FolderEntry::EntryType::Folder : FolderEntry::EntryType::File};
    if (isFolder)
        return {std::move(path), folderAttributes(node, archive_->isWritable())};
    return {std::move(path), fileAttributes(node, archive_->isWritable())};
}

} // namespace foundation::storage::archive::detail
