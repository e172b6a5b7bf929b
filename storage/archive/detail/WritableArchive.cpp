#include <storage/archive/detail/WritableArchive.hpp>

#include <storage/archive/detail/entryName.hpp>
#include <storage/archive/detail/time.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/StreamClosePolicy.hpp>

#include <fl/filesystem/native_name.hpp>

#include <algorithm>
#include <stdexcept>
#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;
using LastLink = Index::LastLink;

namespace {

constexpr std::size_t longestPath = 0xFFFF;

/// What stands for a byte that is no text. An archive would give it back as another character.
bool standsForByte(char16_t unit)
{
    return unit >= 0xEF80 && unit <= 0xEFFF;
}

std::size_t bytesOf(std::u16string_view name, StorageIRI const& iri)
{
    try {
        return fl::filesystem::to_native_bytes(name).size();
    } catch (std::range_error const&) {
        throw Exception(ErrorCode::InvalidLocation, iri);
    }
}

void requirePossible(std::u16string_view path, ArchiveLimits const& limits, StorageIRI const& iri)
{
    if (isDeeper(path, limits.depth)) // which would be a name in the root when it is read
        throw Exception(ErrorCode::InvalidLocation, iri);
    bool const isText = std::none_of(path.begin(), path.end(), standsForByte);
    if (!isText || path.find(u'\0') != std::u16string_view::npos || bytesOf(path, iri) >= longestPath)
        throw Exception(ErrorCode::InvalidLocation, iri);
}

bool replaces(ReplacementPolicy policy)
{
    return policy == ReplacementPolicy::Overwrite || policy == ReplacementPolicy::Clobber;
}

/// What lies below a folder has to be possible at its new place, too.
void requirePossibleBelow(PendingTree const& tree, Index::Id folder, std::u16string const& path, std::size_t depth,
                          ArchiveLimits const& limits, StorageIRI const& iri)
{
    PendingTree::Extent const below = tree.extentBelow(folder);
    if (depth + below.depth > limits.depth || bytesOf(path, iri) + below.bytes >= longestPath)
        throw Exception(ErrorCode::InvalidLocation, iri);
}

/// In whole seconds, as a zip has them.
std::int64_t wholeSeconds(std::int64_t microseconds)
{
    std::int64_t const rest = microseconds % 1'000'000;
    return microseconds - rest - (rest < 0 ? 1'000'000 : 0);
}

/// 1601, when the count of the widest field for times begins.
constexpr std::int64_t earliestTime = -11'644'473'600'000'000;

} // namespace

WritableArchive::Change::Change(WritableArchive& archive)
    : archive_(archive), flushLock_(archive.waitForFlush()), lock_(*archive.treeMutex_, std::defer_lock)
{
    archive_.continueAfterFlush();
    lock_.lock();
    if (archive_.tree_ == nullptr)
        archive_.beginTree(lock_);
}

WritableArchive::Change::~Change()
{
    archive_.dropUnchangedTree();
}

std::shared_lock<std::shared_mutex> WritableArchive::waitForFlush() const
{
    std::lock_guard const gate(gate_); // lets a flush in that waits behind it
    return std::shared_lock(flushMutex_);
}

void WritableArchive::beginTree(std::unique_lock<std::mutex>& lock)
{
    lock.unlock();
    Version const version = currentVersion();
    lock.lock();
    if (tree_ != nullptr)
        return;
    if (version.archive != nullptr && !version.archive->isWritable())
        throw ArchiveException(ArchiveException::Reason::NotWritten, ErrorCode::UnsupportedOperation, location());
    tree_ = std::make_shared<PendingTree>(version.archive, limits());
    baseStamp_ = version.stamp;
}

