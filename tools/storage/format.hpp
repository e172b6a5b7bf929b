#pragma once

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <cstdint>
#include <string>

namespace foundation::storage::tool {

/// A number of bytes with three digits or so and a binary unit: "999 B", "1.5 KiB".
std::string formatSize(std::uint64_t bytes);

enum class Precision
{
    Seconds,
    Microseconds,
};

/// ISO 8601 in UTC: "2024-02-29T12:34:56Z"; "-" for what is no point in time.
std::string formatTime(boost::posix_time::ptime const& time, Precision precision);

} // namespace foundation::storage::tool
