#include <storage/local/detail/EventLoop.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <csignal>
#include <cstdint>
#include <pthread.h>
#include <sys/eventfd.h>
#include <utility>

namespace foundation::storage::local::detail {

using What = FolderChange::What;

namespace {

/// For the second half of a move, which the kernel tells right after the first if it tells it at all.
constexpr int patienceInMilliseconds = 10;
constexpr int forEver = -1;

thread_local EventLoop const* loopOfThisThread = nullptr;

/// Signals are for the threads of the program, which may count on their waits to be interrupted.
class HeldSignals
{
public:
    HeldSignals()
    {
        sigset_t all;
        sigfillset(&all);
        pthread_sigmask(SIG_SETMASK, &all, &before_);
    }
    ~HeldSignals() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
    HeldSignals(HeldSignals const&) = delete;
    HeldSignals& operator=(HeldSignals const&) = delete;

private:
    sigset_t before_{};
};

FolderChange lossOfEverything()
{
    return {What::Lost, events::EntryType::Folder, {}};
}

} // namespace

int EventLoop::open()
{
    if (int const error = subscriptions_.open())
        return error;
    int const wakeUp = systemCalls().eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    int const error = wakeUp == -1 ? errno : 0;
    wakeUp_ = FileDescriptor(wakeUp);
    return error;
}

void EventLoop::start()
{
    HeldSignals const held;
    std::lock_guard const lock(threadMutex_);
    thread_ = std::thread([self = shared_from_this()] { self->run(); });
}

Subscriptions::Caller EventLoop::caller() const
{
    return loopOfThisThread == this ? Subscriptions::Caller::Teller : Subscriptions::Caller::Another;
}

void EventLoop::stop(std::string const& key)
{
    subscriptions_.stop(key, caller());
}

void EventLoop::stopAll()
{
    subscriptions_.stopAll(caller());
}

void EventLoop::joinIfIdle()
{
    if (caller() == Subscriptions::Caller::Another && subscriptions_.closeIfIdle())
        joinOrDetach();
}

void EventLoop::joinOrDetach()
{
    wake();
    std::lock_guard const lock(threadMutex_);
    if (!thread_.joinable())
        return;
    if (caller() == Subscriptions::Caller::Teller)
        thread_.detach();
    else
        thread_.join();
}

void EventLoop::wake()
{
    std::uint64_t const one = 1;
    std::lock_guard const lock(wakeUpMutex_);
    static_cast<void>(systemCalls().write(wakeUp_.get(), &one, sizeof one));
}

void EventLoop::run()
{
    loopOfThisThread = this;
    pthread_setname_np(pthread_self(), "storage events");
    while (!subscriptions_.closeIfIdle()) {
        try {
            for (FolderChange const& change : nextChanges())
                publish(change);
        } catch (...) { // such as no memory
            hasLost_ = true;
        }
    }
    close();
}

void EventLoop::close()
{
    subscriptions_.close();
    std::lock_guard const lock(wakeUpMutex_);
    static_cast<void>(wakeUp_.close());
}

std::vector<FolderChange> EventLoop::nextChanges()
{
    if (std::exchange(hasLost_, false))
        return {lossOfEverything()};
    std::vector<RawEvent> events;
    int error = subscriptions_.inotify().wait(wakeUp_, decoder_.holdsBack() ? patienceInMilliseconds : forEver);
    if (error == 0)
        error = subscriptions_.inotify().read(events);
    if (error == 0)
        return decoder_.decode(std::move(events));
    endAll();
    return {};
}

void EventLoop::publish(FolderChange const& change)
{
    for (auto const& [subscription, notice] : subscriptions_.noticesOf(change))
        subscriptions_.tell(subscription, notice);
    if (change.what == What::FolderGone || change.what == What::FolderMoved || change.what == What::Lost)
        endThoseCutOff(change);
}

/// After a loss the news that a folder is gone may be among what is missing.
void EventLoop::endThoseCutOff(FolderChange const& change)
{
    for (SubscriptionPtr const& each : subscriptions_.concernedBy(change)) {
        if (change.what == What::FolderGone || !subscriptions_.isUpToDate(each))
            end(each);
    }
}

/// The system tells nothing any more.
void EventLoop::endAll()
{
    for (SubscriptionPtr const& each : subscriptions_.concernedBy(lossOfEverything()))
        end(each);
}

void EventLoop::end(SubscriptionPtr const& subscription)
{
    if (auto const notice = subscription->noticeOfTheEnd())
        subscriptions_.tell(subscription, *notice);
    subscriptions_.drop(subscription);
}

} // namespace foundation::storage::local::detail