/// Changes that can never be written are refused at the first of them. A stream tells, and is dropped.
void WritableArchive::beforeChange(PendingTree const& tree)
{
    if (tree.isChanged())
        return;
    try {
        container()
            .openTransactionalStream({ByteStreamAccess::ReadWrite, ByteStreamCreate::Create,
                                      ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite})
            ->close(StreamClosePolicy::Abort);
    } catch (Exception const& error) {
        throw ArchiveException(ArchiveException::Reason::NotWritten, error.getErrorCode(), location());
    } catch (ByteStreamFailure const& failure) {
        throw ArchiveException(ArchiveException::Reason::NotWritten, failure.getErrorCode(), location());
    }
}

void WritableArchive::dropUnchangedTree()
{
    if (tree_ != nullptr && !tree_->isChanged() && drafts_.empty())
        tree_.reset();
}

WritableArchive::Place WritableArchive::place(Index const& index, StorageIRI const& iri)
{
    std::u16string_view path = iri.getPath();
    while (path.ends_with(u'/'))
        path.remove_suffix(1);
    std::u16string_view const name = path.substr(path.rfind(u'/') + 1);
    bool const namesEntry = !name.empty() && name != u"." && name != u"..";
    auto const found = index.find(namesEntry ? path.substr(0, path.size() - name.size()) : path, LastLink::Follow);
    if (found.isLoop)
        throw Exception(ErrorCode::InvalidLocation, iri);
    if (!found.id || index.at(*found.id).kind != EntryKind::Folder)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    if (!namesEntry)
        return {index.at(*found.id).parent, std::u16string(index.name(*found.id)), found.id};
    return {*found.id, std::u16string(name), index.child(*found.id, name)};
}

WritableArchive::Place WritableArchive::requireEntry(PendingTree const& tree, StorageIRI const& iri)
{
    Place place = WritableArchive::place(tree.index(), iri);
    if (!place.id)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    return place;
}

/// A place where an entry may come to be.
WritableArchive::Place WritableArchive::newPlace(PendingTree const& tree, StorageIRI const& iri) const
{
    Place place = WritableArchive::place(tree.index(), iri);
    if (!place.id)
        requirePossible(tree.path(place.folder) + u'/' + place.name, limits(), iri);
    return place;
}

Index::Id WritableArchive::addFile(PendingTree& tree, Place const& place, StorageIRI const& iri)
{
    return at(iri, [&] {
        std::uint64_t version = 0;
        PackedPtr const nothing = pack(Draft(), store_, limits(), Packing::Fastest, version);
        Index::Id const file = tree.add(place.folder, place.name, EntryKind::File);
        tree.setContent(file, nothing);
        return file;
    });
}

void WritableArchive::removeEntry(PendingTree& tree, Index::Id id)
{
    detachBelow(tree, id);
    tree.remove(id);
}

void WritableArchive::detachBelow(PendingTree& tree, Index::Id id)
{
    auto const drafts = drafts_;
    for (Draft* const draft : drafts) {
        if (tree.isBelow(draft->node, id))
            detach(tree, *draft);
    }
}

bool WritableArchive::createArchive(StorageIRI const& iri)
{
    requireInside(iri);
    Change const change(*this);
    if (change.tree().base() != nullptr || change.tree().isChanged())
        return false;
    beforeChange(change.tree());
    change.tree().markChanged();
    return true;
}

void WritableArchive::createFile(StorageIRI const& iri)
{
    requireInside(iri);
    Change const change(*this);
    Place const place = newPlace(change.tree(), iri);
    if (place.id)
        throw Exception(ErrorCode::ResourceAlreadyExists, iri);
    beforeChange(change.tree());
    addFile(change.tree(), place, iri);
}

void WritableArchive::createFolder(StorageIRI const& iri)
{
    requireInside(iri);
    Change const change(*this);
    PendingTree& tree = change.tree();
    Place const place = newPlace(tree, iri);
    bool const isNewRoot = place.id == Index::root && tree.base() == nullptr && !tree.isChanged();
    if (place.id && !isNewRoot)
        throw Exception(ErrorCode::ResourceAlreadyExists, iri);
    beforeChange(tree);
    if (isNewRoot)
        tree.markChanged();
    else
        at(iri, [&] { tree.add(place.folder, place.name, EntryKind::Folder); });
}

