#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/detail/MountedArchive.hpp>
#include <storage/archive/detail/WritableArchive.hpp>
#include <storage/provider/Exception.hpp>

#include <utility>

namespace foundation::storage::archive {

using namespace provider;
using detail::Depth;
using detail::Detail;
using detail::Entries;
using detail::WritableArchive;

namespace {

std::shared_ptr<WritableArchive> mountWritable(ArchiveFormat format, StorageItem const& container,
                                               ArchiveLimits const& limits)
{
    return format == ArchiveFormat::Zip ? std::make_shared<WritableArchive>(format, container, limits) : nullptr;
}

} // namespace

ArchiveProvider::ArchiveProvider(ArchiveFormat format, StorageItem container, ArchiveLimits const& limits)
    : writable_(mountWritable(format, container, limits)),
      archive_(writable_ != nullptr ? writable_
                                    : std::make_shared<detail::MountedArchive>(format, std::move(container), limits))
{}

ArchiveProvider::~ArchiveProvider() = default;

void ArchiveProvider::addContainerLocation(StorageIRI const& container)
{
    archive_->addContainerLocation(container);
}

void ArchiveProvider::flush()
{
    if (writable_ != nullptr)
        writable_->flush();
}

WritableArchive& ArchiveProvider::changeable(StorageIRI const& iri) const
{
    if (writable_ == nullptr)
        throw Exception(ErrorCode::ReadOnlyProvider, iri);
    return *writable_;
}

void ArchiveProvider::doCreateFile(StorageIRI const& iri) const
{
    changeable(iri).createFile(iri);
}

void ArchiveProvider::doCreateFolder(StorageIRI const& iri) const
{
    changeable(iri).createFolder(iri);
}

void ArchiveProvider::doCreateFolderRecursive(StorageIRI const& iri) const
{
    bool const isNew = changeable(iri).createArchive(iri);
    if (!isNew || archive_->canonicalLocation(iri).getPath() != u"/")
        IProvider::doCreateFolderRecursive(iri);
}

void ArchiveProvider::doRemoveFile(StorageIRI const& iri) const
{
    changeable(iri).removeFile(iri);
}

void ArchiveProvider::doRemoveFolder(StorageIRI const& iri) const
{
    changeable(iri).removeFolder(iri, WritableArchive::Removal::EmptyFolder);
}

void ArchiveProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    changeable(iri).removeFolder(iri, WritableArchive::Removal::FolderAndContents);
}

void ArchiveProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    changeable(from).moveFile(from, to, policy);
}

void ArchiveProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    changeable(from).moveFolder(from, to, policy);
}

void ArchiveProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    changeable(from).copyFile(from, to, policy);
}

TransactionStatus ArchiveProvider::doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                    ReplacementPolicy const& policy, Interrupt const& interrupt) const
{
    if (writable_ == nullptr)
        return IProvider::doCopyFileAtomic(from, to, policy, interrupt);
    return writable_->copyFileAtomic(from, to, policy, interrupt);
}

void ArchiveProvider::doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const
{
    changeable(iri).setLastModified(iri, time);
}

void ArchiveProvider::doSetWritable(StorageIRI const& iri, bool writable) const
{
    changeable(iri);
    IProvider::doSetWritable(iri, writable);
}

std::unique_ptr<ByteStream> ArchiveProvider::doOpenStream(StorageIRI const& iri,
                                                          ByteStreamOpenOptions const& options) const
{
    return changeable(iri).openForWriting(iri, options);
}

std::unique_ptr<TransactionalStream>
ArchiveProvider::doOpenTransactionalStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const
{
    if (writable_ == nullptr)
        return IProvider::doOpenTransactionalStream(iri, options);
    return writable_->openTransaction(iri, options);
}

bool ArchiveProvider::doHasFeature(ExtendedFeature const& feature) const
{
    bool const isOfChanges =
        feature == ExtendedFeature::RecursiveFolderRemoval || feature == ExtendedFeature::AtomicFileCopy;
    return isOfChanges && writable_ != nullptr;
}

