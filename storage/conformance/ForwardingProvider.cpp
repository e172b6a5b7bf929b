#include <storage/conformance/ForwardingProvider.hpp>

#include <utility>

namespace foundation::storage::conformance {

using namespace provider;

ForwardingProvider::ForwardingProvider(std::shared_ptr<IProvider> target) : target_(std::move(target)) {}

void ForwardingProvider::before(char const*, StorageIRI const&) const {}

void ForwardingProvider::doCreateFile(StorageIRI const& iri) const
{
    before("createFile", iri);
    target_->createFile(iri);
}

void ForwardingProvider::doCreateFolder(StorageIRI const& iri) const
{
    before("createFolder", iri);
    target_->createFolder(iri);
}

void ForwardingProvider::doCreateFolderRecursive(StorageIRI const& iri) const
{
    before("createFolderRecursive", iri);
    target_->createFolderRecursive(iri);
}

bool ForwardingProvider::doFileExists(StorageIRI const& iri) const
{
    before("fileExists", iri);
    return target_->fileExists(iri);
}

bool ForwardingProvider::doFolderExists(StorageIRI const& iri) const
{
    before("folderExists", iri);
    return target_->folderExists(iri);
}

void ForwardingProvider::doRemoveFile(StorageIRI const& iri) const
{
    before("removeFile", iri);
    target_->removeFile(iri);
}

void ForwardingProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    before("moveFile", from);
    target_->moveFile(from, to, policy);
}

void ForwardingProvider::doRemoveFolder(StorageIRI const& iri) const
{
    before("removeFolder", iri);
    target_->removeFolder(iri);
}

void ForwardingProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    before("removeFolderRecursively", iri);
    target_->removeFolderRecursively(iri);
}

void ForwardingProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to,
                                      ReplacementPolicy const& policy) const
{
    before("moveFolder", from);
    target_->moveFolder(from, to, policy);
}

FileAttributes ForwardingProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    before("getFileAttributes", iri);
    return target_->getFileAttributes(iri);
}

FolderAttributes ForwardingProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    before("getFolderAttributes", iri);
    return target_->getFolderAttributes(iri);
}

std::unique_ptr<ByteStream> ForwardingProvider::doOpenStream(StorageIRI const& iri,
                                                             ByteStreamOpenOptions const& options) const
{
    before("openStream", iri);
    return target_->openStream(iri, options);
}

std::unique_ptr<ByteStream> ForwardingProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    before("openReadOnlyStream", iri);
    return target_->openReadOnlyStream(iri);
}

std::unique_ptr<TransactionalStream>
ForwardingProvider::doOpenTransactionalStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const
{
    before("openTransactionalStream", iri);
    return target_->openTransactionalStream(iri, options);
}

IProvider::Listing ForwardingProvider::doListAll(StorageIRI const& folder) const
{
    before("listAll", folder);
    return target_->listAll(folder);
}

IProvider::Listing ForwardingProvider::doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    before("listAll", folder);
    return target_->listAll(folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    before("listAllNamesOnly", folder);
    return target_->listAllNamesOnly(folder);
}

IProvider::Listing ForwardingProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder,
                                                                   std::u16string pattern) const
{
    before("listAllNamesOnly", folder);
    return target_->listAllNamesOnly(folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFiles(StorageIRI const& folder) const
{
    before("listFiles", folder);
    return target_->listFiles(folder);
}

IProvider::Listing ForwardingProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    before("listFiles", folder);
    return target_->listFiles(folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    before("listFilesNamesOnly", folder);
    return target_->listFilesNamesOnly(folder);
}

IProvider::Listing ForwardingProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder,
                                                                     std::u16string pattern) const
{
    before("listFilesNamesOnly", folder);
    return target_->listFilesNamesOnly(folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFolders(StorageIRI const& folder) const
{
    before("listFolders", folder);
    return target_->listFolders(folder);
}

IProvider::Listing ForwardingProvider::doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    before("listFolders", folder);
    return target_->listFolders(folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    before("listFoldersNamesOnly", folder);
    return target_->listFoldersNamesOnly(folder);
}

IProvider::Listing ForwardingProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                                       std::u16string pattern) const
{
    before("listFoldersNamesOnly", folder);
    return target_->listFoldersNamesOnly(folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListAllRecursive(StorageIRI const& folder) const
{
    before("listAllRecursive", folder);
    return target_->listAllRecursive(folder);
}

IProvider::Listing ForwardingProvider::doListAllRecursiveWildcards(StorageIRI const& folder,
                                                                   std::u16string pattern) const
{
    before("listAllRecursive", folder);
    return target_->listAllRecursive(folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    before("listAllRecursiveNamesOnly", folder);
    return target_->listAllRecursiveNamesOnly(folder);
}

IProvider::Listing ForwardingProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                            std::u16string pattern) const
{
    before("listAllRecursiveNamesOnly", folder);
    return target_->listAllRecursiveNamesOnly(folder, std::move(pattern));
}

void ForwardingProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    before("copyFile", from);
    target_->copyFile(from, to, policy);
}

TransactionStatus ForwardingProvider::doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                       ReplacementPolicy const& policy,
                                                       Interrupt const& interrupt) const
{
    before("copyFileAtomic", from);
    return target_->copyFileAtomic(from, to, policy, interrupt);
}

void ForwardingProvider::doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const
{
    before("setLastModified", iri);
    target_->setLastModified(iri, time);
}

void ForwardingProvider::doSetWritable(StorageIRI const& iri, bool writable) const
{
    before("setWritable", iri);
    target_->setWritable(iri, writable);
}

void ForwardingProvider::doPublishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                                  EventKinds const& kinds) const
{
    before("publishFolderEventsFor", folder);
    target_->publishFolderEventsFor(folder, callback, kinds);
}

void ForwardingProvider::doPublishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                                                EventKinds const& kinds) const
{
    before("publishFileEventsFor", file);
    target_->publishFileEventsFor(file, callback, kinds);
}

void ForwardingProvider::doStopPublishingEventsFor(StorageIRI const& folder) const
{
    before("stopPublishingFolderEventsFor", folder);
    target_->stopPublishingFolderEventsFor(folder);
}

bool ForwardingProvider::doHasFeature(ExtendedFeature const& feature) const
{
    return target_->hasFeature(feature);
}

PathComparator ForwardingProvider::doGetPathComparator(StorageIRI const& iri) const
{
    before("getPathComparator", iri);
    return target_->getPathComparator(iri);
}

StorageIRI ForwardingProvider::doGetCanonicalLocation(StorageIRI const& iri) const
{
    before("getCanonicalLocation", iri);
    return target_->getCanonicalLocation(iri);
}

FilenameSensitivity ForwardingProvider::doGetFilenameSensitivity(StorageIRI const& iri) const
{
    before("getFilenameSensitivity", iri);
    return target_->getFilenameSensitivity(iri);
}

void ForwardingProvider::doShutdown()
{
    target_->shutdown();
}

ExistenceType ForwardingProvider::doExists(StorageIRI const& iri) const
{
    before("exists", iri);
    return target_->exists(iri);
}

ExistenceTypeExtended ForwardingProvider::doExistsExtended(StorageIRI const& iri) const
{
    before("existsExtended", iri);
    return target_->existsExtended(iri);
}

ExtendedAttributes ForwardingProvider::doGetExtendedAttributes(StorageIRI const& iri) const
{
    before("getExtendedAttributes", iri);
    return target_->getExtendedAttributes(iri);
}

} // namespace foundation::storage::conformance
