#include <tools/storage/format.hpp>

#include <boost/date_time/gregorian/gregorian_types.hpp>
#include <gtest/gtest.h>
#include <utility>
#include <vector>

namespace {

using namespace foundation::storage::tool;
using boost::gregorian::date;
using boost::posix_time::microseconds;
using boost::posix_time::ptime;
using boost::posix_time::time_duration;

TEST(Format, SizesHaveBinaryUnits)
{
    std::vector<std::pair<std::uint64_t, std::string>> const rows{
        {0, "0 B"},
        {1023, "1023 B"},
        {1024, "1.0 KiB"},
        {1536, "1.5 KiB"},
        {10188, "9.9 KiB"},
        {10240, "10 KiB"},
        {1023 * 1024, "1023 KiB"},
        {1024 * 1024 - 1, "1.0 MiB"},
        {std::uint64_t{3} << 40U, "3.0 TiB"},
        {~std::uint64_t{0}, "16 EiB"},
    };
    for (auto const& [bytes, text] : rows)
        EXPECT_EQ(formatSize(bytes), text);
}

TEST(Format, TimesAreISO8601)
{
    ptime const time(date(2024, 2, 29), time_duration(1, 2, 3) + microseconds(45));
    EXPECT_EQ(formatTime(time, Precision::Seconds), "2024-02-29T01:02:03Z");
    EXPECT_EQ(formatTime(time, Precision::Microseconds), "2024-02-29T01:02:03.000045Z");
    EXPECT_EQ(formatTime(ptime(boost::posix_time::not_a_date_time), Precision::Seconds), "-");
}

} // namespace
