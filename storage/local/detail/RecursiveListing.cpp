#include <storage/local/detail/RecursiveListing.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/errorCode.hpp>

#include <cerrno>
#include <dirent.h>
#include <utility>

namespace foundation::storage::local::detail {

using provider::StorageIRI;

namespace {

/// What was a folder when its name was read may have gone, or become something else.
bool meansVanished(int error)
{
    return error == ENOENT || error == ENOTDIR || error == ELOOP;
}

} // namespace

RecursiveListing::RecursiveListing(std::shared_ptr<Root const> root, StorageIRI const& folder, Selection selection)
    : RecursiveListing(listedPath(std::move(root), folder), folder, std::move(selection))
{}

RecursiveListing::RecursiveListing(std::shared_ptr<FolderPath const> path, StorageIRI const& folder,
                                   Selection selection)
    : path_(std::move(path)), iri_(folder), chain_(openListed(*path_, folder)), maker_(std::move(selection))
{
    next();
}

void RecursiveListing::next()
{
    entry_.reset();
    while (!entry_ && advance()) {
    }
}

void RecursiveListing::reset()
{
    entry_.reset();
    pending_.clear();
    folder_.reset();
    if (int const error = chain_.restart())
        throwError(error, iri_);
    next();
}

/// Makes one step; answers whether there is another one.
bool RecursiveListing::advance()
{
    if (!pending_.empty())
        descend();
    FoundName found;
    if (int const error = chain_.read(found)) {
        // A folder that cannot be read is through.
        std::string const path = chain_.path();
        leave();
        throwAt(path, error);
    }
    if (!found.name.empty())
        take(found);
    else if (chain_.depth() != 0)
        leave();
    else
        return false;
    return true;
}

void RecursiveListing::descend()
{
    std::string const name = std::exchange(pending_, {});
    int const error = chain_.enter(name.c_str(), Mounts::Enter);
    if (error == 0)
        folder_.reset();
    else if (!meansVanished(error))
        throwAt(chain_.depth() == 0 ? name : chain_.path() + '/' + name, error);
}

void RecursiveListing::leave()
{
    folder_.reset();
    if (chain_.depth() == 0)
        return;
    int const error = chain_.leave();
    // What others have moved away holds no more than what they have removed.
    if (error != 0 && error != ESTALE)
        throwAt(chain_.path(), error);
}

void RecursiveListing::take(FoundName const& found)
{
    if (!folder_)
        folder_ = listedFolder();
    if (found.isFolder() || found.type == DT_UNKNOWN)
        pending_ = found.name;
    if (int const error = maker_.make(*folder_, found, entry_))
        throwAt(chain_.depth() == 0 ? std::string(found.name) : chain_.path() + '/' + std::string(found.name), error);
}

ListedFolder RecursiveListing::listedFolder() const
{
    if (chain_.depth() == 0)
        return {.descriptor = chain_.folder(), .path = path_};
    std::string const below = chain_.path();
    return {.descriptor = chain_.folder(),
            .path = std::make_shared<FolderPath const>(FolderPath{path_->root, path_->pathOf(below)}),
            .prefix = fl::filesystem::from_native_bytes(below) + u'/'};
}

void RecursiveListing::throwAt(std::string const& path, int error) const
{
    throwError(error, path.empty() ? iri_ : StorageIRI(iri_, fl::filesystem::from_native_bytes(path)));
}

} // namespace foundation::storage::local::detail
