#include <storage/memory/detail/Account.hpp>

namespace foundation::storage::memory::detail {

bool Account::charge(std::uint64_t bytes) noexcept
{
    std::uint64_t const limit = limit_;
    std::uint64_t used = used_;
    do {
        if (bytes != 0 && (used > limit || bytes > limit - used))
            return false;
    } while (!used_.compare_exchange_weak(used, used + bytes));
    return true;
}

} // namespace foundation::storage::memory::detail
