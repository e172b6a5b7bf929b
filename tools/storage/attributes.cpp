#include <tools/storage/attributes.hpp>

#include <fmt/format.h>
#include <tools/storage/format.hpp>
#include <tools/storage/printable.hpp>

#include <boost/any.hpp>

#include <optional>
#include <utility>

namespace foundation::storage::tool {

namespace {

using Value = decltype(Attribute::value);

std::optional<Value> toValue(std::string const& name, boost::any const& value)
{
    if (auto const* const number = boost::any_cast<std::uint32_t>(&value))
        return name == "mode" ? Value(fmt::format("{:04o}", *number)) : Value(std::uint64_t{*number});
    if (auto const* const number = boost::any_cast<std::uint64_t>(&value))
        return Value(*number);
    if (auto const* const time = boost::any_cast<boost::posix_time::ptime>(&value))
        return Value(formatTime(*time, Precision::Microseconds));
    if (auto const* const text = boost::any_cast<std::string>(&value))
        return Value(*text);
    return std::nullopt;
}

} // namespace

std::vector<Attribute> toldAttributes(provider::ExtendedAttributes const& attributes)
{
    std::vector<Attribute> told;
    for (auto const& [name, any] : attributes)
        if (std::optional<Value> value = toValue(name, any))
            told.push_back({name, std::move(*value)});
    return told;
}

std::string toText(Attribute const& attribute)
{
    if (auto const* const number = std::get_if<std::uint64_t>(&attribute.value))
        return fmt::to_string(*number);
    return printable(std::get<std::string>(attribute.value));
}

} // namespace foundation::storage::tool
