#pragma once

#include <storage/provider/Exception.hpp>

#include <boost/exception/get_error_info.hpp>

#include <stdexcept>
#include <string>
#include <string_view>

namespace foundation::storage::provider::detail {

/// The value of an entry that the constructor of `error` attached.
template <typename Info, typename Error>
typename Info::value_type const& requireInfo(Error const& error)
{
    auto const* value = boost::get_error_info<Info>(error);
    if (value == nullptr)
        throw std::logic_error("The exception has lost its error information.");
    return *value;
}

/// `<name>{StorageIRI="<location>` and the rest of the text.
std::u16string diagnosticText(char const* name, StorageIRI const& location, std::u16string_view rest);

} // namespace foundation::storage::provider::detail
