#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/Inotify.hpp>
#include <storage/local/detail/Subscription.hpp>

#include <condition_variable>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace foundation::storage::local::detail {

using SubscriptionPtr = std::shared_ptr<Subscription>;

/// Who is served by one queue of the kernel, and the watches that this takes: one for each folder, however many
/// subscriptions share it, under whatever paths.
///
/// Threads: any number, of which one tells.
class FOUNDATION_API Subscriptions
{
public:
    using Notices = std::vector<std::pair<SubscriptionPtr, Notice>>;

    enum class Caller
    {
        Teller,  ///< the thread that tells, which is inside a callback
        Another, ///< waits for callbacks that run
    };

    /// Answers 0 or `errno`.
    [[nodiscard]] int open() { return inotify_.open(); }

    /// Gives up the queue. Only after `closeIfIdle`.
    void close() { inotify_.close(); }

    Inotify& inotify() { return inotify_; }

    /// Serves a subscription whose path leads to `folder`. Answers 0 or `errno`; nothing after `closeIfIdle`.
    std::optional<int> add(SubscriptionPtr const& subscription, FileDescriptor const& folder);

    /// Ends those of a folder, or all. When it has answered none of their callbacks runs, but the one that calls this.
    void stop(std::string const& key, Caller caller);
    void stopAll(Caller caller);

    /// What to tell whom of a change, in the order of the subscriptions.
    Notices noticesOf(FolderChange change);

    /// Those whose folder itself a change is about, which may have cut them off.
    std::vector<SubscriptionPtr> concernedBy(FolderChange const& change);

    /// Whether the path of a subscription leads to the folder that it watches.
    bool isUpToDate(SubscriptionPtr const& subscription);

    /// Ends one that has no folder any more.
    void drop(SubscriptionPtr const& subscription);

    /// Calls the callback, unless the subscription was stopped. What it throws is dropped: the change is made, and
    /// others want to know of it.
    void tell(SubscriptionPtr const& subscription, Notice const& notice);

    /// When nobody is served and no callback runs, takes no more subscriptions. Answers whether it is so.
    bool closeIfIdle();

private:
    using Members = std::vector<SubscriptionPtr>;

    template <typename Find, typename Condition>
    void stopThose(Find const& find, Caller caller, Condition const& isMeant);
    void remove(Subscription& subscription);
    Members all() const;
    Members watching(int watch) const;
    bool begin(SubscriptionPtr const& subscription);
    void end();

    Inotify inotify_;
    std::mutex mutex_;
    std::condition_variable idle_;
    std::unordered_map<int, Members> byWatch_;
    std::unordered_map<std::string, Members> byKey_;
    SubscriptionPtr running_;
    bool isClosed_ = false;
};

} // namespace foundation::storage::local::detail
