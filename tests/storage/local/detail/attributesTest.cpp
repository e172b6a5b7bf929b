#include <storage/local/detail/attributes.hpp>

#include <gtest/gtest.h>

#include <boost/date_time/posix_time/time_formatters.hpp>

#include <cstdint>
#include <limits>
#include <vector>

namespace foundation::storage::local::detail {
namespace {

namespace posix_time = boost::posix_time;

struct Row
{
    std::int64_t seconds;
    std::uint32_t nanoseconds;
    std::string expected;
};

TEST(ToPtime, IsUTCWithMicrosecondsRoundedDown)
{
    for (auto const& [seconds, nanoseconds, expected] : std::vector<Row>{
             {0, 0, "1970-01-01T00:00:00"},
             {0, 999, "1970-01-01T00:00:00"},
             {0, 1000, "1970-01-01T00:00:00.000001"},
             {1'234'567'890, 123'456'789, "2009-02-13T23:31:30.123456"},
             {-1, 999'999'999, "1969-12-31T23:59:59.999999"},
             {-1, 1, "1969-12-31T23:59:59"},
             {2'147'483'648, 0, "2038-01-19T03:14:08"},
             {-2'147'483'649, 0, "1901-12-13T20:45:51"},
             {15'032'385'535, 0, "2446-05-10T22:38:55"},
             {253'402'300'799, 999'999'999, "9999-12-31T23:59:59.999999"},
             {-17'987'443'200, 0, "1400-01-01T00:00:00"},
         })
    {
        struct statx_timestamp time
        {};
        time.tv_sec = seconds;
        time.tv_nsec = nanoseconds;
        EXPECT_EQ(posix_time::to_iso_extended_string(toPtime(time)), expected);
    }
}

TEST(ToPtime, OfATimeBeyondTheCalendarIsItsEnd)
{
    for (std::int64_t const seconds : {253'402'300'800, std::numeric_limits<std::int64_t>::max()}) {
        struct statx_timestamp time
        {};
        time.tv_sec = seconds;
        EXPECT_EQ(toPtime(time), posix_time::ptime(boost::date_time::max_date_time));
    }
    for (std::int64_t const seconds : {-17'987'443'201, std::numeric_limits<std::int64_t>::min()}) {
        struct statx_timestamp time
        {};
        time.tv_sec = seconds;
        EXPECT_EQ(toPtime(time), posix_time::ptime(boost::date_time::min_date_time));
    }
}

TEST(ToTimespec, IsTheOtherWayRound)
{
    for (std::int64_t const seconds :
         std::vector<std::int64_t>{-17'987'443'200, -2'147'483'649, -1, 0, 1, 253'402'300'799})
        for (std::uint32_t const nanoseconds : {0u, 1000u, 999'999'000u}) {
            struct statx_timestamp time
            {};
            time.tv_sec = seconds;
            time.tv_nsec = nanoseconds;
            timespec const back = toTimespec(toPtime(time));
            EXPECT_EQ(back.tv_sec, seconds) << nanoseconds;
            EXPECT_EQ(back.tv_nsec, nanoseconds) << seconds;
        }
}

} // namespace
} // namespace foundation::storage::local::detail
