#pragma once

#include <string>
#include <string_view>

namespace foundation::network::detail {

/// The path without "." and ".." segments (RFC 3986, section 5.2.4).
std::u16string removeDotSegments(std::u16string_view path);

} // namespace foundation::network::detail
