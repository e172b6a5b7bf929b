#pragma once

#include <foundation/export.hpp>

namespace fl::i18n {

/// The lower-case form of one code point, or the code point itself where there is none.
///
/// Meaning: full Unicode simple case mapping, without regard to language or context.
/// Source: Unicode, section 4.2 (Simple_Lowercase_Mapping).
[[nodiscard]] FOUNDATION_API char32_t to_lower(char32_t codePoint);

} // namespace fl::i18n
