#include <storage/local/detail/Subscriptions.hpp>

#include <storage/local/detail/errorCode.hpp>

#include <algorithm>

namespace foundation::storage::local::detail {

using What = FolderChange::What;

namespace {

/// Whether a failure says nothing about the folder, but that something is used up for the moment.
bool meansLater(int error)
{
    return toErrorCode(error) == provider::ErrorCode::ResourceInUse;
}

/// Answers whether it was the last of its group, which is then gone.
template <typename Groups>
bool takeOut(Groups& groups, typename Groups::key_type const& key, Subscription const& subscription)
{
    auto const group = groups.find(key);
    if (group == groups.end())
        return false;
    std::erase_if(group->second, [&](SubscriptionPtr const& each) { return each.get() == &subscription; });
    if (!group->second.empty())
        return false;
    groups.erase(group);
    return true;
}

} // namespace

std::optional<int> Subscriptions::add(SubscriptionPtr const& subscription, FileDescriptor const& folder)
{
    std::lock_guard const lock(mutex_);
    if (isClosed_)
        return std::nullopt;
    if (int const error = inotify_.add(folder, subscription->mask(), subscription->watch))
        return error;
    byWatch_[subscription->watch].push_back(subscription);
    byKey_[subscription->key()].push_back(subscription);
    return 0;
}

void Subscriptions::stop(std::string const& key, Caller caller)
{
    stopThose([&] { return byKey_.contains(key) ? byKey_[key] : Members(); }, caller,
              [&](Subscription const& each) { return each.key() == key; });
}

void Subscriptions::stopAll(Caller caller)
{
    stopThose([&] { return all(); }, caller, [](Subscription const& /*each*/) { return true; });
}

/// Callbacks are destroyed without the lock, for what they hold may come back here when it goes.
template <typename Find, typename Condition>
void Subscriptions::stopThose(Find const& find, Caller caller, Condition const& isMeant)
{
    Members stopped;
    {
        std::unique_lock lock(mutex_);
        stopped = find();
        for (SubscriptionPtr const& each : stopped)
            remove(*each);
        auto const isRunning = [&] { return running_ && !running_->isActive && isMeant(*running_); };
        if (caller == Caller::Another)
            idle_.wait(lock, [&] { return !isRunning(); });
        else if (running_)
            std::erase(stopped, running_); // which `end` destroys
    }
    for (SubscriptionPtr const& each : stopped)
        each->forget();
}

void Subscriptions::remove(Subscription& subscription)
{
    subscription.isActive = false;
    takeOut(byKey_, subscription.key(), subscription);
    if (takeOut(byWatch_, subscription.watch, subscription))
        inotify_.remove(subscription.watch);
}

Subscriptions::Members Subscriptions::all() const
{
    Members members;
    for (auto const& [watch, watching] : byWatch_)
        members.insert(members.end(), watching.begin(), watching.end());
    return members;
}

Subscriptions::Members Subscriptions::watching(int watch) const
{
    auto const found = byWatch_.find(watch);
    return found == byWatch_.end() ? Members() : found->second;
}

Subscriptions::Members Subscriptions::concernedBy(FolderChange const& change)
{
    std::lock_guard const lock(mutex_);
    return change.what == What::Lost ? all() : watching(change.entry.watch);
}

Subscriptions::Notices Subscriptions::noticesOf(FolderChange change)
{
    Notices notices;
    std::lock_guard const lock(mutex_);
    auto const add = [&](Members const& members, Members const& others) {
        for (SubscriptionPtr const& each : members) {
            if (std::optional<Notice> notice = each->noticeOf(change, others.front()->folder()))
                notices.emplace_back(each, std::move(*notice));
        }
    };
    Members const here = change.what == What::Lost ? all() : watching(change.entry.watch);
    bool const isCrossing = change.what == What::Moved && change.target.watch != change.entry.watch;
    Members const there = isCrossing ? watching(change.target.watch) : Members();
    if (isCrossing && there.empty())
        change.what = What::Removed;
    if (isCrossing && here.empty())
        change = {What::Arrived, change.type, change.target};
    add(here, there.empty() ? here : there);
    add(there, here.empty() ? there : here);
    return notices;
}

bool Subscriptions::isUpToDate(SubscriptionPtr const& subscription)
{
    FileDescriptor folder;
    if (int const error = subscription->openFolder(folder))
        return meansLater(error);
    std::lock_guard const lock(mutex_);
    if (!subscription->isActive)
        return true;
    int watch = -1;
    if (int const error = inotify_.add(folder, subscription->mask(), watch))
        return meansLater(error);
    if (!byWatch_.contains(watch))
        inotify_.remove(watch);
    return watch == subscription->watch;
}

void Subscriptions::drop(SubscriptionPtr const& subscription)
{
    {
        std::lock_guard const lock(mutex_);
        if (!subscription->isActive)
            return;
        remove(*subscription);
        running_ = subscription;
    }
    end();
}

void Subscriptions::tell(SubscriptionPtr const& subscription, Notice const& notice)
{
    if (!begin(subscription))
        return;
    try {
        subscription->tell(notice);
    } catch (...) {
    }
    end();
}

bool Subscriptions::begin(SubscriptionPtr const& subscription)
{
    std::lock_guard const lock(mutex_);
    if (subscription->isActive)
        running_ = subscription;
    return subscription->isActive;
}

/// A callback that was stopped meanwhile goes while it still counts as running, since what it holds may do anything.
void Subscriptions::end()
{
    std::unique_lock lock(mutex_);
    if (!running_->isActive) {
        Subscription& stopped = *running_;
        lock.unlock();
        stopped.forget();
        lock.lock();
    }
    running_.reset();
    idle_.notify_all();
}

bool Subscriptions::closeIfIdle()
{
    std::lock_guard const lock(mutex_);
    isClosed_ = byKey_.empty() && !running_;
    return isClosed_;
}

} // namespace foundation::storage::local::detail
