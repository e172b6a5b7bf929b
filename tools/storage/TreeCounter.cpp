#include <tools/storage/TreeCounter.hpp>

#include <tools/storage/Failure.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/scratchName.hpp>

#include <exception>
#include <utility>

namespace foundation::storage::tool {

TreeCounter::TreeCounter(std::vector<Place> places, Progress& progress)
    : places_(std::move(places)), progress_(progress)
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
    FolderStack levels(Listing::WithAttributes);
    levels.enter(folder);
    while (!levels.empty() && !stop.stop_requested()) {
        try {
            countNext(levels);
        } catch (Failure const&) {
        }
    }
}

/// What a listing calls a folder may be a link to one.
void TreeCounter::countNext(FolderStack& levels)
{
    FolderLevel& level = levels.innermost();
    if (!level.hasNext())
        return levels.leave();
    ListedName const entry = level.next();
    if (entry.isFile && isScratchName(entry.name))
        return; // it is not copied either
    if (entry.isFile)
        return add(entry.size.value_or(0));
    Place child = level.folder().child(entry.name);
    if (kindOf(child) == Kind::RegularFolder)
        levels.enter(std::move(child));
}

void TreeCounter::add(std::uint64_t bytes)
{
    ++found_.files;
    found_.bytes += bytes;
    progress_.setFound(found_, false);
}

} // namespace foundation::storage::tool
