#include <tools/storage/format.hpp>

#include <array>
#include <fmt/format.h>

namespace foundation::storage::tool {

std::string formatSize(std::uint64_t bytes)
{
    constexpr std::array units{"KiB", "MiB", "GiB", "TiB", "PiB", "EiB"};
    if (bytes < 1024)
        return fmt::format("{} B", bytes);
    double value = static_cast<double>(bytes) / 1024;
    std::size_t unit = 0;
    // What would print as 1024 goes to the next unit.
    for (; value >= 1023.5 && unit + 1 < units.size(); ++unit)
        value /= 1024;
    return value < 9.95 ? fmt::format("{:.1f} {}", value, units[unit]) : fmt::format("{:.0f} {}", value, units[unit]);
}

std::string formatTime(boost::posix_time::ptime const& time, Precision precision)
{
    if (time.is_special())
        return "-";
    auto const date = time.date().year_month_day();
    auto const clock = time.time_of_day();
    std::string const seconds =
        fmt::format("{:04}-{:02}-{:02}T{:02}:{:02}:{:02}", static_cast<int>(date.year), date.month.as_number(),
                    static_cast<int>(date.day), clock.hours(), clock.minutes(), clock.seconds());
    if (precision == Precision::Seconds)
        return seconds + 'Z';
    return fmt::format("{}.{:06}Z", seconds, clock.total_microseconds() % 1'000'000);
}

} // namespace foundation::storage::tool
