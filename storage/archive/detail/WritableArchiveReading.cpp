// What is seen of an archive with changes, but for content.

#include <storage/archive/detail/WritableArchive.hpp>

#include <storage/archive/detail/PendingListing.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/archive/detail/time.hpp>

#include <functional>
#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;

namespace {

/// A listing that begins anew with what is there by then.
class RenewedListing final : public IFolderEntryIterator
{
public:
    using Maker = std::function<IProvider::Listing()>;

    explicit RenewedListing(Maker make) : make_(std::move(make)), current_(make_()) {}

    bool hasEntry() const override { return current_->hasEntry(); }
    FolderEntry const& entry() const override { return current_->entry(); }
    void next() override { current_->next(); }
    void reset() override { current_ = make_(); }

private:
    Maker const make_;
    IProvider::Listing current_;
};

} // namespace

MountedArchive::View WritableArchive::viewOf(PendingTree const& tree)
{
    return {tree.base(), &tree.index()};
}

MountedArchive::View WritableArchive::view() const
{
    std::unique_lock lock(*treeMutex_);
    if (tree_ != nullptr)
        return {tree_->base(), &tree_->index(), std::move(lock)};
    lock.unlock();
    return MountedArchive::view();
}

FileAttributes WritableArchive::fileAttributes(StorageIRI const& iri) const
{
    requireInside(iri);
    View const view = this->view();
    Index::Id const id = requireFile(view, iri);
    if (!view.lock.owns_lock())
        return detail::fileAttributes(view.index->at(id), view.archive->isWritable());
    return FileAttributes(tree_->size(id), toPtime(tree_->modified(id)), true);
}

ExtendedAttributes WritableArchive::extendedAttributes(StorageIRI const& iri) const
{
    requireInside(iri);
    View const view = this->view();
    Index::Id const id = require(view, iri);
    if (view.index->at(id).kind != EntryKind::File)
        return {};
    bool isRandom = false;
    if (!view.lock.owns_lock())
        isRandom = view.archive->isRandomAccess(id);
    else if (PendingNode const& node = tree_->node(id); node.draft != nullptr)
        isRandom = true;
    else
        isRandom = node.packed != nullptr ? node.packed->isStored() : view.archive->isRandomAccess(node.origin);
    return ExtendedAttributes({{accessAttribute, std::string(isRandom ? randomAccess : sequentialAccess)}});
}

IProvider::Listing WritableArchive::list(StorageIRI const& folder, Selection selection) const
{
    requireInside(folder);
    return std::make_unique<RenewedListing>([self = shared_from_this(), folder, selection = std::move(selection)] {
        return self->listNow(folder, selection);
    });
}

IProvider::Listing WritableArchive::listNow(StorageIRI const& folder, Selection const& selection) const
{
    {
        std::lock_guard const lock(*treeMutex_);
        if (tree_ != nullptr)
            return std::make_unique<PendingListing>(tree_, treeMutex_, requireFolder(viewOf(*tree_), folder),
                                                    selection);
    }
    return MountedArchive::list(folder, selection);
}

} // namespace foundation::storage::archive::detail
