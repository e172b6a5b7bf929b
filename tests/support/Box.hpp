#pragma once

#include <storage/provider/ContainerProviderFactory.hpp>
#include <storage/provider/IReadOnlyProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <atomic>

namespace foundation::tests::support {

/// The inside of a container of the simplest kind: any file is a box that holds one file, `/content`, with the bytes
/// of the file itself. So boxes can be nested without end. Reads the container anew each time.
class BoxProvider : public storage::provider::IReadOnlyProvider
{
public:
    using StorageIRI = storage::provider::StorageIRI;

    explicit BoxProvider(storage::provider::StorageItem box);

protected:
    bool doFileExists(StorageIRI const& iri) const override;
    bool doFolderExists(StorageIRI const& iri) const override;
    storage::provider::FileAttributes doGetFileAttributes(StorageIRI const& iri) const override;
    storage::provider::FolderAttributes doGetFolderAttributes(StorageIRI const& iri) const override;
    std::unique_ptr<storage::provider::ByteStream> doOpenReadOnlyStream(StorageIRI const& iri) const override;
    Listing doListAll(StorageIRI const& folder) const override;
    Listing doListFiles(StorageIRI const& folder) const override;
    Listing doListFolders(StorageIRI const& folder) const override;

private:
    storage::provider::StorageItem box_;
};

/// Makes boxes of files that exist, one for each location.
class BoxFactory : public storage::provider::ContainerProviderFactory
{
public:
    mutable std::atomic<int> built = 0;

protected:
    std::shared_ptr<storage::provider::IProvider>
    doBuildProvider(storage::provider::StorageItem const& box) const override;
    storage::provider::StorageIRI doGetKey(storage::provider::StorageItem const& box) const override;
};

} // namespace foundation::tests::support
