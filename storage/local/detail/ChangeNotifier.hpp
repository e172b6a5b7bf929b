#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/Subscription.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <memory>
#include <mutex>
#include <string>

namespace foundation::storage::local::detail {

class EventLoop;

/// Tells of changes in folders, by one queue of the kernel and one thread for all that it watches.
///
/// Threads: any number at once. Callbacks run in the thread of the notifier, with nothing locked: they may come back
/// here, and may destroy the notifier. Where `stop` and `stopAll` are not called from a callback, none that they stop
/// runs after they have answered: they wait for one that does.
/// Cost: no thread and no descriptor while nothing is subscribed; otherwise one thread, two descriptors, and one watch
/// of the kernel for each folder.
class FOUNDATION_API ChangeNotifier
{
public:
    ChangeNotifier() = default;

    /// Stops all, and waits for the thread; inside a callback, the thread ends after that.
    ~ChangeNotifier();

    ChangeNotifier(ChangeNotifier const&) = delete;
    ChangeNotifier& operator=(ChangeNotifier const&) = delete;

    /// Throws `ChangeEventsSubscriptionException` naming the subject where there is no callback or no such folder, the
    /// user may not read the folder, or the system is out of watches, descriptors or threads.
    void subscribe(Interest interest);

    /// Ends all that was asked for about the folder with this path (in any spelling that `folderKey` makes one), and
    /// about single entries that lie directly in it.
    void stop(std::string const& path);
    void stopAll();

private:
    int serve(std::shared_ptr<Subscription> const& subscription);
    std::shared_ptr<EventLoop> loop() const;

    mutable std::mutex mutex_;
    std::shared_ptr<EventLoop> loop_;
};

} // namespace foundation::storage::local::detail
