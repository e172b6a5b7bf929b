#pragma once

#include <foundation/export.hpp>

#include <string>
#include <string_view>

namespace foundation::storage::archive::detail {

/// What stands for an entry whose name says nothing, such as "" and "/".
inline constexpr std::u16string_view nameOfTheNameless = u"%2F";

/// What stands for U+0000 and for "..", which would leave the folder that it stands in.
inline constexpr std::u16string_view escapedNull = u"%00";
inline constexpr std::u16string_view escapedParent = u"%2E%2E";

/// What stands for '/' where a path is one name.
inline constexpr std::u16string_view escapedSeparator = u"%2F";

/// Takes the first name off a path, without the separators around it; empty at the end. "." is a name here.
FOUNDATION_API std::u16string_view takeName(std::u16string_view& path);

/// Whether a path has more names than `depth`.
FOUNDATION_API bool isDeeper(std::u16string_view path, std::size_t depth);

/// The path as one name.
FOUNDATION_API std::u16string inOneName(std::u16string_view path);

/// Whether `name`, as it stands in an archive, may be the name of an entry in a folder as it is.
FOUNDATION_API bool isSafe(std::u16string_view name);

/// The name under which an entry is shown that is called `name` in an archive.
FOUNDATION_API std::u16string safeName(std::u16string_view name);

} // namespace foundation::storage::archive::detail