bool ArchiveProvider::doFileExists(StorageIRI const& iri) const
{
    return archive_->exists(iri) == ExistenceType::AsFile;
}

bool ArchiveProvider::doFolderExists(StorageIRI const& iri) const
{
    return archive_->exists(iri) == ExistenceType::AsFolder;
}

ExistenceType ArchiveProvider::doExists(StorageIRI const& iri) const
{
    return archive_->exists(iri);
}

ExistenceTypeExtended ArchiveProvider::doExistsExtended(StorageIRI const& iri) const
{
    return archive_->existsExtended(iri);
}

FileAttributes ArchiveProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    return archive_->fileAttributes(iri);
}

FolderAttributes ArchiveProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    return archive_->folderAttributes(iri);
}

ExtendedAttributes ArchiveProvider::doGetExtendedAttributes(StorageIRI const& iri) const
{
    return archive_->extendedAttributes(iri);
}

std::unique_ptr<ByteStream> ArchiveProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return archive_->open(iri);
}

StorageIRI ArchiveProvider::doGetCanonicalLocation(StorageIRI const& iri) const
{
    return archive_->canonicalLocation(iri);
}

void ArchiveProvider::doShutdown()
{
    flush();
    archive_->release();
}

IProvider::Listing ArchiveProvider::doListAll(StorageIRI const& folder) const
{
    return archive_->list(folder, {});
}

IProvider::Listing ArchiveProvider::doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return archive_->list(folder, {.pattern = std::move(pattern)});
}

IProvider::Listing ArchiveProvider::doListFiles(StorageIRI const& folder) const
{
    return archive_->list(folder, {.entries = Entries::Files});
}

IProvider::Listing ArchiveProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return archive_->list(folder, {.entries = Entries::Files, .pattern = std::move(pattern)});
}

IProvider::Listing ArchiveProvider::doListFolders(StorageIRI const& folder) const
{
    return archive_->list(folder, {.entries = Entries::Folders});
}

IProvider::Listing ArchiveProvider::doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return archive_->list(folder, {.entries = Entries::Folders, .pattern = std::move(pattern)});
}

IProvider::Listing ArchiveProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return archive_->list(folder, {.detail = Detail::NamesOnly});
}

IProvider::Listing ArchiveProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return archive_->list(folder, {.detail = Detail::NamesOnly, .pattern = std::move(pattern)});
}

IProvider::Listing ArchiveProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return archive_->list(folder, {.entries = Entries::Folders, .detail = Detail::NamesOnly});
}

IProvider::Listing ArchiveProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                                    std::u16string pattern) const
{
    return archive_->list(folder,
                          {.entries = Entries::Folders, .detail = Detail::NamesOnly, .pattern = std::move(pattern)});
}

IProvider::Listing ArchiveProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return archive_->list(folder, {.entries = Entries::Files, .detail = Detail::NamesOnly});
}

IProvider::Listing ArchiveProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder,
                                                                  std::u16string pattern) const
{
    return archive_->list(folder,
                          {.entries = Entries::Files, .detail = Detail::NamesOnly, .pattern = std::move(pattern)});
}

IProvider::Listing ArchiveProvider::doListAllRecursive(StorageIRI const& folder) const
{
    return archive_->list(folder, {.depth = Depth::AllBelow});
}

IProvider::Listing ArchiveProvider::doListAllRecursiveWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return archive_->list(folder, {.depth = Depth::AllBelow, .pattern = std::move(pattern)});
}

IProvider::Listing ArchiveProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    return archive_->list(folder, {.detail = Detail::NamesOnly, .depth = Depth::AllBelow});
}

IProvider::Listing ArchiveProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                         std::u16string pattern) const
{
    return archive_->list(folder,
                          {.detail = Detail::NamesOnly, .depth = Depth::AllBelow, .pattern = std::move(pattern)});
}

} // namespace foundation::storage::archive
