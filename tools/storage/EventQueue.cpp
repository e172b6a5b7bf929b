#include <tools/storage/EventQueue.hpp>

#include <tools/storage/Output.hpp>
#include <tools/storage/interrupt.hpp>

#include <cerrno>
#include <cstdint>
#include <mutex>
#include <sys/eventfd.h>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace foundation::storage::tool {

namespace {

constexpr std::size_t capacity = 30'000;

} // namespace

/// What callbacks and the queue have in common.
struct EventQueue::Shared
{
    Shared() : wakeUp(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK))
    {
        if (wakeUp == -1)
            throw std::system_error(errno, std::generic_category(), "waiting for events");
    }

    ~Shared() { ::close(wakeUp); }

    void push(StoreEvent event)
    {
        std::lock_guard const lock(mutex);
        if (batch.events.size() < capacity)
            batch.events.push_back(std::move(event));
        else
            batch.hasLost = true;
        std::uint64_t const one = 1;
        static_cast<void>(::write(wakeUp, &one, sizeof one));
    }

    Batch take()
    {
        std::uint64_t count = 0;
        std::lock_guard const lock(mutex);
        static_cast<void>(::read(wakeUp, &count, sizeof count));
        return std::exchange(batch, Batch{});
    }

    int const wakeUp;
    std::mutex mutex;
    Batch batch{};
};

EventQueue::EventQueue() : shared_(std::make_shared<Shared>()) {}

provider::ChangeEventCallback EventQueue::callback(std::size_t subscription) const
{
    return [shared = shared_, subscription](events::Kind const& kind, provider::StorageIRI const& location,
                                            provider::StorageIRI const& second, events::EntryType const& type,
                                            boost::property_tree::ptree const& details) {
        shared->push({subscription, kind, location, second, type, details.get("overflow", false)});
    };
}

EventQueue::Batch EventQueue::wait()
{
    if (!waitForInputWhileRead(shared_->wakeUp, STDOUT_FILENO))
        throw OutputFailure{EPIPE};
    return shared_->take();
}

} // namespace foundation::storage::tool
