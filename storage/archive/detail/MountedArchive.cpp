#include <storage/archive/detail/MountedArchive.hpp>

#include <storage/archive/detail/EntryStream.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/archive/detail/canonicalPath.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/ReasonInfo.hpp>

#include <string>
#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;
using LastLink = Index::LastLink;
using Reason = ArchiveException::Reason;

namespace {

/// How many containers lie round a place in `container`, which is one of them.
unsigned depthInside(StorageIRI container)
{
    unsigned depth = 1;
    for (; container.hasInnerIRI(); container = container.getInnerIRI())
        ++depth;
    return depth;
}

[[noreturn]] void throwLoop(StorageIRI const& iri)
{
    Exception error(ErrorCode::InvalidLocation, iri);
    error << ReasonInfo(u"links in the archive lead to each other without end");
    throw error;
}

ExistenceTypeExtended typeOfTarget(Index const& index, Index::Id link)
{
    Index::Place const target = index.follow(link);
    if (!target.id || index.at(*target.id).kind == EntryKind::HardLink)
        return ExistenceTypeExtended::BrokenSymlink;
    return index.at(*target.id).kind == EntryKind::Folder ? ExistenceTypeExtended::SymlinkToFolder
                                                          : ExistenceTypeExtended::SymlinkToFile;
}

} // namespace

MountedArchive::MountedArchive(ArchiveFormat format, StorageItem container, ArchiveLimits const& limits)
    : format_(format), container_(std::move(container)), location_(container_.getLocation()), limits_(limits)
{
    if (depthInside(location_) > limits.nesting)
        throw ArchiveException(Reason::NestedTooDeep, location_);
}

MountedArchive::~MountedArchive() = default;

void MountedArchive::requireInside(StorageIRI const& iri) const
{
    if (!iri.hasInnerIRI())
        throw Exception(ErrorCode::InvalidLocation, iri);
    if (!isContainer(iri.getInnerIRI()))
        throw Exception(ErrorCode::InvalidLocation, iri);
}

/// What the texts do not tell is asked of the store, which knows its links.
bool MountedArchive::isContainer(StorageIRI const& location) const
{
    if (location == location_)
        return true;
    {
        std::lock_guard const lock(otherLocationsMutex_);
        if (otherLocations_.contains(location))
            return true;
    }
    StorageItem const item(container_, location.getPath());
    return item.getLocation() == location && item.getCanonicalLocation() == container_.getCanonicalLocation();
}

void MountedArchive::addContainerLocation(StorageIRI const& location)
{
    std::lock_guard const lock(otherLocationsMutex_);
    otherLocations_.insert(location);
}

MountedArchive::Stamp MountedArchive::stampOfContainer() const
{
    FileAttributes const attributes = container_.getFileAttributes();
    return {attributes.getSize(), attributes.getLastModified()};
}

MountedArchive::ArchivePtr MountedArchive::archive() const
{
    std::lock_guard const lock(mutex_);
    return archive_ != nullptr ? archive_ : openLocked(stampOfContainer());
}

MountedArchive::ArchivePtr MountedArchive::upToDateArchive() const
{
    std::lock_guard const lock(mutex_);
    Stamp const stamp = stampOfContainer();
    return archive_ != nullptr && stamp_ == stamp ? archive_ : openLocked(stamp);
}

std::optional<MountedArchive::Stamp> MountedArchive::currentStamp() const
{
    try {
        return stampOfContainer();
    } catch (Exception const& error) {
        if (error.getErrorCode() != ErrorCode::ResourceNotFound)
            throw;
        return std::nullopt;
    }
}

MountedArchive::Version MountedArchive::currentVersion() const
{
    std::lock_guard const lock(mutex_);
    auto const stamp = currentStamp();
    if (!stamp)
        return {};
    return {archive_ != nullptr && stamp_ == stamp ? archive_ : openLocked(*stamp), stamp};
}

MountedArchive::View MountedArchive::view() const
{
    ArchivePtr archive = this->archive();
    Index const* const index = &archive->index();
    return {std::move(archive), index};
}

MountedArchive::View MountedArchive::existingView() const
{
    try {
        return view();
    } catch (Exception const& error) {
        if (error.getErrorCode() != ErrorCode::ResourceNotFound)
            throw;
        return {};
    }
}

MountedArchive::ArchivePtr const& MountedArchive::openLocked(Stamp const& stamp) const
{
    archive_.reset();
    if (failure_ && failure_->stamp == stamp)
        throw ArchiveException(failure_->reason, failure_->code, failure_->location);
    try {
        archive_ = at(location_, [&] { return openArchive(format_, container_, limits_); });
    } catch (ArchiveException const& failure) {
        rememberFailure(stamp, failure);
        throw;
    }
    stamp_ = stamp;
    return archive_;
}

/// Of failures that will not pass; it may have taken long to come to them.
void MountedArchive::rememberFailure(Stamp const& stamp, ArchiveException const& failure) const
{
    if (failure.getReason() == Reason::StoreFailed || failure.getReason() == Reason::Changed)
        return;
    failure_.emplace(Failure{stamp, failure.getReason(), failure.getErrorCode(), failure.getStorageIRI()});
}

