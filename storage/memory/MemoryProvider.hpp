#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IConfigurableProvider.hpp>

#include <memory>

namespace foundation::storage::memory {

namespace detail {
class Tree;
struct Selection;
} // namespace detail

/// A store in memory: the files and folders of one authority, at locations such as `mem://authority/folder/file`.
///
/// It does everything that a store can do, and does it at once or not at all. Readers see the content that a file had
/// when they opened it. The root folder is always there. What is refused, what changes are told, and how entries that
/// are not writable behave: see the README beside this header.
///
/// A test that needs a store makes its own, which nobody else sees:
///
///     auto const store = std::make_shared<memory::MemoryProvider>(provider::StorageIRI(u"mem://test/"));
///     provider::StorageItem const folder(store, provider::StorageIRI(u"mem://test/"));
///
/// Errors: `Exception`; for streams in use `ByteStreamFailure`. `InvalidLocation` for another scheme or authority.
/// Ownership: the content lives as long as a provider of it, or the factory that made one. Streams and listings keep
/// what they need, so that they may outlive the provider; transactional streams must not.
/// Threads: any number at once. A stream or listing belongs to one thread at a time.
/// Cost: about 300 bytes for a file, beside name and content.
class FOUNDATION_API MemoryProvider : public provider::IConfigurableProvider
{
public:
    /// A store of its own, empty, for the authority that `location` names; where in it the location lies is ignored.
    /// Throws `InvalidLocation` for what is no location in memory.
    explicit MemoryProvider(provider::StorageIRI const& location);

    /// A provider of what is there already.
    explicit MemoryProvider(std::shared_ptr<detail::Tree> tree);

protected:
    void doCreateFile(provider::StorageIRI const& iri) const override;
    void doCreateFolder(provider::StorageIRI const& iri) const override;
    bool doFileExists(provider::StorageIRI const& iri) const override;
    bool doFolderExists(provider::StorageIRI const& iri) const override;
    provider::ExistenceType doExists(provider::StorageIRI const& iri) const override;
    provider::ExistenceTypeExtended doExistsExtended(provider::StorageIRI const& iri) const override;

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

    provider::FileAttributes doGetFileAttributes(provider::StorageIRI const& iri) const override;
    provider::FolderAttributes doGetFolderAttributes(provider::StorageIRI const& iri) const override;
    void doSetLastModified(provider::StorageIRI const& iri, boost::posix_time::ptime const& time) const override;
    void doSetWritable(provider::StorageIRI const& iri, bool writable) const override;

    std::unique_ptr<provider::ByteStream> doOpenStream(provider::StorageIRI const& iri,
                                                       provider::ByteStreamOpenOptions const& options) const override;
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

    void doPublishFolderEventsFor(provider::StorageIRI const& folder, provider::ChangeEventCallback const& callback,
                                  EventKinds const& kinds) const override;
    void doPublishFileEventsFor(provider::StorageIRI const& file, provider::ChangeEventCallback const& callback,
                                EventKinds const& kinds) const override;
    void doStopPublishingEventsFor(provider::StorageIRI const& folder) const override;

    bool doHasFeature(provider::ExtendedFeature const& feature) const override;
    provider::StorageIRI doGetCanonicalLocation(provider::StorageIRI const& iri) const override;

    /// Takes `limit`, or takes the limit away; throws `std::invalid_argument` for one that is no number of bytes, and
    /// changes nothing then.
    void doConfigure(boost::property_tree::ptree tree) override;

    /// Ends every subscription; what is stored stays, and can be used on.
    void doShutdown() override;

private:
    Listing list(provider::StorageIRI const& folder, detail::Selection selection) const;

    std::shared_ptr<detail::Tree> tree_;
};

} // namespace foundation::storage::memory
