#pragma once

#include <storage/conformance/Harness.hpp>
#include <storage/provider/IProvider.hpp>

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <vector>

namespace foundation::storage::conformance::detail {

struct Event
{
    events::Kind kind;
    provider::StorageIRI location;
    provider::StorageIRI second;
    events::EntryType type;
};

/// Collects the events of a store, which may come in any thread and at any time.
///
/// Has to outlive the subscriptions to which its callback was given.
class EventLog
{
public:
    explicit EventLog(Harness const& harness);

    provider::ChangeEventCallback callback();

    /// Waits until an event of this kind at this location has come; answers false when that takes too long.
    bool waitFor(events::Kind kind, provider::StorageIRI const& location);

    /// What has come so far.
    std::vector<Event> events() const;

private:
    std::chrono::milliseconds const patience_;
    mutable std::mutex mutex_;
    std::condition_variable arrival_;
    std::vector<Event> events_;
};

} // namespace foundation::storage::conformance::detail
