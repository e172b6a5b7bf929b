#include <tools/storage/TreeCounter.hpp>

#include <storage/local/scratchFiles.hpp>
#include <tools/storage/Failure.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>

#include <exception>
#include <utility>

namespace foundation::storage::tool {

TreeCounter::TreeCounter(Stores const& stores, std::vector<Place> places, Progress& progress)
    : stores_(stores), places_(std::move(places)), progress_(progress)
{
    HeldInterrupts const held;
    thread_ = std::jthread([this](std::stop_token const& stop) { count(stop); });
}

/// Counting is decoration: what fails is left out.
void TreeCounter::count(std::stop_token const& stop)
{
    try {
        for (Place const& place : places_)
            countPlace(place, stop);
        progress_.setFound(found_, !stop.stop_requested());
    } catch (std::exception const&) {
    }
}

void TreeCounter::countPlace(Place const& place, std::stop_token const& stop)
{
    try {
        Kind const kind = kindOf(place);
        if (leadsToFile(kind))
            add(at(place, [&] { return place.item().getFileAttributes().getSize(); }));
        else if (kind == Kind::RegularFolder)
            countBelow(place, stop);
    } catch (Failure const&) {
    }
}

void TreeCounter::countBelow(Place const& folder, std::stop_token const& stop)
{
    std::unique_ptr<TreeCursor> const tree = openTree(stores_, folder, Listing::WithAttributes);
    for (bool isThrough = false; !isThrough && !stop.stop_requested();) {
        try {
            isThrough = countNext(*tree);
        } catch (Failure const&) {
        }
    }
}

/// Answers whether the walk is at its end.
bool TreeCounter::countNext(TreeCursor& tree)
{
    std::optional<ListedName> const entry = tree.next();
    if (!entry && tree.depth() == 0)
        return true;
    if (!entry)
        tree.leave();
    else if (entry->isFile && local::isScratchName(entry->name))
        return false; // it is not copied either
    else if (entry->isFile)
        add(entry->size.value_or(0));
    else if (tree.kindOf(*entry) == Kind::RegularFolder)
        tree.enter(*entry);
    return false;
}

void TreeCounter::add(std::uint64_t bytes)
{
    ++found_.files;
    found_.bytes += bytes;
    progress_.setFound(found_, false);
}

} // namespace foundation::storage::tool
