#pragma once

#include <storage/provider/ExtendedAttributes.hpp>

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

namespace foundation::storage::tool {

/// An extended attribute as the tool tells it: a number, or any bytes.
struct Attribute
{
    std::string name;
    std::variant<std::uint64_t, std::string> value;
};

/// Numbers as they are (`mode` as octal digits), times in UTC, texts. Values of other types cannot be told, and are
/// left out.
std::vector<Attribute> toldAttributes(provider::ExtendedAttributes const& attributes);

/// For one line of text.
std::string toText(Attribute const& attribute);

} // namespace foundation::storage::tool
