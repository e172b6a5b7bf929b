#pragma once

#include <boost/variant.hpp>

#include <atomic>
#include <functional>
#include <mutex>
#include <utility>

namespace foundation::storage::provider::detail {

/// A value that is present, or computed by a function on first request and kept.
///
/// Threads: computed at most once per object, under a mutex of its own; read without a lock once present. The function
/// may get other fields, never the one it computes. One that throws leaves the field pending, and the next request
/// runs it again.
template <typename T>
class LazyField
{
public:
    explicit LazyField(T value) : state_(std::move(value)) { publish(); }
    explicit LazyField(std::function<T()> compute) : state_(std::move(compute)) {}

    LazyField(LazyField const&) = delete;
    LazyField& operator=(LazyField const&) = delete;

    /// The value; the reference stays valid as long as the field.
    /// Throws `std::bad_function_call` for an empty function, and what the function throws.
    T& get() const
    {
        T* const present = cached_.load(std::memory_order_acquire);
        return present != nullptr ? *present : compute();
    }

    bool isPresent() const { return cached_.load(std::memory_order_acquire) != nullptr; }

private:
    T& compute() const
    {
        std::lock_guard const lock(mutex_);
        if (auto const* function = boost::get<std::function<T()>>(&state_))
            state_ = (*function)();
        return publish();
    }

    T& publish() const
    {
        T& value = boost::get<T>(state_);
        cached_.store(&value, std::memory_order_release);
        return value;
    }

    mutable boost::variant<T, std::function<T()>> state_;
    mutable std::atomic<T*> cached_{nullptr};
    mutable std::mutex mutex_;
};

} // namespace foundation::storage::provider::detail
