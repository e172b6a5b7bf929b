#pragma once

#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

namespace foundation::tests::support {

/// A store in memory that overrides the pure operations alone, so that everything else is what a provider inherits.
class MinimalProvider : public storage::provider::IProvider
{
public:
    using StorageIRI = storage::provider::StorageIRI;

    /// What it holds; tests put things there and look at what became of them.
    mutable std::map<StorageIRI, std::shared_ptr<std::string>> files;
    mutable std::set<StorageIRI> folders;

    void put(StorageIRI const& file, std::string content) const;
    std::string content(StorageIRI const& file) const;

protected:
    void doCreateFile(StorageIRI const& iri) const override;
    void doCreateFolder(StorageIRI const& iri) const override;
    bool doFileExists(StorageIRI const& iri) const override;
    bool doFolderExists(StorageIRI const& iri) const override;
    void doRemoveFile(StorageIRI const& iri) const override;
    void doMoveFile(StorageIRI const& from, StorageIRI const& to,
                    storage::provider::ReplacementPolicy const& policy) const override;
    void doRemoveFolder(StorageIRI const& iri) const override;
    void doMoveFolder(StorageIRI const& from, StorageIRI const& to,
                      storage::provider::ReplacementPolicy const& policy) const override;
    storage::provider::FileAttributes doGetFileAttributes(StorageIRI const& iri) const override;
    storage::provider::FolderAttributes doGetFolderAttributes(StorageIRI const& iri) const override;
    std::unique_ptr<storage::provider::ByteStream>
    doOpenStream(StorageIRI const& iri, storage::provider::ByteStreamOpenOptions const& options) const override;
    std::unique_ptr<storage::provider::ByteStream> doOpenReadOnlyStream(StorageIRI const& iri) const override;
    Listing doListAll(StorageIRI const& folder) const override;
    Listing doListFiles(StorageIRI const& folder) const override;
    Listing doListFolders(StorageIRI const& folder) const override;

private:
    std::shared_ptr<std::string> const& requireFile(StorageIRI const& iri) const;
    void requireFolder(StorageIRI const& iri) const;
    void requireFree(StorageIRI const& iri) const;
    void addFiles(StorageIRI const& folder, std::vector<storage::provider::FolderEntry>& entries) const;
    void addFolders(StorageIRI const& folder, std::vector<storage::provider::FolderEntry>& entries) const;
};

} // namespace foundation::tests::support
