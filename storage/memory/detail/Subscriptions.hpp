#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace foundation::storage::memory::detail {

/// A change of an entry. Paths are canonical; `movedTo` is the same path but for `Kind::Moved`.
struct Change
{
    events::Kind kind;
    events::EntryType type;
    std::u16string path;
    std::u16string movedTo;
};

/// Who wants to know about changes of a tree.
///
/// Threads: any number at once. Callbacks run in the thread that publishes, without a lock, so that they may come back
/// here. None begins for a subscription after `stop` has answered; one that runs in another thread may still be under
/// way then.
class FOUNDATION_API Subscriptions
{
public:
    /// What a subscription is about: the entry at its path alone, or also what lies directly in that folder.
    enum class Scope
    {
        Entry,
        FolderAndEntries,
    };

    void add(std::u16string path, Scope scope, provider::ChangeEventCallback callback, std::vector<events::Kind> kinds);

    /// Ends those about a folder, and those about single entries that lie directly in it.
    void stop(std::u16string_view folder);
    void stopAll();

    /// Costs next to nothing, so that changes that nobody wants to know need not be described.
    bool isEmpty() const noexcept { return count_ == 0; }

    /// Tells whoever it concerns, with locations below `root`. What a callback throws is dropped: the change is made.
    void publish(Change const& change, provider::StorageIRI const& root);

private:
    struct Subscription;
    using SubscriptionPtr = std::shared_ptr<Subscription>;

    std::vector<SubscriptionPtr> concernedBy(Change const& change);

    std::mutex mutex_;
    std::vector<SubscriptionPtr> subscriptions_;
    std::atomic<std::size_t> count_ = 0;
};

} // namespace foundation::storage::memory::detail
