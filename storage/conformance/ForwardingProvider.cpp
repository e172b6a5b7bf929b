#include <storage/conformance/ForwardingProvider.hpp>

#include <utility>

namespace foundation::storage::conformance {

using namespace provider;

ForwardingProvider::ForwardingProvider(std::shared_ptr<IProvider> target) : target_(std::move(target)) {}

void ForwardingProvider::before(char const*, StorageIRI const&) const {}

StorageIRI ForwardingProvider::translated(StorageIRI const& location) const
{
    return location;
}

std::unique_ptr<ByteStream> ForwardingProvider::handOutStream(std::unique_ptr<ByteStream> stream,
                                                              StorageIRI const&) const
{
    return stream;
}

std::unique_ptr<TransactionalStream> ForwardingProvider::handOutTransaction(std::unique_ptr<TransactionalStream> stream,
                                                                            StorageIRI const&) const
{
    return stream;
}

IProvider::Listing ForwardingProvider::list(char const* name, ListingOperation operation, StorageIRI const& folder,
                                            std::u16string pattern) const
{
    return (target().*operation)(reach(name, folder), std::move(pattern));
}

StorageIRI ForwardingProvider::reach(char const* operation, StorageIRI const& location) const
{
    before(operation, location);
    return translated(location);
}

void ForwardingProvider::doCreateFile(StorageIRI const& iri) const
{
    target_->createFile(reach("createFile", iri));
}

void ForwardingProvider::doCreateFolder(StorageIRI const& iri) const
{
    target_->createFolder(reach("createFolder", iri));
}

void ForwardingProvider::doCreateFolderRecursive(StorageIRI const& iri) const
{
    target_->createFolderRecursive(reach("createFolderRecursive", iri));
}

bool ForwardingProvider::doFileExists(StorageIRI const& iri) const
{
    return target_->fileExists(reach("fileExists", iri));
}

bool ForwardingProvider::doFolderExists(StorageIRI const& iri) const
{
    return target_->folderExists(reach("folderExists", iri));
}

void ForwardingProvider::doRemoveFile(StorageIRI const& iri) const
{
    target_->removeFile(reach("removeFile", iri));
}

void ForwardingProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    target_->moveFile(reach("moveFile", from), translated(to), policy);
}

void ForwardingProvider::doRemoveFolder(StorageIRI const& iri) const
{
    target_->removeFolder(reach("removeFolder", iri));
}

void ForwardingProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    target_->removeFolderRecursively(reach("removeFolderRecursively", iri));
}

void ForwardingProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to,
                                      ReplacementPolicy const& policy) const
{
    target_->moveFolder(reach("moveFolder", from), translated(to), policy);
}

FileAttributes ForwardingProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    return target_->getFileAttributes(reach("getFileAttributes", iri));
}

FolderAttributes ForwardingProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    return target_->getFolderAttributes(reach("getFolderAttributes", iri));
}

std::unique_ptr<ByteStream> ForwardingProvider::doOpenStream(StorageIRI const& iri,
                                                             ByteStreamOpenOptions const& options) const
{
    return handOutStream(target_->openStream(reach("openStream", iri), options), iri);
}

std::unique_ptr<ByteStream> ForwardingProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return handOutStream(target_->openReadOnlyStream(reach("openReadOnlyStream", iri)), iri);
}

std::unique_ptr<TransactionalStream>
ForwardingProvider::doOpenTransactionalStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const
{
    return handOutTransaction(target_->openTransactionalStream(reach("openTransactionalStream", iri), options), iri);
}

IProvider::Listing ForwardingProvider::doListAll(StorageIRI const& folder) const
{
    return list("listAll", &IProvider::listAll, folder, {});
}

IProvider::Listing ForwardingProvider::doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list("listAll", &IProvider::listAll, folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return list("listAllNamesOnly", &IProvider::listAllNamesOnly, folder, {});
}