void WritableArchive::removeFile(StorageIRI const& iri)
{
    requireInside(iri);
    Change const change(*this);
    Index::Id const id = *requireEntry(change.tree(), iri).id;
    if (change.tree().index().at(id).kind == EntryKind::Folder)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    beforeChange(change.tree());
    removeEntry(change.tree(), id);
}

void WritableArchive::removeFolder(StorageIRI const& iri, Removal removal)
{
    requireInside(iri);
    Change const change(*this);
    PendingTree& tree = change.tree();
    Index::Id const id = *requireEntry(tree, iri).id;
    if (tree.index().at(id).kind != EntryKind::Folder || (id == Index::root && !baseStamp_ && !tree.isChanged()))
        throw Exception(ErrorCode::ResourceNotFound, iri);
    if (id == Index::root)
        throw Exception(ErrorCode::ResourceInUse, iri);
    if (removal == Removal::EmptyFolder && !tree.isEmpty(id))
        throw Exception(ErrorCode::FolderNotEmpty, iri);
    beforeChange(tree);
    removeEntry(tree, id);
}

void WritableArchive::moveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy)
{
    requireInside(from);
    requireInside(to);
    Change const change(*this);
    PendingTree& tree = change.tree();
    Index::Id const file = *requireEntry(tree, from).id;
    if (tree.index().at(file).kind == EntryKind::Folder)
        throw Exception(ErrorCode::ResourceNotFound, from);
    Place const target = newPlace(tree, to);
    if (target.id && (tree.index().at(*target.id).kind == EntryKind::Folder || !replaces(policy)))
        throw Exception(ErrorCode::ResourceAlreadyExists, to);
    if (target.id == file)
        return;
    beforeChange(tree);
    if (!target.id) {
        at(to, [&] { tree.move(file, target.folder, target.name); });
        return;
    }
    detachBelow(tree, *target.id);
    tree.replace(*target.id, file);
}

void WritableArchive::moveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy)
{
    requireInside(from);
    requireInside(to);
    Change const change(*this);
    PendingTree& tree = change.tree();
    Index::Id const folder = *requireEntry(tree, from).id;
    EntryKind const kind = tree.index().at(folder).kind;
    bool const isFolder = kind == EntryKind::Folder && (folder != Index::root || baseStamp_ || tree.isChanged());
    if (!isFolder && kind != EntryKind::SymbolicLink)
        throw Exception(ErrorCode::ResourceNotFound, from);
    Place const target = newPlace(tree, to);
    if (folder == Index::root)
        throw Exception(ErrorCode::ResourceInUse, to);
    if (target.id == folder && replaces(policy))
        return;
    if (target.id)
        throw Exception(ErrorCode::ResourceAlreadyExists, to);
    if (tree.isBelow(target.folder, folder))
        throw Exception(ErrorCode::InvalidLocation, to);
    requirePossibleBelow(tree, folder, tree.path(target.folder) + u'/' + target.name, tree.depth(target.folder) + 1,
                         limits(), to);
    beforeChange(tree);
    at(to, [&] { tree.move(folder, target.folder, target.name); });
}

void WritableArchive::setLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time)
{
    requireInside(iri);
    if (time.is_special() || toMicroseconds(time) < earliestTime)
        throw Exception(ErrorCode::UnsupportedOperation, iri);
    Change const change(*this);
    Index::Id const id = require(viewOf(change.tree()), iri);
    if (id == Index::root)
        throw Exception(ErrorCode::UnsupportedOperation, iri);
    beforeChange(change.tree());
    change.tree().setModified(id, wholeSeconds(toMicroseconds(time)));
}

} // namespace foundation::storage::archive::detail
