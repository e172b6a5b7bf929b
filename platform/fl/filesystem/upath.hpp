#pragma once

#include <compare>
#include <string>

#include <foundation/export.hpp>

namespace fl::filesystem {

/// A path of a file system, as text.
///
/// Meaning: a value that keeps its text and looks at no file. Two paths are equal when their texts are; the order is
/// that of the texts by code unit, which serves maps and is not the order of the elements.
template <class CharT>
class FOUNDATION_API basic_path
{
public:
    using string_type = std::basic_string<CharT>;

    /// The empty path.
    basic_path() = default;

    /// A path of the given text. With `normalise`, repeated separators become one and separators at the end are
    /// dropped, except for the root's; "." and ".." stay.
    explicit basic_path(string_type const& text, bool normalise = true);

    [[nodiscard]] string_type const& string() const noexcept;

    [[nodiscard]] friend bool operator==(basic_path const& left, basic_path const& right) noexcept = default;
    [[nodiscard]] friend auto operator<=>(basic_path const& left, basic_path const& right) noexcept = default;

private:
    string_type text_;
};

using upath = basic_path<char16_t>;

extern template class basic_path<char16_t>;

} // namespace fl::filesystem
