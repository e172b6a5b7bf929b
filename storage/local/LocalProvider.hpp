#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IConfigurableProvider.hpp>

#include <boost/property_tree/ptree.hpp>

#include <memory>
#include <mutex>

namespace foundation::storage::local {

namespace detail {
class ChangeNotifier;
class Root;
struct Selection;
struct Settings;
} // namespace detail

/// The files and folders of this machine, at locations of the scheme `file`.
///
/// A path has the meaning that the operating system gives it: links are followed on the way, "." and ".." are names
/// that it resolves. Names are the bytes on disk in UTF-16; a byte that takes no part in UTF-8 has a stand-in (see
/// `fl::filesystem::from_native_bytes`), so that every file can be listed and reached. Links, special files, moves,
/// extended attributes and what is refused: see the README beside this header.
///
/// Errors: `Exception`; for streams in use `ByteStreamFailure`. `InvalidLocation` where a location names no local file.
/// Settings: `durability`, `preserve` and `root`; see the README. `configure` throws `std::invalid_argument` for what
/// it does not understand, and changes nothing then. What is open keeps the settings that it was opened with. Threads:
/// any number at once, with `configure` too. A stream or listing belongs to one thread at a time. Change events come in
/// a thread of the provider; see the README for what callbacks may do. Cost: holds nothing but what its streams and
/// listings hold, a descriptor each; with subscriptions to change events a thread and two descriptors.
class FOUNDATION_API LocalProvider : public provider::IConfigurableProvider
{
public:
    LocalProvider();
    ~LocalProvider() override;

protected:
    void doConfigure(boost::property_tree::ptree tree) override;
    void doShutdown() override;

    void doCreateFile(provider::StorageIRI const& iri) const override;
    void doCreateFolder(provider::StorageIRI const& iri) const override;
    void doCreateFolderRecursive(provider::StorageIRI const& iri) const override;
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
    provider::ExtendedAttributes doGetExtendedAttributes(provider::StorageIRI const& iri) const override;
    void doSetLastModified(provider::StorageIRI const& iri, boost::posix_time::ptime const& time) const override;
    void doSetWritable(provider::StorageIRI const& iri, bool writable) const override;

    std::unique_ptr<provider::ByteStream> doOpenStream(provider::StorageIRI const& iri,
                                                       provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<provider::ByteStream> doOpenReadOnlyStream(provider::StorageIRI const& iri) const override;
    std::unique_ptr<provider::TransactionalStream>
    doOpenTransactionalStream(provider::StorageIRI const& target,
                              provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<provider::TransactionalStream>
    doOpenTransactionalStreamAtScratchLocation(provider::StorageIRI const& target, provider::StorageIRI const& scratch,
                                               provider::ByteStreamOpenOptions const& options) const override;

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

    bool doHasFeature(provider::ExtendedFeature const& feature) const override;

    void doPublishFolderEventsFor(provider::StorageIRI const& folder, provider::ChangeEventCallback const& callback,
                                  EventKinds const& kinds) const override;
    void doPublishFileEventsFor(provider::StorageIRI const& file, provider::ChangeEventCallback const& callback,
                                EventKinds const& kinds) const override;
    void doStopPublishingEventsFor(provider::StorageIRI const& folder) const override;

private:
    std::shared_ptr<detail::Settings const> settings() const;
    std::shared_ptr<detail::Root const> root() const;
    Listing list(provider::StorageIRI const& folder, detail::Selection selection) const;
    Listing listRecursively(provider::StorageIRI const& folder, detail::Selection selection) const;

    mutable std::mutex mutex_;
    std::shared_ptr<detail::Settings const> settings_;
    std::unique_ptr<detail::ChangeNotifier> const notifier_;
};

} // namespace foundation::storage::local
