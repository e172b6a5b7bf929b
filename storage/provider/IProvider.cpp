#include <storage/provider/IProvider.hpp>

#include <storage/provider/Exception.hpp>
#include <storage/provider/detail/SafeByteStream.hpp>

#include <utility>

namespace foundation::storage::provider {

IProvider::~IProvider() = default;

void IProvider::createFile(StorageIRI const& iri) const
{
    doCreateFile(iri);
}

void IProvider::createFolder(StorageIRI const& iri) const
{
    doCreateFolder(iri);
}

void IProvider::createFolderRecursive(StorageIRI const& iri) const
{
    doCreateFolderRecursive(iri);
}

bool IProvider::fileExists(StorageIRI const& iri) const
{
    return doFileExists(iri);
}

bool IProvider::folderExists(StorageIRI const& iri) const
{
    return doFolderExists(iri);
}

void IProvider::removeFile(StorageIRI const& iri) const
{
    doRemoveFile(iri);
}

void IProvider::moveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    doMoveFile(from, to, policy);
}

void IProvider::removeFolder(StorageIRI const& iri) const
{
    doRemoveFolder(iri);
}

void IProvider::removeFolderRecursively(StorageIRI const& iri) const
{
    doRemoveFolderRecursively(iri);
}

void IProvider::moveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    if (from.isAncestorOf(to))
        throw Exception(ErrorCode::InvalidLocation, to);
    doMoveFolder(from, to, policy);
}

FileAttributes IProvider::getFileAttributes(StorageIRI const& iri) const
{
    return doGetFileAttributes(iri);
}

FolderAttributes IProvider::getFolderAttributes(StorageIRI const& iri) const
{
    return doGetFolderAttributes(iri);
}

ExtendedAttributes IProvider::getExtendedAttributes(StorageIRI const& iri) const
{
    return doGetExtendedAttributes(iri);
}

std::unique_ptr<ByteStream> IProvider::openStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const
{
    bool const readable = options.access == ByteStreamAccess::ReadWrite;
    return std::make_unique<detail::SafeByteStream>(doOpenStream(iri, options), readable, true);
}

std::unique_ptr<ByteStream> IProvider::openReadOnlyStream(StorageIRI const& iri) const
{
    return std::make_unique<detail::SafeByteStream>(doOpenReadOnlyStream(iri), true, false);
}

std::unique_ptr<TransactionalStream> IProvider::openTransactionalStream(StorageIRI const& iri,
                                                                        ByteStreamOpenOptions const& options) const
{
    return doOpenTransactionalStream(iri, options);
}

IProvider::Listing IProvider::listAll(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListAll(folder) : doListAllWildcards(folder, std::move(pattern));
}

IProvider::Listing IProvider::listFiles(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListFiles(folder) : doListFilesWildcards(folder, std::move(pattern));
}

IProvider::Listing IProvider::listFolders(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListFolders(folder) : doListFoldersWildcards(folder, std::move(pattern));
}

IProvider::Listing IProvider::listAllNamesOnly(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListAllNamesOnly(folder) : doListAllNamesOnlyWildcards(folder, std::move(pattern));
}

IProvider::Listing IProvider::listFilesNamesOnly(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListFilesNamesOnly(folder) : doListFilesNamesOnlyWildcards(folder, std::move(pattern));
}

IProvider::Listing IProvider::listFoldersNamesOnly(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListFoldersNamesOnly(folder)
                           : doListFoldersNamesOnlyWildcards(folder, std::move(pattern));
}

IProvider::Listing IProvider::listAllRecursive(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListAllRecursive(folder) : doListAllRecursiveWildcards(folder, std::move(pattern));
}

IProvider::Listing IProvider::listAllRecursiveNamesOnly(StorageIRI const& folder, std::u16string pattern) const
{
    return pattern.empty() ? doListAllRecursiveNamesOnly(folder)
                           : doListAllRecursiveNamesOnlyWildcards(folder, std::move(pattern));
}

void IProvider::copyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    doCopyFile(from, to, policy);
}

TransactionStatus IProvider::copyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                            ReplacementPolicy const& policy, Interrupt const& interrupt) const
{
    return doCopyFileAtomic(from, to, policy, interrupt);
}

void IProvider::setLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const
{
    doSetLastModified(iri, time);
}

void IProvider::setWritable(StorageIRI const& iri, bool writable) const
{
    doSetWritable(iri, writable);
}

void IProvider::publishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                                     EventKinds const& kinds) const
{
    doPublishFileEventsFor(file, callback, kinds);
}

void IProvider::publishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                       EventKinds const& kinds) const
{
    doPublishFolderEventsFor(folder, callback, kinds);
}

void IProvider::stopPublishingFileEventsFor(StorageIRI const& file) const
{
    doStopPublishingEventsFor(file.getParent());
}

void IProvider::stopPublishingFolderEventsFor(StorageIRI const& folder) const
{
    doStopPublishingEventsFor(folder);
}

bool IProvider::hasFeature(ExtendedFeature const& feature) const
{
    return doHasFeature(feature);
}

PathComparator IProvider::getPathComparator(StorageIRI const& iri) const
{
    return doGetPathComparator(iri);
}

StorageIRI IProvider::getCanonicalLocation(StorageIRI const& iri) const
{
    return doGetCanonicalLocation(iri);
}

FilenameSensitivity IProvider::getFilenameSensitivity(StorageIRI const& iri) const
{
    return doGetFilenameSensitivity(iri);
}

void IProvider::shutdown()
{
    doShutdown();
}

ExistenceType IProvider::exists(StorageIRI const& iri) const
{
    return doExists(iri);
}

ExistenceTypeExtended IProvider::existsExtended(StorageIRI const& iri) const
{
    return doExistsExtended(iri);
}

} // namespace foundation::storage::provider