void MountedArchive::release()
{
    ArchivePtr gone; // goes unlocked
    std::lock_guard const lock(mutex_);
    gone = std::move(archive_);
    failure_.reset();
}

Index::Id MountedArchive::require(View const& view, StorageIRI const& iri) const
{
    Index::Place const place = view.index->find(iri.getPath(), LastLink::Follow);
    if (place.isLoop)
        throwLoop(iri);
    if (!place.id && view.archive != nullptr && view.archive->isIncomplete())
        throw ArchiveException(Reason::Damaged, location_);
    if (!place.id || view.index->at(*place.id).kind == EntryKind::HardLink)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    return *place.id;
}

Index::Id MountedArchive::requireFile(View const& view, StorageIRI const& iri) const
{
    Index::Id const id = require(view, iri);
    if (view.index->at(id).kind == EntryKind::Folder)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    return id;
}

Index::Id MountedArchive::requireFolder(View const& view, StorageIRI const& iri) const
{
    Index::Id const id = require(view, iri);
    if (view.index->at(id).kind != EntryKind::Folder)
        throw Exception(ErrorCode::ResourceNotFound, iri);
    return id;
}

ExistenceType MountedArchive::exists(StorageIRI const& iri) const
{
    requireInside(iri);
    View const view = existingView();
    if (view.index == nullptr)
        return ExistenceType::AsNeither;
    auto const id = view.index->find(iri.getPath(), LastLink::Follow).id;
    if (!id || view.index->at(*id).kind == EntryKind::HardLink)
        return ExistenceType::AsNeither;
    return view.index->at(*id).kind == EntryKind::Folder ? ExistenceType::AsFolder : ExistenceType::AsFile;
}

ExistenceTypeExtended MountedArchive::existsExtended(StorageIRI const& iri) const
{
    requireInside(iri);
    View const view = existingView();
    if (view.index == nullptr)
        return ExistenceTypeExtended::None;
    auto const id = view.index->find(iri.getPath(), LastLink::Keep).id;
    if (!id)
        return ExistenceTypeExtended::None;
    switch (view.index->at(*id).kind) {
    case EntryKind::Folder:
        return ExistenceTypeExtended::RegularFolder;
    case EntryKind::File:
        return ExistenceTypeExtended::RegularFile;
    case EntryKind::Special:
        return ExistenceTypeExtended::SpecialFile;
    case EntryKind::SymbolicLink:
        return typeOfTarget(*view.index, *id);
    case EntryKind::HardLink:
        break;
    }
    return ExistenceTypeExtended::BrokenSymlink;
}

FileAttributes MountedArchive::fileAttributes(StorageIRI const& iri) const
{
    requireInside(iri);
    View const view = this->view();
    return detail::fileAttributes(view.index->at(requireFile(view, iri)), view.archive->isWritable());
}

FolderAttributes MountedArchive::folderAttributes(StorageIRI const& iri) const
{
    requireInside(iri);
    View const view = this->view();
    bool const isWritable = view.archive == nullptr || view.archive->isWritable();
    return detail::folderAttributes(view.index->at(requireFolder(view, iri)), isWritable);
}

ExtendedAttributes MountedArchive::extendedAttributes(StorageIRI const& iri) const
{
    requireInside(iri);
    ArchivePtr const archive = this->archive();
    Index::Id const id = require({archive, &archive->index()}, iri);
    if (archive->index().at(id).kind != EntryKind::File)
        return {};
    bool const isRandom = at(iri, [&] { return archive->isRandomAccess(id); });
    std::string const access = isRandom ? randomAccess : sequentialAccess;
    return ExtendedAttributes({{accessAttribute, access}});
}

std::unique_ptr<ByteStream> MountedArchive::open(StorageIRI const& iri) const
{
    requireInside(iri);
    ArchivePtr const archive = this->archive();
    Index::Id const id = requireFile({archive, &archive->index()}, iri);
    Node const& node = archive->index().at(id);
    if (node.kind != EntryKind::File)
        throw Exception(ErrorCode::UnsupportedOperation, iri);
    return at(iri, [&] { return std::make_unique<EntryStream>(iri, archive->open(id), node.size); });
}

IProvider::Listing MountedArchive::list(StorageIRI const& folder, Selection selection) const
{
    requireInside(folder);
    ArchivePtr archive = upToDateArchive();
    Index::Id const id = requireFolder({archive, &archive->index()}, folder);
    return std::make_unique<ArchiveListing>(std::move(archive), location_, id, std::move(selection));
}

StorageIRI MountedArchive::canonicalLocation(StorageIRI const& iri) const
{
    requireInside(iri);
    return StorageIRI(iri.getScheme(), location_, canonicalPath(iri.getPath()));
}

/// Where the archive cannot be read, the text has to do.
std::u16string MountedArchive::canonicalPath(std::u16string const& path) const
{
    try {
        View const view = existingView();
        if (view.index != nullptr)
            return detail::canonicalPath(*view.index, path);
    } catch (Exception const&) {
        // who opens the location is told
    }
    return detail::canonicalPath(path);
}

} // namespace foundation::storage::archive::detail
