#include <storage/local/detail/LocalListing.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/errorCode.hpp>

#include <utility>

namespace foundation::storage::local::detail {

using provider::StorageIRI;

LocalListing::LocalListing(std::shared_ptr<Root const> root, StorageIRI const& folder, Selection selection)
    : LocalListing(listedPath(std::move(root), folder), folder, std::move(selection))
{}

LocalListing::LocalListing(std::shared_ptr<FolderPath const> path, StorageIRI const& folder, Selection selection)
    : iri_(folder),
      reader_(openListed(*path, folder)),
      folder_{.descriptor = reader_.folder().get(), .path = std::move(path)},
      maker_(std::move(selection))
{
    next();
}

void LocalListing::next()
{
    entry_.reset();
    while (!entry_) {
        FoundName found;
        if (int const error = reader_.next(found))
            throwError(error, iri_);
        if (found.name.empty())
            return;
        if (int const error = maker_.make(folder_, found, entry_))
            throwAt(found, error);
    }
}

void LocalListing::reset()
{
    entry_.reset();
    if (int const error = reader_.restart())
        throwError(error, iri_);
    next();
}

void LocalListing::throwAt(FoundName const& found, int error) const
{
    throwError(error, StorageIRI(iri_, fl::filesystem::from_native_bytes(found.name)));
}

} // namespace foundation::storage::local::detail
