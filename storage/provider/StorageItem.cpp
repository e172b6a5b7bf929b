#include <storage/provider/StorageItem.hpp>

#include <utility>

namespace foundation::storage::provider {

StorageItem::StorageItem(std::shared_ptr<IProvider> provider, StorageIRI location)
    : provider_(std::move(provider)), location_(std::move(location))
{}

StorageItem::StorageItem(StorageItem const& parent, std::u16string name)
    : provider_(parent.provider_), location_(parent.location_, name)
{}

StorageIRI StorageItem::getLocation() const
{
    return location_;
}

std::u16string StorageItem::getName() const
{
    return location_.getName();
}

std::u16string StorageItem::getScheme() const
{
    return location_.getScheme();
}

bool StorageItem::hasParent() const
{
    return location_.hasParent();
}

StorageItem StorageItem::getParent() const
{
    return StorageItem(provider_, location_.getParent());
}

bool StorageItem::operator==(StorageItem const& other) const
{
    return hasSameProviderInstance(other) && location_ == other.location_;
}

bool StorageItem::operator!=(StorageItem const& other) const
{
    return !(*this == other);
}

bool StorageItem::hasSameProviderInstance(StorageItem const& other) const
{
    return provider_ == other.provider_;
}

void StorageItem::createFile() const
{
    provider_->createFile(location_);
}

void StorageItem::createFolder() const
{
    provider_->createFolder(location_);
}

void StorageItem::createFolderRecursive() const
{
    provider_->createFolderRecursive(location_);
}

bool StorageItem::fileExists() const
{
    return provider_->fileExists(location_);
}

bool StorageItem::folderExists() const
{
    return provider_->folderExists(location_);
}

ExistenceType StorageItem::exists() const
{
    return provider_->exists(location_);
}

ExistenceTypeExtended StorageItem::existsExtended() const
{
    return provider_->existsExtended(location_);
}

void StorageItem::removeFile() const
{
    provider_->removeFile(location_);
}

void StorageItem::removeFolder() const
{
    provider_->removeFolder(location_);
}

void StorageItem::removeFolderRecursively() const
{
    provider_->removeFolderRecursively(location_);
}

void StorageItem::moveFile(StorageIRI const& to, ReplacementPolicy const& policy) const
{
    provider_->moveFile(location_, to, policy);
}

void StorageItem::moveFolder(StorageIRI const& to, ReplacementPolicy const& policy) const
{
    provider_->moveFolder(location_, to, policy);
}

TransactionStatus StorageItem::copyFileAtomic(StorageIRI const& to, ReplacementPolicy const& policy,
                                              IProvider::Interrupt const& interrupt) const
{
    return provider_->copyFileAtomic(location_, to, policy, interrupt);
}

FileAttributes StorageItem::getFileAttributes() const
{
    return provider_->getFileAttributes(location_);
}

FolderAttributes StorageItem::getFolderAttributes() const
{
    return provider_->getFolderAttributes(location_);
}

ExtendedAttributes StorageItem::getExtendedAttributes() const
{
    return provider_->getExtendedAttributes(location_);
}

std::unique_ptr<ByteStream> StorageItem::openStream(ByteStreamOpenOptions const& options) const
{
    return provider_->openStream(location_, options);
}

std::unique_ptr<ByteStream> StorageItem::openReadOnlyStream() const
{
    return provider_->openReadOnlyStream(location_);
}

std::unique_ptr<TransactionalStream> StorageItem::openTransactionalStream(ByteStreamOpenOptions const& options) const
{
    return provider_->openTransactionalStream(location_, options);
}

IProvider::Listing StorageItem::listAll(std::u16string pattern) const
{
    return provider_->listAll(location_, std::move(pattern));
}

IProvider::Listing StorageItem::listFiles(std::u16string pattern) const
{
    return provider_->listFiles(location_, std::move(pattern));
}

IProvider::Listing StorageItem::listFolders(std::u16string pattern) const
{
    return provider_->listFolders(location_, std::move(pattern));
}

IProvider::Listing StorageItem::listAllNamesOnly(std::u16string pattern) const
{
    return provider_->listAllNamesOnly(location_, std::move(pattern));
}

IProvider::Listing StorageItem::listFilesNamesOnly(std::u16string pattern) const
{
    return provider_->listFilesNamesOnly(location_, std::move(pattern));
}

IProvider::Listing StorageItem::listFoldersNamesOnly(std::u16string pattern) const
{
    return provider_->listFoldersNamesOnly(location_, std::move(pattern));
}

IProvider::Listing StorageItem::listAllRecursive(std::u16string pattern) const
{
    return provider_->listAllRecursive(location_, std::move(pattern));
}

IProvider::Listing StorageItem::listAllRecursiveNamesOnly(std::u16string pattern) const
{
    return provider_->listAllRecursiveNamesOnly(location_, std::move(pattern));
}

void StorageItem::setLastModified(boost::posix_time::ptime const& time) const
{
    provider_->setLastModified(location_, time);
}

void StorageItem::setWritable(bool writable) const
{
    provider_->setWritable(location_, writable);
}

void StorageItem::publishFileEvents(ChangeEventCallback const& callback, IProvider::EventKinds const& kinds) const
{
    provider_->publishFileEventsFor(location_, callback, kinds);
}

void StorageItem::publishFolderEvents(ChangeEventCallback const& callback, IProvider::EventKinds const& kinds) const
{
    provider_->publishFolderEventsFor(location_, callback, kinds);
}

void StorageItem::stopPublishingFileEvents() const
{
    provider_->stopPublishingFileEventsFor(location_);
}

void StorageItem::stopPublishingFolderEvents() const
{
    provider_->stopPublishingFolderEventsFor(location_);
}

bool StorageItem::hasFeature(ExtendedFeature const& feature) const
{
    return provider_->hasFeature(feature);
}

PathComparator StorageItem::getPathComparator() const
{
    return provider_->getPathComparator(location_);
}

StorageIRI StorageItem::getCanonicalLocation() const
{
    return provider_->getCanonicalLocation(location_);
}

FilenameSensitivity StorageItem::getFilenameSensitivity() const
{
    return provider_->getFilenameSensitivity(location_);
}

} // namespace foundation::storage::provider
