#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>

#include <memory>

namespace foundation::storage::conformance {

/// Hands every operation to another provider, through its public interface: the base of providers that differ from
/// another one in a few points.
///
/// A derived class overrides what it does differently. One operation has no public form and stays as inherited: a
/// transactional stream at a scratch location, which is reached only by who calls
/// `IProvider::doOpenTransactionalStream`. Ownership: keeps the other provider alive. Threads: as the other provider.
class FOUNDATION_API ForwardingProvider : public provider::IProvider
{
public:
    /// `target` must not be empty.
    explicit ForwardingProvider(std::shared_ptr<provider::IProvider> target);

protected:
    provider::IProvider& target() const { return *target_; }

    /// Called before each operation that has a location, with its public name and its first location. What it throws
    /// the operation throws.
    virtual void before(char const* operation, provider::StorageIRI const& location) const;

    /// The location of the other provider that a location stands for: as it stands, the same. Failures and canonical
    /// locations are not translated back.
    virtual provider::StorageIRI translated(provider::StorageIRI const& location) const;

    /// What a caller gets for a stream of the other provider: as it stands, that itself. The location is the one that
    /// the caller asked for.
    virtual std::unique_ptr<provider::ByteStream> handOutStream(std::unique_ptr<provider::ByteStream> stream,
                                                                provider::StorageIRI const& file) const;
    virtual std::unique_ptr<provider::TransactionalStream>
    handOutTransaction(std::unique_ptr<provider::TransactionalStream> stream, provider::StorageIRI const& file) const;

    using ListingOperation = Listing (provider::IProvider::*)(provider::StorageIRI const&, std::u16string) const;

    /// All sixteen listing operations end here: `operation` of the other provider, whose public name is `name`.
    virtual Listing list(char const* name, ListingOperation operation, provider::StorageIRI const& folder,
                         std::u16string pattern) const;

    void doCreateFile(provider::StorageIRI const& iri) const override;
    void doCreateFolder(provider::StorageIRI const& iri) const override;
    void doCreateFolderRecursive(provider::StorageIRI const& iri) const override;
    bool doFileExists(provider::StorageIRI const& iri) const override;
    bool doFolderExists(provider::StorageIRI const& iri) const override;
    void doRemoveFile(provider::StorageIRI const& iri) const override;
    void doMoveFile(provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy const& policy) const override;
    void doRemoveFolder(provider::StorageIRI const& iri) const override;
    void doRemoveFolderRecursively(provider::StorageIRI const& iri) const override;
    void doMoveFolder(provider::StorageIRI const& from, provider::StorageIRI const& to,
                      provider::ReplacementPolicy const& policy) const override;
    provider::FileAttributes doGetFileAttributes(provider::StorageIRI const& iri) const override;
    provider::FolderAttributes doGetFolderAttributes(provider::StorageIRI const& iri) const override;
    std::unique_ptr<provider::ByteStream> doOpenStream(provider::StorageIRI const& iri,
                                                       provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<provider::ByteStream> doOpenReadOnlyStream(provider::StorageIRI const& iri) const override;
    std::unique_ptr<provider::TransactionalStream>
    doOpenTransactionalStream(provider::StorageIRI const& iri,
                              provider::ByteStreamOpenOptions const& options) const override;
    Listing doListAll(provider::StorageIRI const& folder) const override;
    Listing doListAllWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListAllNamesOnlyWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFiles(provider::StorageIRI const& folder) const override;
    Listing doListFilesWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFilesNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListFilesNamesOnlyWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFolders(provider::StorageIRI const& folder) const override;
    Listing doListFoldersWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListFoldersNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListFoldersNamesOnlyWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllRecursive(provider::StorageIRI const& folder) const override;
    Listing doListAllRecursiveWildcards(provider::StorageIRI const& folder, std::u16string pattern) const override;
    Listing doListAllRecursiveNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListAllRecursiveNamesOnlyWildcards(provider::StorageIRI const& folder,
                                                 std::u16string pattern) const override;
    void doCopyFile(provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy const& policy) const override;
    provider::TransactionStatus doCopyFileAtomic(provider::StorageIRI const& from, provider::StorageIRI const& to,
                                                 provider::ReplacementPolicy const& policy,
                                                 Interrupt const& interrupt) const override;
    void doSetLastModified(provider::StorageIRI const& iri, boost::posix_time::ptime const& time) const override;
    void doSetWritable(provider::StorageIRI const& iri, bool writable) const override;
    void doPublishFolderEventsFor(provider::StorageIRI const& folder, provider::ChangeEventCallback const& callback,
                                  EventKinds const& kinds) const override;
    void doPublishFileEventsFor(provider::StorageIRI const& file, provider::ChangeEventCallback const& callback,
                                EventKinds const& kinds) const override;
    void doStopPublishingEventsFor(provider::StorageIRI const& folder) const override;
    bool doHasFeature(provider::ExtendedFeature const& feature) const override;
    provider::PathComparator doGetPathComparator(provider::StorageIRI const& iri) const override;
    provider::StorageIRI doGetCanonicalLocation(provider::StorageIRI const& iri) const override;
    provider::FilenameSensitivity doGetFilenameSensitivity(provider::StorageIRI const& iri) const override;
    void doShutdown() override;
    provider::ExistenceType doExists(provider::StorageIRI const& iri) const override;
    provider::ExistenceTypeExtended doExistsExtended(provider::StorageIRI const& iri) const override;
    provider::ExtendedAttributes doGetExtendedAttributes(provider::StorageIRI const& iri) const override;

private:
    provider::StorageIRI reach(char const* operation, provider::StorageIRI const& location) const;

    std::shared_ptr<provider::IProvider> target_;
};

} // namespace foundation::storage::conformance
