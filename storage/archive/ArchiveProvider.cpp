#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/detail/MountedArchive.hpp>

#include <utility>

namespace foundation::storage::archive {

using namespace provider;
using detail::Depth;
using detail::Detail;
using detail::Entries;

ArchiveProvider::ArchiveProvider(ArchiveFormat format, StorageItem container, ArchiveLimits const& limits)
    : archive_(std::make_unique<detail::MountedArchive>(format, std::move(container), limits))
{}

ArchiveProvider::~ArchiveProvider() = default;

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
