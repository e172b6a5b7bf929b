#pragma once

#include <cstddef>
#include <string>

#include <foundation/export.hpp>

namespace fl::filesystem {

namespace upath_constant {

/// What separates the elements of a path in generic form, as text.
inline constexpr char16_t GENERIC_PATHNAME_SEPARATOR[] = u"/";

} // namespace upath_constant

/// Functions on the text of a path. They look at nothing but the text and accept every text.
///
/// A path is a root, elements, and separators ("/") between them; a run of separators counts as one, and separators at
/// the end belong to no element. The root is the run of separators that an absolute path begins with. "." and ".." are
/// elements like others.
namespace detail {

/// The form that the operating system takes. On Linux that is the text itself, whatever the flag.
[[nodiscard]] FOUNDATION_API std::u16string make_native_form(std::u16string const& path, bool complete = true);

/// The form with "/" as the separator. On Linux that is the text itself.
[[nodiscard]] FOUNDATION_API std::u16string make_generic_form(std::u16string const& path);

/// The last element: "b" of "/a/b" and of "/a/b/"; "/" of a root, nothing of an empty path.
[[nodiscard]] FOUNDATION_API std::u16string extract_filename(std::u16string const& path);

/// What stands before the last element and its separator: "/a" of "/a/b" and of "/a/b/", "/" of "/a".
/// Nothing of a root, of a single element and of an empty path.
[[nodiscard]] FOUNDATION_API std::u16string extract_parent_path(std::u16string const& path);

/// The root: "/" of "/a", nothing of a relative path.
[[nodiscard]] FOUNDATION_API std::u16string extract_root_path(std::u16string const& path);

/// The length of the root.
[[nodiscard]] FOUNDATION_API std::size_t get_root_path_length(std::u16string const& path);

/// The first element of a path whose root was taken off: "a" of "a/b".
[[nodiscard]] FOUNDATION_API std::u16string extract_first_element(std::u16string const& pathWithoutRoot);

/// What follows the first element of a path whose root was taken off: "b/c" of "a/b/c", nothing of "a" and of "a/".
[[nodiscard]] FOUNDATION_API std::u16string move_down(std::u16string const& pathWithoutRoot);

/// Whether the path begins at the root.
[[nodiscard]] FOUNDATION_API bool is_absolute(std::u16string const& path);

} // namespace detail

} // namespace fl::filesystem
