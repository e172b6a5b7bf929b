#pragma once

#include <foundation/export.hpp>

#include <boost/variant.hpp>

#include <atomic>
#include <functional>
#include <mutex>
#include <utility>

namespace foundation::storage::provider::detail {

template <typename T>
class Lazy;

/// A flag that is known, or computed by a function on the first call.
///
/// Threads: the function runs at most once per object however many threads ask; once the answer is known, a call costs
/// one pointer test. A function that throws leaves the object as it was, and the next call runs it again. A copy made
/// before the answer is known computes for itself; what is moved from must not be asked.
template <>
class FOUNDATION_API Lazy<bool>
{
public:
    using Value = boost::variant<bool, std::function<bool()>>;

    explicit Lazy(Value value) : value_(std::move(value)) { publishIfKnown(); }
    Lazy(Lazy const& other);

    /// Without the mutex: nobody else has an object that is moved from.
    Lazy(Lazy&& other) noexcept : value_(std::move(other.value_)) { publishIfKnown(); }

    Lazy& operator=(Lazy const&) = delete;
    ~Lazy() = default;

    /// Throws `std::bad_function_call` for an empty function, and what the function throws.
    bool operator()();

private:
    static Value copyValueOf(Lazy const& other);
    void publishIfKnown() { resolved_.store(boost::get<bool>(&value_), std::memory_order_release); }

    Value value_;
    std::atomic<bool const*> resolved_{nullptr};
    mutable std::mutex mutex_;
};

} // namespace foundation::storage::provider::detail
