#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/provider/IReadOnlyProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <memory>

namespace foundation::storage::archive {

namespace detail {
class MountedArchive;
struct Selection;
} // namespace detail

/// The files and folders in an archive, at locations such as `zip:file:///a.zip!/folder/file`, for reading.
///
/// Whatever an archive calls its entries, they are shown below its root, and its links lead nowhere else; see the
/// README beside this header for names, links, limits, and what is refused.
///
/// Errors: `Exception`, of which `ArchiveException` says what is wrong with an archive; for streams in use
/// `ByteStreamFailure`. `InvalidLocation` for a location that is not in the container.
/// Ownership: shares the provider of the container. Streams and listings keep what they need, so that they may outlive
/// this provider.
/// Threads: any number at once. A stream or listing belongs to one thread at a time.
/// Cost: the index is read once, when it is first needed. It takes some 70 bytes for an entry, beside its name.
class FOUNDATION_API ArchiveProvider : public provider::IReadOnlyProvider
{
public:
    /// Does not look at the container yet. Throws `ArchiveException` for one that lies too deep in others.
    ArchiveProvider(ArchiveFormat format, provider::StorageItem container, ArchiveLimits const& limits = {});
    ~ArchiveProvider() override;

protected:
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

    /// Lets go of the archive, which is opened again when it is used again.
    void doShutdown() override;

private:
    std::unique_ptr<detail::MountedArchive> const archive_;
};

} // namespace foundation::storage::archive
