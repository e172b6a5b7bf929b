#pragma once

#include <boost/exception/get_error_info.hpp>
#include <boost/exception/info.hpp>

#include <optional>

namespace foundation::tests {

/// The value of the error-information entry that an exception carries, if it carries one.
template <class Info>
std::optional<typename Info::value_type> valueOf(boost::exception const& exception)
{
    auto const* value = boost::get_error_info<Info>(exception);
    return value == nullptr ? std::nullopt : std::optional(*value);
}

} // namespace foundation::tests
