#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <memory>

namespace foundation::storage::archive {

namespace detail {
class MountedArchive;
class WritableArchive;
} // namespace detail

/// The files and folders in an archive, at locations such as `zip:file:///a.zip!/folder/file`.
///
/// Whatever an archive calls its entries, they are shown below its root, and its links lead nowhere else; see the
/// README beside this header for names, links, limits, and what is refused.
///
/// A zip can be changed; archives of other formats are refused with `ReadOnlyProvider`. Changes are collected, and seen
/// by all users of the provider at once. They reach the archive in one step, on `flush` or `shutdown`; until then it is
/// the old one, whole, and a container that is not there is not made. A provider that goes before loses its changes,
/// and leaves nothing behind.
///
/// Errors: `Exception`, of which `ArchiveException` says what is wrong with an archive; for streams in use
/// `ByteStreamFailure`. `InvalidLocation` for a location that is not in the container.
/// Ownership: shares the provider of the container. Streams and listings keep what they need, so that they may outlive
/// this provider; the changes that streams make are lost then.
/// Threads: any number at once. A stream or listing belongs to one thread at a time.
/// Cost: the index is read once, when it is first needed. It takes some 70 bytes for an entry, beside its name, and as
/// much again with the first change. New content is compressed by whoever closes its stream.
class FOUNDATION_API ArchiveProvider : public provider::IProvider
{
public:
    /// Does not look at the container yet. Throws `ArchiveException` for one that lies too deep in others.
    ArchiveProvider(ArchiveFormat format, provider::StorageItem container, ArchiveLimits const& limits = {});
    ~ArchiveProvider() override;

    /// Has this provider take locations in the container under another location of that, too.
    void addContainerLocation(provider::StorageIRI const& container);

    /// Writes the archive anew with all changes, through a transactional stream of the store that holds it. Nothing
    /// happens where nothing has changed.
    ///
    /// A file that is open for writing goes in as it is at that moment. Entries that have not changed are copied as
    /// they are compressed. Errors: `ArchiveException`; the archive is as it was then, the changes are kept, and this
    /// may be tried again. Only where the store fails with its very last step the archive may be the new one already.
    /// `Reason::Changed` when somebody else changed the container since the first change; that is not noticed of who
    /// writes it at the same moment.
    void flush();

protected:
    void doCreateFile(provider::StorageIRI const& iri) const override;
    void doCreateFolder(provider::StorageIRI const& iri) const override;

    /// Makes the archive, too, where it is not there.
    void doCreateFolderRecursive(provider::StorageIRI const& iri) const override;
    void doRemoveFile(provider::StorageIRI const& iri) const override;
    void doRemoveFolder(provider::StorageIRI const& iri) const override;
    void doRemoveFolderRecursively(provider::StorageIRI const& iri) const override;
    void doMoveFile(provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy const& policy) const override;
    void doMoveFolder(provider::StorageIRI const& from, provider::StorageIRI const& to,
                      provider::ReplacementPolicy const& policy) const override;
    void doCopyFile(provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy const& policy) const override;
    provider::TransactionStatus doCopyFileAtomic(provider::StorageIRI const& from, provider::StorageIRI const& to,
                                                 provider::ReplacementPolicy const& policy,
                                                 Interrupt const& interrupt) const override;
    void doSetLastModified(provider::StorageIRI const& iri, boost::posix_time::ptime const& time) const override;
    void doSetWritable(provider::StorageIRI const& iri, bool writable) const override;
    std::unique_ptr<provider::ByteStream> doOpenStream(provider::StorageIRI const& iri,
                                                       provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<provider::TransactionalStream>
    doOpenTransactionalStream(provider::StorageIRI const& iri,
                              provider::ByteStreamOpenOptions const& options) const override;
    bool doHasFeature(provider::ExtendedFeature const& feature) const override;

    bool doFileExists(provider::StorageIRI const& iri) const override;
    bool doFolderExists(provider::StorageIRI const& iri) const override;
    provider::ExistenceType doExists(provider::StorageIRI const& iri) const override;
    provider::ExistenceTypeExtended doExistsExtended(provider::StorageIRI const& iri) const override;
    provider::FileAttributes doGetFileAttributes(provider::StorageIRI const& iri) const override;
    provider::FolderAttributes doGetFolderAttributes(provider::StorageIRI const& iri) const override;
    provider::ExtendedAttributes doGetExtendedAttributes(provider::StorageIRI const& iri) const override;
    std::unique_ptr<provider::ByteStream> doOpenReadOnlyStream(provider::StorageIRI const& iri) const override;

    Listing doListAll(provider::StorageIRI const& folder) const override;
    Listing doListAllWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFiles(provider::StorageIRI const& folder) const override;
    Listing doListFilesWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFolders(provider::StorageIRI const& folder) const override;
    Listing doListFoldersWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListAllNamesOnlyWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFoldersNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListFoldersNamesOnlyWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFilesNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListFilesNamesOnlyWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllRecursive(provider::StorageIRI const& folder) const override;
    Listing doListAllRecursiveWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllRecursiveNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListAllRecursiveNamesOnlyWildcards(provider::StorageIRI const& folder,
                                                 std::u16string pattern) const override;

    provider::StorageIRI doGetCanonicalLocation(provider::StorageIRI const& iri) const override;

    /// Flushes, and lets go of the archive, which is opened again when it is used again.
    void doShutdown() override;

private:
    detail::WritableArchive& changeable(provider::StorageIRI const& iri) const;

    std::shared_ptr<detail::WritableArchive> const writable_; ///< nothing where the format cannot be written
    std::shared_ptr<detail::MountedArchive> const archive_;
};

} // namespace foundation::storage::archive
