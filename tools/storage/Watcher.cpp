#include <tools/storage/Watcher.hpp>

#include <storage/local/scratchFiles.hpp>
#include <tools/storage/FolderStack.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/entries.hpp>
#include <tools/storage/eventLines.hpp>
#include <tools/storage/format.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>

#include <algorithm>
#include <boost/date_time/microsec_time_clock.hpp>
#include <chrono>
#include <fl/i18n/utf8.hpp>
#include <utility>

namespace foundation::storage::tool {

using events::EntryType;
using provider::StorageIRI;
using EventKind = events::Kind;

namespace {

/// After such a pause no event is under way any more.
constexpr std::chrono::seconds quiet{1};

std::u16string keyOf(Place const& place)
{
    return place.item().getLocation().toString();
}

} // namespace

void Watcher::add(Place const& operand)
{
    bool const isFolder = leadsToFolder(existingKindOf(operand));
    if (!watches_.contains(keyOf(operand)))
        addAs(operand, isFolder);
}

void Watcher::addAs(Place const& operand, bool isFolder)
{
    subscribe(operand, isFolder, true);
    ++operandCount_;
    if (isFolder && options_.isRecursive)
        watchBelow(operand, Contents::Old);
}

void Watcher::run()
{
    while (!isDone()) {
        session_.output().flush();
        auto const begin = std::chrono::steady_clock::now();
        EventQueue::Batch const batch = queue_.wait();
        if (std::chrono::steady_clock::now() - begin > quiet)
            found_.clear();
        for (StoreEvent const& event : batch.events) {
            checkInterrupt();
            if (isDone())
                return;
            session_.attempt([&] { handle(event); });
        }
        if (batch.hasLost)
            startAgain();
    }
}

bool Watcher::isDone() const
{
    return operandCount_ == 0 || (options_.count && printedCount_ >= *options_.count);
}

void Watcher::subscribe(Place const& place, bool isFolder, bool isOperand)
{
    std::size_t const id = nextId_++;
    at(place, [&] {
        if (isFolder)
            place.item().publishFolderEvents(queue_.callback(id), kindsToAskFor());
        else
            place.item().publishFileEvents(queue_.callback(id), kindsToAskFor());
    });
    locations_.emplace(id, keyOf(place));
    watches_.emplace(keyOf(place), Watch{id, place, isFolder, isOperand});
}

/// One that is watched already may be another by now. Answers whether it is watched.
bool Watcher::subscribeBelow(Place const& folder)
{
    auto const old = watches_.find(keyOf(folder));
    if (old != watches_.end() && old->second.isOperand)
        return true;
    if (old != watches_.end())
        unsubscribe(old);
    attemptUnlessGone(folder, [&] { subscribe(folder, true, false); });
    return watches_.contains(keyOf(folder));
}

/// What has gone meanwhile is no failure.
template <typename Action>
void Watcher::attemptUnlessGone(Place const& place, Action const& action)
{
    session_.attempt([&] {
        try {
            action();
        } catch (Failure const&) {
            if (kindOf(place) != Kind::None)
                throw;
        }
    });
}

Watcher::Watches::iterator Watcher::unsubscribe(Watches::iterator watch)
{
    at(watch->second.place, [&] { watch->second.place.item().stopPublishingFolderEvents(); });
    locations_.erase(watch->second.id);
    return watches_.erase(watch);
}

/// Operands go on until their own end.
void Watcher::unsubscribeTree(StorageIRI const& folder)
{
    std::u16string const top = folder.toString();
    auto const watch = watches_.find(top);
    if (watch != watches_.end() && !watch->second.isOperand)
        unsubscribe(watch);
    std::u16string const below = top + u'/';
    for (auto each = watches_.lower_bound(below); each != watches_.end() && each->first.starts_with(below);)
        each = each->second.isOperand ? std::next(each) : unsubscribe(each);
}

void Watcher::watchTree(Place const& folder, Contents contents)
{
    if (subscribeBelow(folder))
        watchBelow(folder, contents);
}

void Watcher::watchBelow(Place const& folder, Contents contents)
{
    std::vector<Place> pending{folder};
    while (!pending.empty()) {
        Place const place = pending.back();
        pending.pop_back();
        for (Place const& below : foldersIn(place, contents)) {
            if (subscribeBelow(below))
                pending.push_back(below);
        }
    }
}

/// Without links to folders.
std::vector<Place> Watcher::foldersIn(Place const& folder, Contents contents)
{
    std::vector<Place> folders;
    attemptUnlessGone(folder, [&] {
        FolderLevel level(folder, std::nullopt, Listing::NamesOnly);
        while (level.hasNext()) {
            checkInterrupt();
            ListedName const listed = level.next();
            Place const place = folder.child(listed.name);
            bool const isFolder = !listed.isFile && kindOf(place, listed) == Kind::RegularFolder;
            if (isFolder)
                folders.push_back(place);
            if (contents == Contents::New && !isHidden(place.item().getLocation())) {
                found_.insert(keyOf(place));
                print(EventKind::Created, place, std::nullopt, isFolder ? EntryType::Folder : EntryType::File);
            }
        }
    });
    return folders;
}

void Watcher::handle(StoreEvent const& event)
{
    auto const location = locations_.find(event.subscription);
    if (location == locations_.end())
        return; // told before its end
    Watch const watch = watches_.at(location->second);
    StorageIRI const& own = watch.place.item().getLocation();
    if (event.isLoss)
        return startAgain();
    if (event.kind == EventKind::Removed && event.type == EntryType::Folder &&
        (event.location == own) == watch.isFolder)
        return handleEnd(watch, event);
    bool const isToldByParent = !watch.isOperand && event.location == own;
    if (isToldByParent || isRepeated(event) || wasFound(event))
        return;
    report(watch, event);
    if (options_.isRecursive && watch.isFolder && event.type == EntryType::Folder)
        follow(watch, event);
}

/// What two subscriptions are told of one change comes one after the other.
bool Watcher::isRepeated(StoreEvent const& event)
{
    bool const isSame = latest_ && latest_->subscription != event.subscription && latest_->kind == event.kind &&
                        latest_->location == event.location && latest_->second == event.second;
    if (!isSame)
        latest_ = event;
    return isSame;
}

/// What was found is no news when it is told, once.
bool Watcher::wasFound(StoreEvent const& event)
{
    bool const isKnown = found_.erase(event.location.toString()) != 0;
    return isKnown && event.kind == EventKind::Created;
}

/// What is watched by now may be other folders than are there.
void Watcher::startAgain()
{
    Watches const before = std::exchange(watches_, {});
    locations_.clear();
    found_.clear();
    operandCount_ = 0;
    for (auto const& [location, watch] : before) {
        if (watch.isFolder)
            watch.place.item().stopPublishingFolderEvents();
        else
            watch.place.item().stopPublishingFileEvents();
    }
    for (auto const& each : before) {
        Watch const& watch = each.second;
        if (!watch.isOperand)
            continue;
        session_.complain({watch.place.text(), "changes were missed, because too many came at once"});
        session_.attempt([&] { addAs(watch.place, watch.isFolder); });
    }
}

/// The place of a folder below may have been taken by another meanwhile.
void Watcher::handleEnd(Watch const& watch, StoreEvent const& event)
{
    locations_.erase(watch.id);
    watches_.erase(keyOf(watch.place));
    if (!watch.isOperand) {
        watchTree(watch.place, Contents::Old);
        return;
    }
    if (watch.isFolder && !isRepeated(event))
        report(watch, event);
    --operandCount_;
    session_.complain({watch.place.text(), "no longer watched, because the folder has gone"});
}

void Watcher::follow(Watch const& watch, StoreEvent const& event)
{
    if (event.kind == EventKind::Created)
        return watchTree(placeOf(watch, event.location), Contents::New);
    if (event.kind != EventKind::Removed && event.kind != EventKind::Moved)
        return;
    unsubscribeTree(event.location);
    if (event.kind == EventKind::Moved && isWatched(event.second.getParent()))
        watchTree(placeOf(watch, event.second), isWatched(event.location.getParent()) ? Contents::Old : Contents::New);
}

bool Watcher::isWatched(StorageIRI const& folder) const
{
    auto const watch = watches_.find(folder.toString());
    return watch != watches_.end() && watch->second.isFolder;
}

Place Watcher::placeOf(Watch const& watch, StorageIRI const& location) const
{
    StorageIRI const& own = watch.place.item().getLocation();
    if (location == own)
        return watch.place;
    StorageIRI const folder = location.getParent();
    if (watch.isFolder && folder == own)
        return watch.place.child(location.getName());
    auto const other = watches_.find(folder.toString());
    if (other != watches_.end())
        return other->second.place.child(location.getName());
    return session_.stores().open(fl::i18n::to_utf8(location.toString(), fl::i18n::Malformed::Replace));
}

/// Of a move the end that is hidden is left out: what takes its name when it is whole is created, though it may replace
/// another.
void Watcher::report(Watch const& watch, StoreEvent event)
{
    if (event.kind == EventKind::Moved && isHidden(event.location)) {
        event.kind = EventKind::Created;
        event.location = event.second;
    } else if (event.kind == EventKind::Moved && isHidden(event.second)) {
        event.kind = EventKind::Removed;
    }
    if (isHidden(event.location))
        return;
    std::optional<Place> target;
    if (event.kind == EventKind::Moved)
        target = placeOf(watch, event.second);
    print(event.kind, placeOf(watch, event.location), std::move(target), event.type);
}

void Watcher::print(EventKind kind, Place const& place, std::optional<Place> target, EntryType type)
{
    if (!isWanted(kind) || isDone())
        return;
    ++printedCount_;
    EventLine line{kind, place, std::move(target), type, {}};
    if (options_.tellsTime)
        line.time = formatTime(boost::posix_time::microsec_clock::universal_time(), Precision::Microseconds);
    if (options_.isJSON)
        session_.printJSON(toJSON(line));
    else
        session_.printName(toText(line));
}

bool Watcher::isWanted(EventKind kind) const
{
    std::vector<std::string> const& kinds = options_.kinds;
    return kinds.empty() || std::find(kinds.begin(), kinds.end(), wordOf(kind)) != kinds.end();
}

bool Watcher::isHidden(StorageIRI const& location) const
{
    return !options_.isAll && local::isScratchName(location.getName());
}

/// What changes folders is always needed, to follow them and to tell of what was hidden before.
provider::IProvider::EventKinds Watcher::kindsToAskFor() const
{
    provider::IProvider::EventKinds kinds{EventKind::Created, EventKind::Removed, EventKind::Moved};
    for (EventKind const kind : {EventKind::Modified, EventKind::AttributesChanged}) {
        if (isWanted(kind))
            kinds.push_back(kind);
    }
    return kinds;
}

} // namespace foundation::storage::tool
