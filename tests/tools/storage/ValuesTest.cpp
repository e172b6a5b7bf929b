#include <tools/storage/values.hpp>

#include <boost/date_time/gregorian/gregorian_types.hpp>
#include <gtest/gtest.h>
#include <stdexcept>
#include <utility>
#include <vector>

namespace {

using namespace foundation::storage::tool;
using boost::gregorian::date;
using boost::posix_time::hours;
using boost::posix_time::microseconds;
using boost::posix_time::minutes;
using boost::posix_time::ptime;
using boost::posix_time::seconds;
using boost::posix_time::time_duration;

TEST(Values, SizesHaveBinaryAndDecimalUnits)
{
    std::vector<std::pair<std::string, std::uint64_t>> const rows{
        {"0", 0},
        {"100", 100},
        {"7B", 7},
        {"1k", 1024},
        {"1K", 1024},
        {"3KiB", 3072},
        {"3KB", 3000},
        {"1M", std::uint64_t{1} << 20U},
        {"2MB", 2'000'000},
        {"1GiB", std::uint64_t{1} << 30U},
        {"1t", std::uint64_t{1} << 40U},
        {"1P", std::uint64_t{1} << 50U},
        {"15E", std::uint64_t{15} << 60U},
        {"18446744073709551615", ~std::uint64_t{0}},
    };
    for (auto const& [text, bytes] : rows)
        EXPECT_EQ(parseSizeTest(text).bytes, bytes) << text;
}

TEST(Values, SignsOfSizesIncludeTheSizeItself)
{
    SizeTest const least = parseSizeTest("+1k");
    EXPECT_TRUE(!least.holds(1023) && least.holds(1024) && least.holds(1025));
    SizeTest const most = parseSizeTest("-1k");
    EXPECT_TRUE(most.holds(1023) && most.holds(1024) && !most.holds(1025));
    SizeTest const exact = parseSizeTest("1k");
    EXPECT_TRUE(!exact.holds(1023) && exact.holds(1024) && !exact.holds(1025));
}

TEST(Values, WhatIsNoSizeIsRefused)
{
    for (std::string const text : {"", "+", "-", "k", "1x", "1 k", " 1", "1.5k", "+-1", "1kb ", "1kIB", "16E", "1ki",
                                   "18446744073709551616", "99999999999999999999999"})
        EXPECT_THROW(parseSizeTest(text), std::invalid_argument) << text;
}

TEST(Values, TimesArePointsInUTC)
{
    ptime const now;
    date const day(2024, 2, 29);
    std::vector<std::pair<std::string, ptime>> const rows{
        {"2024-02-29", ptime(day)},
        {"2024-02-29T12:34:56", ptime(day, time_duration(12, 34, 56))},
        {"2024-02-29T12:34:56Z", ptime(day, time_duration(12, 34, 56))},
        {"2024-02-29T12:34:56.5Z", ptime(day, time_duration(12, 34, 56) + microseconds(500'000))},
        {"2024-02-29T12:34:56.000001Z", ptime(day, time_duration(12, 34, 56) + microseconds(1))},
        {"1400-01-01", ptime(date(1400, 1, 1))},
    };
    for (auto const& [text, time] : rows)
        EXPECT_EQ(parseTime(text, now), time) << text;
}

TEST(Values, TimesAreAlsoAges)
{
    ptime const now(date(2024, 2, 29), hours(1));
    std::vector<std::pair<std::string, time_duration>> const rows{
        {"0s", seconds(0)}, {"90s", seconds(90)},  {"10min", minutes(10)},
        {"36h", hours(36)}, {"7d", hours(7 * 24)}, {"2w", hours(14 * 24)},
    };
    for (auto const& [text, age] : rows)
        EXPECT_EQ(parseTime(text, now), now - age) << text;
}

TEST(Values, WhatIsNoTimeIsRefused)
{
    ptime const now(date(2024, 2, 29), hours(1));
    for (std::string const text : {"",
                                   "7",
                                   "d",
                                   "7 d",
                                   "7m",
                                   "-7d",
                                   "1000000000d",
                                   "2023-02-29",
                                   "2024-13-01",
                                   "2024-00-01",
                                   "24-02-29",
                                   "2024-2-29",
                                   "2024-02-29 12:34:56",
                                   "2024-02-29T",
                                   "2024-02-29T24:00:00",
                                   "2024-02-29T12:60:00",
                                   "2024-02-29T12:34:60",
                                   "2024-02-29T12:34",
                                   "2024-02-29T12:34:56.",
                                   "2024-02-29T12:34:56.1234567",
                                   "2024-02-29T12:34:56+01:00",
                                   "2024-02-29Z",
                                   "0000-01-01"})
        EXPECT_THROW(parseTime(text, now), std::invalid_argument) << text;
}

} // namespace
