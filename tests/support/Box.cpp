#include <tests/support/Box.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/support/VectorListing.hpp>

#include <utility>

namespace foundation::tests::support {

using namespace storage::provider;

namespace {

void require(bool condition, StorageIRI const& iri)
{
    if (!condition)
        throw Exception(ErrorCode::ResourceNotFound, iri);
}

} // namespace

BoxProvider::BoxProvider(StorageItem box) : box_(std::move(box)) {}

bool BoxProvider::doFileExists(StorageIRI const& iri) const
{
    return iri.getPath() == u"/content";
}

bool BoxProvider::doFolderExists(StorageIRI const& iri) const
{
    return iri.getPath() == u"/";
}

FileAttributes BoxProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    require(doFileExists(iri), iri);
    return box_.getFileAttributes();
}

FolderAttributes BoxProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    require(doFolderExists(iri), iri);
    return FolderAttributes(box_.getFileAttributes().getLastModified(), false);
}

std::unique_ptr<ByteStream> BoxProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    require(doFileExists(iri), iri);
    return box_.openReadOnlyStream();
}

IProvider::Listing BoxProvider::doListAll(StorageIRI const& folder) const
{
    return doListFiles(folder);
}

IProvider::Listing BoxProvider::doListFiles(StorageIRI const& folder) const
{
    require(doFolderExists(folder), folder);
    return std::make_unique<VectorListing>(std::vector{FolderEntry(u"content", box_.getFileAttributes())});
}

IProvider::Listing BoxProvider::doListFolders(StorageIRI const& folder) const
{
    require(doFolderExists(folder), folder);
    return std::make_unique<VectorListing>(std::vector<FolderEntry>());
}

std::shared_ptr<IProvider> BoxFactory::doBuildProvider(StorageItem const& box) const
{
    require(box.fileExists(), box.getLocation());
    ++built;
    return std::make_shared<BoxProvider>(box);
}

StorageIRI BoxFactory::doGetKey(StorageItem const& box) const
{
    return box.getLocation();
}

} // namespace foundation::tests::support