IProvider::Listing ForwardingProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder,
                                                                   std::u16string pattern) const
{
    return list("listAllNamesOnly", &IProvider::listAllNamesOnly, folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFiles(StorageIRI const& folder) const
{
    return list("listFiles", &IProvider::listFiles, folder, {});
}

IProvider::Listing ForwardingProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list("listFiles", &IProvider::listFiles, folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return list("listFilesNamesOnly", &IProvider::listFilesNamesOnly, folder, {});
}

IProvider::Listing ForwardingProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder,
                                                                     std::u16string pattern) const
{
    return list("listFilesNamesOnly", &IProvider::listFilesNamesOnly, folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFolders(StorageIRI const& folder) const
{
    return list("listFolders", &IProvider::listFolders, folder, {});
}

IProvider::Listing ForwardingProvider::doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list("listFolders", &IProvider::listFolders, folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return list("listFoldersNamesOnly", &IProvider::listFoldersNamesOnly, folder, {});
}

IProvider::Listing ForwardingProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                                       std::u16string pattern) const
{
    return list("listFoldersNamesOnly", &IProvider::listFoldersNamesOnly, folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListAllRecursive(StorageIRI const& folder) const
{
    return list("listAllRecursive", &IProvider::listAllRecursive, folder, {});
}

IProvider::Listing ForwardingProvider::doListAllRecursiveWildcards(StorageIRI const& folder,
                                                                   std::u16string pattern) const
{
    return list("listAllRecursive", &IProvider::listAllRecursive, folder, std::move(pattern));
}

IProvider::Listing ForwardingProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    return list("listAllRecursiveNamesOnly", &IProvider::listAllRecursiveNamesOnly, folder, {});
}

IProvider::Listing ForwardingProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                            std::u16string pattern) const
{
    return list("listAllRecursiveNamesOnly", &IProvider::listAllRecursiveNamesOnly, folder, std::move(pattern));
}

void ForwardingProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    target_->copyFile(reach("copyFile", from), translated(to), policy);
}

TransactionStatus ForwardingProvider::doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                       ReplacementPolicy const& policy,
                                                       Interrupt const& interrupt) const
{
    return target_->copyFileAtomic(reach("copyFileAtomic", from), translated(to), policy, interrupt);
}

void ForwardingProvider::doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const
{
    target_->setLastModified(reach("setLastModified", iri), time);
}

void ForwardingProvider::doSetWritable(StorageIRI const& iri, bool writable) const
{
    target_->setWritable(reach("setWritable", iri), writable);
}

void ForwardingProvider::doPublishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                                  EventKinds const& kinds) const
{
    target_->publishFolderEventsFor(reach("publishFolderEventsFor", folder), callback, kinds);
}

void ForwardingProvider::doPublishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                                                EventKinds const& kinds) const
{
    target_->publishFileEventsFor(reach("publishFileEventsFor", file), callback, kinds);
}

void ForwardingProvider::doStopPublishingEventsFor(StorageIRI const& folder) const
{
    target_->stopPublishingFolderEventsFor(reach("stopPublishingFolderEventsFor", folder));
}

bool ForwardingProvider::doHasFeature(ExtendedFeature const& feature) const
{
    return target_->hasFeature(feature);
}

PathComparator ForwardingProvider::doGetPathComparator(StorageIRI const& iri) const
{
    return target_->getPathComparator(reach("getPathComparator", iri));
}

StorageIRI ForwardingProvider::doGetCanonicalLocation(StorageIRI const& iri) const
{
    return target_->getCanonicalLocation(reach("getCanonicalLocation", iri));
}

FilenameSensitivity ForwardingProvider::doGetFilenameSensitivity(StorageIRI const& iri) const
{
    return target_->getFilenameSensitivity(reach("getFilenameSensitivity", iri));
}

void ForwardingProvider::doShutdown()
{
    target_->shutdown();
}

ExistenceType ForwardingProvider::doExists(StorageIRI const& iri) const
{
    return target_->exists(reach("exists", iri));
}

ExistenceTypeExtended ForwardingProvider::doExistsExtended(StorageIRI const& iri) const
{
    return target_->existsExtended(reach("existsExtended", iri));
}

ExtendedAttributes ForwardingProvider::doGetExtendedAttributes(StorageIRI const& iri) const
{
    return target_->getExtendedAttributes(reach("getExtendedAttributes", iri));
}

} // namespace foundation::storage::conformance
