#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Index.hpp>

#include <string>
#include <string_view>

namespace foundation::storage::archive::detail {

/// The path without "." and "..", by its text alone.
FOUNDATION_API std::u16string canonicalPath(std::u16string_view path);

/// The one path of what a path leads to: without links, "." and "..", as far as that exists; what is missing stands
/// behind it as it is.
FOUNDATION_API std::u16string canonicalPath(Index const& index, std::u16string_view path);

} // namespace foundation::storage::archive::detail
