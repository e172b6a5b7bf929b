#pragma once

#include <foundation/export.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <cstdint>

namespace foundation::storage::archive::detail {

/// Between points in time and microseconds since 1970. What lies beyond the years that a `ptime` knows becomes the
/// earliest or the latest one, and what is no time becomes 1970.
FOUNDATION_API boost::posix_time::ptime toPtime(std::int64_t microseconds);
FOUNDATION_API std::int64_t toMicroseconds(boost::posix_time::ptime const& time);

/// Microseconds of a time that is given in seconds and nanoseconds, as far as 64 bits reach.
FOUNDATION_API std::int64_t toMicroseconds(std::int64_t seconds, std::int64_t nanoseconds);

} // namespace foundation::storage::archive::detail
