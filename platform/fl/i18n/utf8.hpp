#pragma once

#include <string>
#include <string_view>

#include <foundation/export.hpp>

namespace fl::i18n {

/// What becomes of text that is not well formed.
enum class Malformed
{
    Throw,   ///< `std::range_error` is thrown
    Replace, ///< every maximal malformed part becomes U+FFFD
};

/// UTF-16 to UTF-8. A surrogate that is not part of a pair is malformed.
///
/// Errors: `std::range_error`, as `malformed` says.
/// Cost: one pass and one allocation for a text of ordinary length; runs of ASCII go by blocks of 16.
/// Source: RFC 3629, RFC 2781.
[[nodiscard]] FOUNDATION_API std::string to_utf8(std::u16string_view text, Malformed malformed);

/// UTF-8 to UTF-16. Overlong forms, surrogates and values beyond U+10FFFF are malformed.
///
/// Errors: `std::range_error`, as `malformed` says.
/// Cost: as `to_utf8`.
/// Source: RFC 3629; replacement by maximal subparts as in Unicode, section 3.9.
[[nodiscard]] FOUNDATION_API std::u16string from_utf8(std::string_view text, Malformed malformed);

} // namespace fl::i18n
