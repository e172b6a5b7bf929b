#pragma once

#include <foundation/export.hpp>
#include <foundation/storage/events/EntryType.hpp>
#include <foundation/storage/events/Kind.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/ByteStreamOpenOptions.hpp>
#include <storage/provider/CaseModifier.hpp>
#include <storage/provider/ExistenceType.hpp>
#include <storage/provider/ExtendedAttributes.hpp>
#include <storage/provider/ExtendedFeature.hpp>
#include <storage/provider/FileAttributes.hpp>
#include <storage/provider/FolderAttributes.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <storage/provider/InterruptSignal.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/TransactionStatus.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>
#include <boost/property_tree/ptree.hpp>

#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::provider {

/// Receives a change: its kind, the location concerned, a second location (where a moved entry went), what kind of
/// entry it was, and details that the provider defines.
using ChangeEventCallback = std::function<void(events::Kind const&, StorageIRI const&, StorageIRI const&,
                                               events::EntryType const&, boost::property_tree::ptree)>;

/// Whether two paths are equal under a way of treating letter case. It does not order.
using PathComparator = std::function<bool(std::u16string const&, std::u16string const&, CaseModifier)>;

/// How a store treats letter case in names.
struct FilenameSensitivity
{
    bool caseSensitive;  ///< names that differ in case alone name different entries
    bool casePreserving; ///< names are listed in the case in which they were created
};

/// A store of files and folders: a local disk, the inside of an archive, a remote store.
///
/// Clients call the public operations, which are not virtual; each reaches the protected virtual operation of the same
/// name behind `do`. A concrete provider overrides the pure ones and whatever it can do better than the defaults. The
/// order of the virtual operations is part of the interface.
///
/// Times are UTC. Listing patterns follow the provider's own rules; an empty one lists everything.
///
/// Errors: `Exception` with a code and the location concerned, unless an operation says otherwise; an operation that
/// fails changes nothing unless it says so. What a provider cannot do it refuses with `UnsupportedOperation`.
/// Ownership: shared by all who hold the pointer. Streams and listings belong to the caller; a provider must outlive
/// the transactional streams it handed out.
/// Threads: the interface holds no state; how many threads may use a provider at once is the provider's to say.
class FOUNDATION_API IProvider
{
public:
    using Listing = std::unique_ptr<IFolderEntryIterator>;
    using Interrupt = std::function<InterruptSignal()>;
    using EventKinds = std::vector<events::Kind>;

    IProvider() = default;
    IProvider(IProvider const&) = delete;
    IProvider& operator=(IProvider const&) = delete;
    virtual ~IProvider();

    /// Creates an empty file; the folder must exist and the name be free.
    void createFile(StorageIRI const& iri) const;

    /// Creates a folder; its parent must exist and the name be free.
    void createFolder(StorageIRI const& iri) const;

    /// Creates a folder and every missing ancestor. Those created before a failure stay; the failure names `iri`.
    /// A root is refused with `ResourceAlreadyExists`, or `ResourceNotFound` when it is missing; with `InvalidLocation`
    /// whatever has no existing ancestor.
    void createFolderRecursive(StorageIRI const& iri) const;

    bool fileExists(StorageIRI const& iri) const;
    bool folderExists(StorageIRI const& iri) const;

    void removeFile(StorageIRI const& iri) const;

    /// Moves a file within the store.
    void moveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const;

    /// Removes an empty folder.
    void removeFolder(StorageIRI const& iri) const;

    /// Removes a folder and all it holds; see `ExtendedFeature::RecursiveFolderRemoval`.
    void removeFolderRecursively(StorageIRI const& iri) const;

    /// Moves a folder within the store; into its own subtree it is refused with `InvalidLocation`, naming `to`.
    void moveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const;

    FileAttributes getFileAttributes(StorageIRI const& iri) const;
    FolderAttributes getFolderAttributes(StorageIRI const& iri) const;
    ExtendedAttributes getExtendedAttributes(StorageIRI const& iri) const;

