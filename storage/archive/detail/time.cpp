#include <storage/archive/detail/time.hpp>

#include <algorithm>
#include <limits>

namespace foundation::storage::archive::detail {

namespace posix_time = boost::posix_time;

namespace {

posix_time::ptime const& epoch()
{
    static posix_time::ptime const time(boost::gregorian::date(1970, 1, 1));
    return time;
}

} // namespace

posix_time::ptime toPtime(std::int64_t microseconds)
{
    static posix_time::ptime const earliest(boost::date_time::min_date_time);
    static posix_time::ptime const latest(boost::date_time::max_date_time);
    static std::int64_t const first = (earliest - epoch()).total_microseconds();
    static std::int64_t const last = (latest - epoch()).total_microseconds();
    return epoch() + posix_time::microseconds(std::clamp(microseconds, first, last));
}

std::int64_t toMicroseconds(posix_time::ptime const& time)
{
    return time.is_special() ? 0 : (time - epoch()).total_microseconds();
}

std::int64_t toMicroseconds(std::int64_t seconds, std::int64_t nanoseconds)
{
    std::int64_t microseconds;
    if (__builtin_mul_overflow(seconds, std::int64_t{1'000'000}, &microseconds) ||
        __builtin_add_overflow(microseconds, nanoseconds / 1000, &microseconds))
        return seconds < 0 ? std::numeric_limits<std::int64_t>::min() : std::numeric_limits<std::int64_t>::max();
    return microseconds;
}

} // namespace foundation::storage::archive::detail
