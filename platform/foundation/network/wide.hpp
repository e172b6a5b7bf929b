#pragma once

#include <foundation/export.hpp>

#include <string>
#include <string_view>

namespace foundation::network {

/// UTF-16 as the wide form (UTF-32) that IRI arguments hold.
/// Throws `std::out_of_range` for a lone surrogate, with the text of Boost's UTF-16 iterator.
FOUNDATION_API std::wstring toWide(std::u16string_view text);

/// The reverse. Throws `std::out_of_range` for what is not a Unicode scalar value.
FOUNDATION_API std::u16string fromWide(std::wstring_view text);

/// Throws `std::out_of_range`, with the text of Boost's UTF-16 iterator, for what is not a Unicode scalar value.
FOUNDATION_API void requireScalarValue(char32_t codePoint);

/// Appends one Unicode scalar value.
inline void appendCodePoint(std::u16string& text, char32_t codePoint)
{
    if (codePoint >= 0x10000) {
        text += static_cast<char16_t>(0xD7C0 + (codePoint >> 10));
        text += static_cast<char16_t>(0xDC00 + (codePoint & 0x3FF));
    } else {
        text += static_cast<char16_t>(codePoint);
    }
}

inline bool isSurrogate(char32_t unit)
{
    return unit >= 0xD800 && unit <= 0xDFFF;
}

} // namespace foundation::network