    /// Opens a file for writing in place; reading it answers -1 unless `options` asks for `ReadWrite`. Readers of the
    /// file may see each write at once; when it is durable is the provider's to say.
    std::unique_ptr<ByteStream> openStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const;

    /// Opens a file for reading; writing throws `ByteStreamWriteFailure`.
    std::unique_ptr<ByteStream> openReadOnlyStream(StorageIRI const& iri) const;

    /// Opens a file for writing all-or-nothing: the target changes when the stream is closed with `Commit`, and then
    /// takes the new content whole. Throws `std::logic_error` for a location without a parent, and
    /// `boost::uuids::entropy_error` when the system has no random bytes for the name of a scratch file.
    std::unique_ptr<TransactionalStream> openTransactionalStream(StorageIRI const& iri,
                                                                 ByteStreamOpenOptions const& options) const;

    /// The entries of a folder, in the provider's order. The names-only forms may leave the attributes out; the
    /// recursive ones give all that lies below the folder.
    Listing listAll(StorageIRI const& folder, std::u16string pattern = {}) const;
    Listing listFiles(StorageIRI const& folder, std::u16string pattern = {}) const;
    Listing listFolders(StorageIRI const& folder, std::u16string pattern = {}) const;
    Listing listAllNamesOnly(StorageIRI const& folder, std::u16string pattern = {}) const;
    Listing listFilesNamesOnly(StorageIRI const& folder, std::u16string pattern = {}) const;
    Listing listFoldersNamesOnly(StorageIRI const& folder, std::u16string pattern = {}) const;
    Listing listAllRecursive(StorageIRI const& folder, std::u16string pattern = {}) const;
    Listing listAllRecursiveNamesOnly(StorageIRI const& folder, std::u16string pattern = {}) const;

    /// Copies a file within the store, not all-or-nothing: a failure may leave a partial target. Replaces a file with
    /// `Overwrite` and `Clobber`, a folder never. A failure of either stream during the copy names `from`.
    void copyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const;

    /// Copies a file within the store all-or-nothing, asking `interrupt` between chunks unless it is empty; see
    /// `ExtendedFeature::AtomicFileCopy`.
    TransactionStatus copyFileAtomic(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy,
                                     Interrupt const& interrupt) const;

    void setLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const;
    void setWritable(StorageIRI const& iri, bool writable) const;

    /// Calls `callback` for changes of the given kinds until told to stop.
    /// Throws `ChangeEventsNotSupportedException` where the store reports no changes.
    void publishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                              EventKinds const& kinds) const;
    void publishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                EventKinds const& kinds) const;

    /// Stops the events of the file's parent folder, through which those of a file are published.
    /// Throws `std::logic_error` for a location without a parent.
    void stopPublishingFileEventsFor(StorageIRI const& file) const;
    void stopPublishingFolderEventsFor(StorageIRI const& folder) const;

    bool hasFeature(ExtendedFeature const& feature) const;
    PathComparator getPathComparator(StorageIRI const& iri) const;

    /// The one location by which the store names what `iri` names.
    StorageIRI getCanonicalLocation(StorageIRI const& iri) const;

    FilenameSensitivity getFilenameSensitivity(StorageIRI const& iri) const;

    /// Gives up what the provider holds; the one operation that changes it.
    void shutdown();

    /// A location that is both a file and a folder (some stores have such) is a file.
    ExistenceType exists(StorageIRI const& iri) const;
    ExistenceTypeExtended existsExtended(StorageIRI const& iri) const;

