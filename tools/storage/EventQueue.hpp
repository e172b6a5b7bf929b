#pragma once

#include <storage/provider/IProvider.hpp>

#include <cstddef>
#include <deque>
#include <memory>

namespace foundation::storage::tool {

/// What a store told, and to which subscription.
struct StoreEvent
{
    std::size_t subscription;
    events::Kind kind;
    provider::StorageIRI location;
    provider::StorageIRI second;
    events::EntryType type;
    bool isLoss; ///< the store tells of no change, but that events are missing
};

/// Brings events from the threads of stores to the main thread.
///
/// Bounded, and never has a store wait: the main thread may be waiting for that store. What does not fit is lost.
/// Threads: callbacks any number; all else one.
class EventQueue
{
public:
    struct Batch
    {
        std::deque<StoreEvent> events;
        bool hasLost; ///< others came after these
    };

    EventQueue();

    /// Collects events. May outlive this object.
    provider::ChangeEventCallback callback(std::size_t subscription) const;

    /// Waits for events, and takes them. Throws `Interrupted`, and `OutputFailure` when nobody is left who reads
    /// standard output.
    Batch wait();

private:
    struct Shared;

    std::shared_ptr<Shared> shared_;
};

} // namespace foundation::storage::tool
