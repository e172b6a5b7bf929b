#include <tools/storage/values.hpp>

#include <boost/date_time/gregorian/gregorian_types.hpp>

#include <array>
#include <charconv>
#include <fmt/format.h>
#include <optional>
#include <stdexcept>
#include <string_view>
#include <utility>

namespace foundation::storage::tool {

namespace {

using boost::posix_time::ptime;

/// Takes a number from the beginning of the text: the digits that are there, at most so many.
std::optional<std::uint64_t> takeNumber(std::string_view& text, std::size_t maximumDigits = 20)
{
    std::string_view const digits = text.substr(0, maximumDigits);
    std::uint64_t value = 0;
    auto const [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), value);
    if (error != std::errc())
        return std::nullopt;
    text.remove_prefix(static_cast<std::size_t>(end - digits.data()));
    return value;
}

/// Takes a number of exactly so many digits.
std::optional<unsigned> takeField(std::string_view& text, std::size_t digits)
{
    std::string_view rest = text;
    auto const value = takeNumber(rest, digits);
    if (!value || text.size() - rest.size() != digits)
        return std::nullopt;
    text = rest;
    return static_cast<unsigned>(*value);
}

bool take(std::string_view& text, char c)
{
    bool const isThere = text.starts_with(c);
    text.remove_prefix(isThere ? 1 : 0);
    return isThere;
}

/// The number of bytes that a unit stands for; 0 where it is none.
std::uint64_t factorOf(std::string_view unit)
{
    constexpr std::string_view prefixes = "KMGTPE";
    if (unit.empty() || unit == "B")
        return 1;
    char const prefix = unit.front() >= 'a' ? static_cast<char>(unit.front() - 'a' + 'A') : unit.front();
    std::size_t const power = prefixes.find(prefix);
    std::string_view const rest = unit.substr(1);
    if (power == std::string_view::npos || (rest != "" && rest != "B" && rest != "iB"))
        return 0;
    std::uint64_t factor = 1;
    for (std::size_t i = 0; i <= power; ++i)
        factor *= rest == "B" ? 1000U : 1024U;
    return factor;
}

std::optional<std::uint64_t> parseSize(std::string_view text)
{
    auto const number = takeNumber(text);
    std::uint64_t const factor = factorOf(text);
    if (!number || factor == 0 || *number > ~std::uint64_t{0} / factor)
        return std::nullopt;
    return *number * factor;
}

std::optional<boost::posix_time::time_duration> parseAge(std::string_view text)
{
    constexpr std::array<std::pair<std::string_view, std::uint64_t>, 5> units{
        {{"s", 1}, {"min", 60}, {"h", 3600}, {"d", 86400}, {"w", 604800}}};
    constexpr std::uint64_t mostSeconds = std::uint64_t{300} * 365 * 86400; // further back, there are no times
    auto const number = takeNumber(text);
    for (auto const& [unit, seconds] : units) {
        if (number && text == unit && *number <= mostSeconds / seconds)
            return boost::posix_time::seconds(static_cast<long>(*number * seconds));
    }
    return std::nullopt;
}

std::optional<boost::gregorian::date> takeDate(std::string_view& text)
{
    auto const year = takeField(text, 4);
    auto const month = year && take(text, '-') ? takeField(text, 2) : std::nullopt;
    auto const day = month && take(text, '-') ? takeField(text, 2) : std::nullopt;
    if (!day)
        return std::nullopt;
    try {
        return boost::gregorian::date(static_cast<unsigned short>(*year), static_cast<unsigned short>(*month),
                                      static_cast<unsigned short>(*day));
    } catch (std::out_of_range const&) {
        return std::nullopt;
    }
}

/// Microseconds, from the digits behind the point.
std::optional<unsigned> takeFraction(std::string_view& text)
{
    std::size_t const before = text.size();
    auto const number = takeNumber(text, 6);
    if (!number)
        return std::nullopt;
    auto value = static_cast<unsigned>(*number);
    for (std::size_t digits = before - text.size(); digits < 6; ++digits)
        value *= 10;
    return value;
}

std::optional<boost::posix_time::time_duration> takeClock(std::string_view& text)
{
    auto const hour = takeField(text, 2);
    auto const minute = hour && take(text, ':') ? takeField(text, 2) : std::nullopt;
    auto const second = minute && take(text, ':') ? takeField(text, 2) : std::nullopt;
    if (!second || *hour > 23 || *minute > 59 || *second > 59)
        return std::nullopt;
    auto const fraction = take(text, '.') ? takeFraction(text) : 0U;
    if (!fraction)
        return std::nullopt;
    take(text, 'Z');
    return boost::posix_time::time_duration(*hour, *minute, *second) + boost::posix_time::microseconds(*fraction);
}

std::optional<ptime> parsePoint(std::string_view text)
{
    auto const date = takeDate(text);
    if (!date || text.empty())
        return date ? std::optional(ptime(*date)) : std::nullopt;
    auto const clock = take(text, 'T') ? takeClock(text) : std::nullopt;
    return clock && text.empty() ? std::optional(ptime(*date, *clock)) : std::nullopt;
}

} // namespace

bool SizeTest::holds(std::uint64_t size) const
{
    switch (relation) {
    case Relation::AtLeast:
        return size >= bytes;
    case Relation::AtMost:
        return size <= bytes;
    case Relation::Exactly:
        break;
    }
    return size == bytes;
}

SizeTest parseSizeTest(std::string const& text)
{
    using Relation = SizeTest::Relation;
    std::string_view rest = text;
    Relation const relation = take(rest, '+')   ? Relation::AtLeast
                              : take(rest, '-') ? Relation::AtMost
                                                : Relation::Exactly;
    if (auto const bytes = parseSize(rest))
        return {relation, *bytes};
    throw std::invalid_argument(fmt::format("'{}' is no size such as 100, +1M or -64K", text));
}

ptime parseTime(std::string const& text, ptime const& now)
{
    if (auto const age = parseAge(text))
        return now - *age;
    if (auto const point = parsePoint(text))
        return *point;
    throw std::invalid_argument(
        fmt::format("'{}' is no time such as 2024-02-29, 2024-02-29T12:34:56Z, 10min, 36h or 7d", text));
}

} // namespace foundation::storage::tool
