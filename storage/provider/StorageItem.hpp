#pragma once

#include <foundation/export.hpp>
#include <storage/provider/ByteStreamDevice.hpp>
#include <storage/provider/CopyFileOptions.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace foundation::storage::provider {

/// One location of one store: a provider and a location, with every operation of the provider on that location.
///
/// A small value; copies share the provider. The operations are those of `IProvider` and fail as they do.
/// Ownership: an item keeps its provider alive.
/// Threads: as the provider.
class FOUNDATION_API StorageItem
{
public:
    /// `provider` must not be empty.
    StorageItem(std::shared_ptr<IProvider> provider, StorageIRI location);

    /// The child of `parent` with the given plain name.
    StorageItem(StorageItem const& parent, std::u16string name);

    StorageIRI getLocation() const;
    std::u16string getName() const;
    std::u16string getScheme() const;
    bool hasParent() const;

    /// Throws as `StorageIRI::getParent` at the top.
    StorageItem getParent() const;

    /// Equal items hold the very same provider object and equal locations.
    bool operator==(StorageItem const& other) const;
    bool operator!=(StorageItem const& other) const;
    bool hasSameProviderInstance(StorageItem const& other) const;

    void createFile() const;
    void createFolder() const;
    void createFolderRecursive() const;
    bool fileExists() const;
    bool folderExists() const;
    ExistenceType exists() const;
    ExistenceTypeExtended existsExtended() const;
    void removeFile() const;
    void removeFolder() const;
    void removeFolderRecursively() const;
    void moveFile(StorageIRI const& to, ReplacementPolicy const& policy) const;
    void moveFolder(StorageIRI const& to, ReplacementPolicy const& policy) const;
    TransactionStatus copyFileAtomic(StorageIRI const& to, ReplacementPolicy const& policy,
                                     IProvider::Interrupt const& interrupt) const;
    FileAttributes getFileAttributes() const;
    FolderAttributes getFolderAttributes() const;
    ExtendedAttributes getExtendedAttributes() const;
    std::unique_ptr<ByteStream> openStream(ByteStreamOpenOptions const& options) const;
    std::unique_ptr<ByteStream> openReadOnlyStream() const;
    std::unique_ptr<TransactionalStream> openTransactionalStream(ByteStreamOpenOptions const& options) const;
    IProvider::Listing listAll(std::u16string pattern = {}) const;
    IProvider::Listing listFiles(std::u16string pattern = {}) const;
    IProvider::Listing listFolders(std::u16string pattern = {}) const;
    IProvider::Listing listAllNamesOnly(std::u16string pattern = {}) const;
    IProvider::Listing listFilesNamesOnly(std::u16string pattern = {}) const;
    IProvider::Listing listFoldersNamesOnly(std::u16string pattern = {}) const;
    IProvider::Listing listAllRecursive(std::u16string pattern = {}) const;
    IProvider::Listing listAllRecursiveNamesOnly(std::u16string pattern = {}) const;
    void setLastModified(boost::posix_time::ptime const& time) const;
    void setWritable(bool writable) const;
    void publishFileEvents(ChangeEventCallback const& callback, IProvider::EventKinds const& kinds) const;
    void publishFolderEvents(ChangeEventCallback const& callback, IProvider::EventKinds const& kinds) const;
    void stopPublishingFileEvents() const;
    void stopPublishingFolderEvents() const;
    bool hasFeature(ExtendedFeature const& feature) const;
    PathComparator getPathComparator() const;
    StorageIRI getCanonicalLocation() const;
    FilenameSensitivity getFilenameSensitivity() const;

    /// Copies this file to `destination`, which may belong to another provider.
    ///
    /// Within one provider the copy is the provider's own, where it can do what `options` ask; else the bytes pass
    /// through a buffer of 1 MiB. With `Atomic` the destination changes only once the copy is complete, and then at
    /// once; with `NonAtomic` a failure or an interruption leaves a partial file. The interrupt function is asked after
    /// each chunk, never before the first; it is called where it is, not copied. Errors: `ResourceAlreadyExists` naming
    /// the destination, before anything is opened, for a folder there, and under `Preserve` and `NoClobber` for a file;
    /// `IOError` naming this item when reading fails, the destination when writing does; other stream failures by their
    /// own code, naming this item.
    TransactionStatus copyFile(StorageItem const& destination, CopyFileOptions const& options) const;

    /// The same, neither all-or-nothing nor interruptible.
    TransactionStatus copyFile(StorageItem const& destination, ReplacementPolicy const& policy) const;

    /// The steps of a buffered copy. Reads once, up to 1 MiB; answers how many bytes, 0 at the end of the data. A
    /// stream that answers an impossible count has failed.
    long copyToBuffer(ByteStreamDevice const& source, std::vector<char>& buffer) const;

    /// Writes `count` bytes of the buffer to a `ByteStreamDevice` or a `TransactionalStreamDevice` at once; what is not
    /// taken whole is a failure. Answers what the device answered.
    template <typename Device>
    long copyFromBuffer(Device const& target, StorageItem const& destination, std::vector<char> const& buffer,
                        long count) const;

    /// Copies in place; throws `std::bad_function_call` for an empty function.
    TransactionStatus bufferedCopy(ByteStreamDevice const& source, StorageItem const& destination,
                                   ByteStreamOpenOptions const& options, IProvider::Interrupt const& interrupt) const;

    /// Copies all-or-nothing; throws `std::bad_function_call` for an empty function.
    TransactionStatus bufferedTransactionalCopy(ByteStreamDevice const& source, StorageItem const& destination,
                                                ByteStreamOpenOptions const& options,
                                                IProvider::Interrupt const& interrupt) const;

private:
    /// The open target comes with the outcome.
    template <typename Device, typename Open>
    std::pair<Device, TransactionStatus> copyChunks(ByteStreamDevice const& source, StorageItem const& destination,
                                                    Open const& open, IProvider::Interrupt const& interrupt) const;

    std::shared_ptr<IProvider> provider_;
    StorageIRI location_;
};

extern template long StorageItem::copyFromBuffer(ByteStreamDevice const&, StorageItem const&, std::vector<char> const&,
                                                 long) const;
extern template long StorageItem::copyFromBuffer(TransactionalStreamDevice const&, StorageItem const&,
                                                 std::vector<char> const&, long) const;

} // namespace foundation::storage::provider