protected:
    // No public operation checks its arguments beforehand, except where noted: an override sees what the client passed.
    // It reports a missing entry as `ResourceNotFound`, naming the location it was given.

    virtual void doCreateFile(StorageIRI const& iri) const = 0;
    virtual void doCreateFolder(StorageIRI const& iri) const = 0;

    /// Asks for the existence of ancestors only, then creates from the outermost missing one to `iri`.
    virtual void doCreateFolderRecursive(StorageIRI const& iri) const;

    virtual bool doFileExists(StorageIRI const& iri) const = 0;
    virtual bool doFolderExists(StorageIRI const& iri) const = 0;
    virtual void doRemoveFile(StorageIRI const& iri) const = 0;

    /// With `Overwrite` must replace an existing file in one step where the store can: commits rest on it.
    virtual void doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const = 0;

    virtual void doRemoveFolder(StorageIRI const& iri) const = 0;
    virtual void doRemoveFolderRecursively(StorageIRI const& iri) const;

    /// `to` is known not to lie below `from`; it may be `from`.
    virtual void doMoveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const = 0;

    virtual FileAttributes doGetFileAttributes(StorageIRI const& iri) const = 0;
    virtual FolderAttributes doGetFolderAttributes(StorageIRI const& iri) const = 0;

    /// Never null. The caller guards the stream by the access asked for, so it need not refuse reads itself.
    virtual std::unique_ptr<ByteStream> doOpenStream(StorageIRI const& iri,
                                                     ByteStreamOpenOptions const& options) const = 0;
    virtual std::unique_ptr<ByteStream> doOpenReadOnlyStream(StorageIRI const& iri) const = 0;

    /// Names a scratch file beside the target, and opens there.
    virtual std::unique_ptr<TransactionalStream> doOpenTransactionalStream(StorageIRI const& iri,
                                                                           ByteStreamOpenOptions const& options) const;

    /// Commits by moving `scratch` onto `target`, aborts by removing it.
    virtual std::unique_ptr<TransactionalStream>
    doOpenTransactionalStreamAtScratchLocation(StorageIRI const& target, StorageIRI const& scratch,
                                               ByteStreamOpenOptions const& options) const;

    // A pattern is never empty. The defaults drop it: matching is the provider's own.
    virtual Listing doListAll(StorageIRI const& folder) const = 0;
    virtual Listing doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const;
    virtual Listing doListFiles(StorageIRI const& folder) const = 0;
    virtual Listing doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const;
    virtual Listing doListFolders(StorageIRI const& folder) const = 0;
    virtual Listing doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const;
    virtual Listing doListAllNamesOnly(StorageIRI const& folder) const;
    virtual Listing doListAllNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const;
    virtual Listing doListFoldersNamesOnly(StorageIRI const& folder) const;
    virtual Listing doListFoldersNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const;
    virtual Listing doListFilesNamesOnly(StorageIRI const& folder) const;
    virtual Listing doListFilesNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const;
    virtual Listing doListAllRecursive(StorageIRI const& folder) const;
    virtual Listing doListAllRecursiveWildcards(StorageIRI const& folder, std::u16string pattern) const;
    virtual Listing doListAllRecursiveNamesOnly(StorageIRI const& folder) const;
    virtual Listing doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const;

    /// Truncates the target before it reads, so that a file copied onto itself ends empty; a provider that can tell
    /// overrides it.
    virtual void doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const;
    virtual TransactionStatus doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                               ReplacementPolicy const& policy, Interrupt const& interrupt) const;
    virtual void doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const;
    virtual void doSetWritable(StorageIRI const& iri, bool writable) const;

    virtual void doPublishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                          EventKinds const& kinds) const;
    virtual void doPublishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                                        EventKinds const& kinds) const;

    /// Given a folder, also when the events of a file are to stop.
    virtual void doStopPublishingEventsFor(StorageIRI const& folder) const;

    virtual bool doHasFeature(ExtendedFeature const& feature) const;
    virtual PathComparator doGetPathComparator(StorageIRI const& iri) const;
    virtual StorageIRI doGetCanonicalLocation(StorageIRI const& iri) const;
    virtual FilenameSensitivity doGetFilenameSensitivity(StorageIRI const& iri) const;
    virtual void doShutdown();
    virtual ExistenceType doExists(StorageIRI const& iri) const;
    virtual ExistenceTypeExtended doExistsExtended(StorageIRI const& iri) const;
    virtual ExtendedAttributes doGetExtendedAttributes(StorageIRI const& iri) const;

private:
    std::deque<StorageIRI> missingFolders(StorageIRI const& iri) const;
};

} // namespace foundation::storage::provider
