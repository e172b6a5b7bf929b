#pragma once

#include <string>
#include <string_view>

namespace foundation::storage::tool {

/// A name or path as it can be shown on a terminal and in a one-line message: what a terminal would obey rather than
/// show (control characters, marks that turn the direction of writing) and bytes that are not UTF-8 become C escapes
/// (`\n`, `\033`), and so does the backslash.
std::string printable(std::string_view bytes);

} // namespace foundation::storage::tool
