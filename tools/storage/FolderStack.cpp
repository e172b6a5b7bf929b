#include <tools/storage/FolderStack.hpp>

#include <tools/storage/describe.hpp>

#include <algorithm>
#include <utility>

namespace foundation::storage::tool {

namespace {

constexpr std::ptrdiff_t maximumOpenListings = 100;

} // namespace

ListedName listedNameOf(provider::FolderEntry const& entry)
{
    ListedName listed{entry.getName(), entry.isFile()};
    if (auto const& file = entry.getFileAttributes()) {
        listed.size = file->getSize();
        listed.modified = file->getLastModified();
    } else if (auto const& folder = entry.getFolderAttributes()) {
        listed.modified = folder->getLastModified();
    }
    return listed;
}

FolderLevel::FolderLevel(Place folder, std::optional<Place> counterpart, Listing kind)
    : folder_(std::move(folder)), counterpart_(std::move(counterpart)), kind_(kind), listing_(list())
{}

std::unique_ptr<provider::IFolderEntryIterator> FolderLevel::list() const
{
    return at(folder_, [&] {
        return kind_ == Listing::NamesOnly ? folder_.item().listAllNamesOnly() : folder_.item().listAll();
    });
}

bool FolderLevel::hasNext()
{
    if (!rest_.empty())
        return true;
    advance();
    return listing_ != nullptr && listing_->hasEntry();
}

ListedName FolderLevel::next()
{
    if (!rest_.empty()) {
        ListedName entry = std::move(rest_.front());
        rest_.pop_front();
        return entry;
    }
    isEntryTaken_ = true;
    return listedNameOf(listing_->entry());
}

/// A listing that fails is through: the walk goes on elsewhere.
void FolderLevel::advance()
{
    if (failure_)
        throw *std::exchange(failure_, std::nullopt);
    if (!std::exchange(isEntryTaken_, false))
        return;
    try {
        at(folder_, [&] { listing_->next(); });
    } catch (...) {
        close();
        hasFailed = true;
        throw;
    }
}

void FolderLevel::release()
{
    std::deque<ListedName> rest;
    try {
        while (hasNext())
            rest.push_back(next());
    } catch (Failure const& failure) {
        failure_ = failure;
    }
    close();
    rest_ = std::move(rest);
}

void FolderLevel::restart()
{
    close();
    hasChanged = false;
    listing_ = list();
}

void FolderLevel::close() noexcept
{
    listing_.reset();
    isEntryTaken_ = false;
}

void FolderStack::enter(Place folder, std::optional<Place> counterpart)
{
    auto const isOpen = [](FolderLevel const& level) { return level.holdsListing(); };
    if (std::count_if(levels_.begin(), levels_.end(), isOpen) >= maximumOpenListings)
        std::find_if(levels_.begin(), levels_.end(), isOpen)->release();
    levels_.emplace_back(std::move(folder), std::move(counterpart), kind_);
}

} // namespace foundation::storage::tool
