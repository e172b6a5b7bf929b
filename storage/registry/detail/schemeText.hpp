#pragma once

#include <foundation/export.hpp>

#include <optional>
#include <string>
#include <string_view>

namespace foundation::storage::registry::detail {

/// Whether a text is a scheme (RFC 3986, section 3.1): a letter, then letters, digits, '+', '-' or '.'.
FOUNDATION_API bool isScheme(std::u16string_view text);

/// The scheme with which the text of a location begins, if it does.
FOUNDATION_API std::optional<std::u16string_view> schemeOf(std::u16string_view text);

/// A scheme as registries know it: the letters A to Z in lower case.
FOUNDATION_API std::u16string lowerCased(std::u16string_view scheme);

} // namespace foundation::storage::registry::detail
