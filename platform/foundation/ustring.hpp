#pragma once

#include <iosfwd>
#include <string>
#include <string_view>

#include <foundation/export.hpp>

/// What UTF-16 text needs beyond the standard library.
namespace foundation::ustring {

/// Writes the text as UTF-8; a surrogate that is not part of a pair is written as U+FFFD.
///
/// Meaning: behaves as the insertion of a `std::string` in every other way. A width set on the stream counts bytes, is
/// filled up and then reset; a failing stream is told by its state.
FOUNDATION_API std::ostream& insert(std::ostream& stream, std::u16string_view text);

/// The text with `change` applied to each of its code points.
///
/// Meaning: a surrogate that is not part of a pair is given to `change` by its own value, and what comes back is kept.
/// Errors: `std::range_error` when `change` answers a value beyond U+10FFFF.
[[nodiscard]] FOUNDATION_API std::u16string transform(std::u16string text, char32_t (*change)(char32_t));

} // namespace foundation::ustring
