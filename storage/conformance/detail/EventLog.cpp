#include <storage/conformance/detail/EventLog.hpp>

#include <algorithm>

namespace foundation::storage::conformance::detail {

using provider::StorageIRI;

EventLog::EventLog(Harness const& harness) : patience_(harness.capabilities.longestEventDelay) {}

provider::ChangeEventCallback EventLog::callback()
{
    return [this](events::Kind const& kind, StorageIRI const& location, StorageIRI const& second,
                  events::EntryType const& type, boost::property_tree::ptree const&) {
        std::lock_guard const lock(mutex_);
        events_.push_back({kind, location, second, type});
        arrival_.notify_all();
    };
}

bool EventLog::waitFor(events::Kind kind, StorageIRI const& location)
{
    std::unique_lock lock(mutex_);
    return arrival_.wait_for(lock, patience_, [&] {
        return std::any_of(events_.begin(), events_.end(),
                           [&](Event const& event) { return event.kind == kind && event.location == location; });
    });
}

std::vector<Event> EventLog::events() const
{
    std::lock_guard const lock(mutex_);
    return events_;
}

} // namespace foundation::storage::conformance::detail
