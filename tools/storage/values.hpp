#pragma once

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <cstdint>
#include <string>

namespace foundation::storage::tool {

/// What a size is compared with.
struct SizeTest
{
    enum class Relation
    {
        Exactly,
        AtLeast,
        AtMost,
    };

    Relation relation;
    std::uint64_t bytes;

    bool holds(std::uint64_t size) const;
};

/// "100" is that many bytes, "+1M" at least a MiB, "-1M" at most. K, M, G, T, P and E in either case, also followed by
/// "iB", are powers of 1024; KB, MB and so on are powers of 1000. Throws `std::invalid_argument` for anything else,
/// with a text for the user.
SizeTest parseSizeTest(std::string const& text);

/// "2024-02-29", "2024-02-29T12:34:56Z" (with up to six digits of a second, and without the Z too) is a time in UTC;
/// "90s", "10min", "36h", "7d", "2w" is so long before `now`. Throws as `parseSizeTest` does.
boost::posix_time::ptime parseTime(std::string const& text, boost::posix_time::ptime const& now);

} // namespace foundation::storage::tool
