#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>

namespace foundation::storage::local {

/// The files and folders of this machine, at locations of the scheme `file`.
///
/// A path has the meaning that the operating system gives it: links are followed on the way, "." and ".." are names
/// that it resolves. Names are the bytes on disk in UTF-16; a byte that takes no part in UTF-8 has a stand-in (see
/// `fl::filesystem::from_native_bytes`), so that every file can be listed and reached. Links, special files, moves and
/// what is refused: see the README beside this header.
///
/// Errors: `Exception`; for streams in use `ByteStreamFailure`. `InvalidLocation` where a location names no local file.
/// Threads: any number at once. A stream or listing belongs to one thread at a time.
/// Cost: holds nothing but what its streams and listings hold, a descriptor each.
class FOUNDATION_API LocalProvider : public provider::IProvider
{
protected:
    void doCreateFile(provider::StorageIRI const& iri) const override;
    void doCreateFolder(provider::StorageIRI const& iri) const override;
    bool doFileExists(provider::StorageIRI const& iri) const override;
    bool doFolderExists(provider::StorageIRI const& iri) const override;
    provider::ExistenceType doExists(provider::StorageIRI const& iri) const override;
    provider::ExistenceTypeExtended doExistsExtended(provider::StorageIRI const& iri) const override;

    void doRemoveFile(provider::StorageIRI const& iri) const override;
    void doRemoveFolder(provider::StorageIRI const& iri) const override;
    void doMoveFile(provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy const& policy) const override;
    void doMoveFolder(provider::StorageIRI const& from, provider::StorageIRI const& to,
                      provider::ReplacementPolicy const& policy) const override;
    void doCopyFile(provider::StorageIRI const& from, provider::StorageIRI const& to,
                    provider::ReplacementPolicy const& policy) const override;

    provider::FileAttributes doGetFileAttributes(provider::StorageIRI const& iri) const override;
    provider::FolderAttributes doGetFolderAttributes(provider::StorageIRI const& iri) const override;

    std::unique_ptr<provider::ByteStream> doOpenStream(provider::StorageIRI const& iri,
                                                       provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<provider::ByteStream> doOpenReadOnlyStream(provider::StorageIRI const& iri) const override;

    Listing doListAll(provider::StorageIRI const& folder) const override;
    Listing doListFiles(provider::StorageIRI const& folder) const override;
    Listing doListFolders(provider::StorageIRI const& folder) const override;
    Listing doListAllNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListFilesNamesOnly(provider::StorageIRI const& folder) const override;
    Listing doListFoldersNamesOnly(provider::StorageIRI const& folder) const override;
};

} // namespace foundation::storage::local
