#include <storage/conformance/detail/EventLog.hpp>

#include <algorithm>
#include <chrono>

namespace foundation::storage::conformance::detail {

using provider::StorageIRI;

namespace {

/// Long enough for a busy machine; a check that succeeds never waits so long.
constexpr std::chrono::seconds patience(10);

} // namespace

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
    return arrival_.wait_for(lock, patience, [&] {
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
