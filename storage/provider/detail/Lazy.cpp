#include <storage/provider/detail/Lazy.hpp>

#include <utility>

namespace foundation::storage::provider::detail {

Lazy<bool>::Lazy(Lazy const& other) : value_(copyValueOf(other))
{
    publishIfKnown();
}

bool Lazy<bool>::operator()()
{
    if (bool const* known = resolved_.load(std::memory_order_acquire))
        return *known;
    std::lock_guard const lock(mutex_);
    if (auto const* compute = boost::get<std::function<bool()>>(&value_))
        value_ = (*compute)();
    publishIfKnown();
    return boost::get<bool>(value_);
}

Lazy<bool>::Value Lazy<bool>::copyValueOf(Lazy const& other)
{
    std::lock_guard const lock(other.mutex_);
    return other.value_;
}

} // namespace foundation::storage::provider::detail
