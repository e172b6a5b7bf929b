#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/ChangeDecoder.hpp>
#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Subscriptions.hpp>

#include <memory>
#include <mutex>
#include <thread>

namespace foundation::storage::local::detail {

/// A thread that tells subscriptions of changes, by one queue of the kernel. It ends with the last subscription.
///
/// Threads: any number. Kept alive by its thread, so that a callback may let go of everything else.
class FOUNDATION_API EventLoop : public std::enable_shared_from_this<EventLoop>
{
public:
    /// Answers 0 or `errno`.
    [[nodiscard]] int open();

    /// Starts the thread, which holds back all signals. Throws `std::system_error` when there can be no more threads.
    void start();

    /// As `Subscriptions::add`.
    std::optional<int> add(SubscriptionPtr const& subscription, FileDescriptor const& folder)
    {
        return subscriptions_.add(subscription, folder);
    }

    void stop(std::string const& key);
    void stopAll();

    /// Waits for the end of a thread that has nobody to serve, and serves nobody from then on. Does nothing where
    /// somebody is served, and in the thread itself, which ends after the callback.
    void joinIfIdle();

    /// The same once all are stopped, but for that it lets go of the thread when it is called there.
    void joinOrDetach();

private:
    Subscriptions::Caller caller() const;
    void wake();
    void run();
    void close();
    std::vector<FolderChange> nextChanges();
    void publish(FolderChange const& change);
    void endThoseCutOff(FolderChange const& change);
    void endAll();
    void end(SubscriptionPtr const& subscription);

    Subscriptions subscriptions_;
    std::mutex wakeUpMutex_;
    FileDescriptor wakeUp_;
    ChangeDecoder decoder_;
    bool hasLost_ = false;
    std::mutex threadMutex_;
    std::thread thread_;
};

} // namespace foundation::storage::local::detail
