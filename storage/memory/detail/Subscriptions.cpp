#include <storage/memory/detail/Subscriptions.hpp>

#include <storage/memory/detail/paths.hpp>

#include <algorithm>
#include <utility>

namespace foundation::storage::memory::detail {

using events::Kind;

struct Subscriptions::Subscription
{
    Subscription(std::u16string entry, Scope extent, provider::ChangeEventCallback call, std::vector<Kind> wanted)
        : path(std::move(entry)), scope(extent), callback(std::move(call)), kinds(std::move(wanted))
    {}

    std::u16string path;
    Scope scope;
    provider::ChangeEventCallback callback;
    std::vector<Kind> kinds;
    std::atomic<bool> active = true;

    bool isAbout(std::u16string_view entry) const
    {
        return entry == path || (scope == Scope::FolderAndEntries && parentPath(entry) == path);
    }

    /// A folder that goes away takes along what lies below it.
    bool isConcernedBy(Change const& change) const
    {
        if (std::find(kinds.begin(), kinds.end(), change.kind) == kinds.end())
            return false;
        bool const goesAway = change.kind == Kind::Removed || change.kind == Kind::Moved;
        return isAbout(change.path) || isAbout(change.movedTo) || (goesAway && isBelow(path, change.path));
    }

    bool isStoppedWith(std::u16string_view folder) const
    {
        return path == folder || (scope == Scope::Entry && parentPath(path) == folder);
    }
};

void Subscriptions::add(std::u16string path, Scope scope, provider::ChangeEventCallback callback,
                        std::vector<Kind> kinds)
{
    auto added = std::make_shared<Subscription>(std::move(path), scope, std::move(callback), std::move(kinds));
    std::lock_guard const lock(mutex_);
    subscriptions_.push_back(std::move(added));
    count_ = subscriptions_.size();
}

void Subscriptions::stop(std::u16string_view folder)
{
    std::vector<SubscriptionPtr> stopped; // outlives the lock: what a callback holds may come back when it goes
    std::lock_guard const lock(mutex_);
    auto const first = std::stable_partition(subscriptions_.begin(), subscriptions_.end(),
                                             [&](auto const& each) { return !each->isStoppedWith(folder); });
    stopped.assign(first, subscriptions_.end());
    subscriptions_.erase(first, subscriptions_.end());
    for (SubscriptionPtr const& each : stopped)
        each->active = false;
    count_ = subscriptions_.size();
}

void Subscriptions::stopAll()
{
    std::vector<SubscriptionPtr> stopped;
    std::lock_guard const lock(mutex_);
    stopped.swap(subscriptions_);
    for (SubscriptionPtr const& each : stopped)
        each->active = false;
    count_ = 0;
}

std::vector<Subscriptions::SubscriptionPtr> Subscriptions::concernedBy(Change const& change)
{
    std::vector<SubscriptionPtr> concerned;
    std::lock_guard const lock(mutex_);
    std::copy_if(subscriptions_.begin(), subscriptions_.end(), std::back_inserter(concerned),
                 [&](auto const& each) { return each->isConcernedBy(change); });
    return concerned;
}

void Subscriptions::publish(Change const& change, provider::StorageIRI const& root)
{
    std::vector<SubscriptionPtr> const concerned = concernedBy(change);
    if (concerned.empty())
        return;
    provider::StorageIRI const first(root, change.path);
    provider::StorageIRI const second(root, change.movedTo);
    for (SubscriptionPtr const& each : concerned) {
        try {
            if (each->active)
                each->callback(change.kind, first, second, change.type, {});
        } catch (...) {
            // The change is made, and the others want to know about it.
        }
    }
}

} // namespace foundation::storage::memory::detail
