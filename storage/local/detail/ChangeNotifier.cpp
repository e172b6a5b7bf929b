#include <storage/local/detail/ChangeNotifier.hpp>

#include <storage/local/detail/EventLoop.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>

#include <system_error>
#include <utility>

namespace foundation::storage::local::detail {

ChangeNotifier::~ChangeNotifier()
{
    if (!loop_)
        return;
    loop_->stopAll();
    loop_->joinOrDetach();
}

void ChangeNotifier::subscribe(Interest interest)
{
    provider::StorageIRI const subject = interest.subject;
    if (!interest.callback)
        throw provider::ChangeEventsSubscriptionException(subject);
    if (serve(std::make_shared<Subscription>(std::move(interest))) != 0)
        throw provider::ChangeEventsSubscriptionException(subject);
}

/// A thread that has ended cannot be had back: whoever comes too late for it makes the next one.
int ChangeNotifier::serve(std::shared_ptr<Subscription> const& subscription)
{
    FileDescriptor folder;
    if (int const error = subscription->openFolder(folder))
        return error;
    std::lock_guard const lock(mutex_);
    if (loop_) {
        if (std::optional<int> const error = loop_->add(subscription, folder))
            return *error;
        loop_->joinIfIdle();
    }
    auto const loop = std::make_shared<EventLoop>();
    if (int const error = loop->open())
        return error;
    if (int const error = loop->add(subscription, folder).value())
        return error;
    try {
        loop->start();
    } catch (std::system_error const& error) {
        return error.code().value();
    }
    loop_ = loop;
    return 0;
}

void ChangeNotifier::stop(std::string const& path)
{
    if (std::shared_ptr<EventLoop> const loop = this->loop()) {
        loop->stop(folderKey(path));
        loop->joinIfIdle();
    }
}

void ChangeNotifier::stopAll()
{
    if (std::shared_ptr<EventLoop> const loop = this->loop()) {
        loop->stopAll();
        loop->joinIfIdle();
    }
}

std::shared_ptr<EventLoop> ChangeNotifier::loop() const
{
    std::lock_guard const lock(mutex_);
    return loop_;
}

} // namespace foundation::storage::local::detail
