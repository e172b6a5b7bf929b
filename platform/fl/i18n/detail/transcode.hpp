#pragma once

#include <array>
#include <cstddef>
#include <memory>
#include <string>
#include <string_view>

#include <fl/i18n/detail/ascii.hpp>

/// The one UTF-8 and UTF-16 coder of this library. What becomes of malformed input is the caller's choice.
namespace fl::i18n::detail {

inline constexpr char32_t replacementCharacter = 0xFFFD;

/// What stands at the start of a text: a code point, or `length` code units that are malformed.
struct CodePoint
{
    char32_t value = 0;
    std::size_t length = 1;
    bool isValid = false;
};

inline bool is_surrogate(char32_t value) noexcept
{
    return value >= 0xD800 && value <= 0xDFFF;
}

/// The second bytes that may follow a lead byte, and how many bytes the sequence has (Unicode, table 3-7).
struct Utf8Lead
{
    unsigned char lowestSecond = 0x80;
    unsigned char highestSecond = 0xBF;
    std::size_t length = 0;
};

inline Utf8Lead classify_utf8_lead(unsigned char lead) noexcept
{
    if (lead < 0x80) {
        return {.length = 1};
    }
    if (lead < 0xC2 || lead > 0xF4) {
        return {.length = 0};
    }
    if (lead < 0xE0) {
        return {.length = 2};
    }
    switch (lead) {
    case 0xE0:
        return {.lowestSecond = 0xA0, .length = 3};
    case 0xED:
        return {.highestSecond = 0x9F, .length = 3};
    case 0xF0:
        return {.lowestSecond = 0x90, .length = 4};
    case 0xF4:
        return {.highestSecond = 0x8F, .length = 4};
    default:
        return {.length = lead < 0xF0 ? std::size_t{3} : std::size_t{4}};
    }
}

/// Decodes the start of a text that is not empty. Malformed input is taken by maximal subparts (Unicode, section 3.9).
inline CodePoint decode_utf8(std::string_view text) noexcept
{
    auto const byte = [&](std::size_t at) { return static_cast<unsigned char>(text[at]); };
    Utf8Lead const lead = classify_utf8_lead(byte(0));
    if (lead.length < 2) {
        return {.value = byte(0), .length = 1, .isValid = lead.length == 1};
    }
    char32_t value = byte(0) & (0x7Fu >> lead.length);
    for (std::size_t at = 1; at < lead.length; ++at) {
        unsigned char const lowest = at == 1 ? lead.lowestSecond : 0x80;
        unsigned char const highest = at == 1 ? lead.highestSecond : 0xBF;
        if (at == text.size() || byte(at) < lowest || byte(at) > highest) {
            return {.value = value, .length = at, .isValid = false};
        }
        value = (value << 6) | (byte(at) & 0x3Fu);
    }
    return {.value = value, .length = lead.length, .isValid = true};
}

/// Decodes the start of a text that is not empty. A lone surrogate is malformed, and its own value is given.
inline CodePoint decode_utf16(std::u16string_view text) noexcept
{
    char32_t const first = text[0];
    if (!is_surrogate(first)) {
        return {.value = first, .length = 1, .isValid = true};
    }
    bool const isPair = first < 0xDC00 && text.size() > 1 && text[1] >= 0xDC00 && text[1] <= 0xDFFF;
    if (!isPair) {
        return {.value = first, .length = 1, .isValid = false};
    }
    return {.value = 0x10000 + ((first - 0xD800) << 10) + (text[1] - 0xDC00u), .length = 2, .isValid = true};
}

/// Writes 1 to 4 bytes and answers their end.
inline char* encode_utf8(char32_t value, char* out) noexcept
{
    auto const put = [&](char32_t bits) { *out++ = static_cast<char>(static_cast<unsigned char>(bits)); };
    if (value < 0x80) {
        put(value);
    } else if (value < 0x800) {
        put(0xC0 | (value >> 6));
        put(0x80 | (value & 0x3F));
    } else if (value < 0x10000) {
        put(0xE0 | (value >> 12));
        put(0x80 | ((value >> 6) & 0x3F));
        put(0x80 | (value & 0x3F));
    } else {
        put(0xF0 | (value >> 18));
        put(0x80 | ((value >> 12) & 0x3F));
        put(0x80 | ((value >> 6) & 0x3F));
        put(0x80 | (value & 0x3F));
    }
    return out;
}

/// Writes 1 or 2 code units and answers their end.
inline char16_t* encode_utf16(char32_t value, char16_t* out) noexcept
{
    if (value < 0x10000) {
        *out++ = static_cast<char16_t>(value);
        return out;
    }
    *out++ = static_cast<char16_t>(0xD800 + ((value - 0x10000) >> 10));
    *out++ = static_cast<char16_t>(0xDC00 + ((value - 0x10000) & 0x3FF));
    return out;
}

/// The text that `write(out)` puts at `out` and whose end it answers; it may write up to `bound` characters.
/// A text of ordinary length is built on the stack, so that the result has its exact size and one allocation.
template <class Char, class Write>
std::basic_string<Char> build_text(std::size_t bound, Write const& write)
{
    std::array<Char, 1024> onStack;
    if (bound <= onStack.size()) {
        return std::basic_string<Char>(onStack.data(), write(onStack.data()));
    }
    auto const onHeap = std::make_unique_for_overwrite<Char[]>(bound);
    return std::basic_string<Char>(onHeap.get(), write(onHeap.get()));
}

/// UTF-8 to UTF-16. `put(codePoint, units, out)` is called for everything beyond ASCII with the bytes it was decoded
/// from; it writes at most as many code units as there are bytes, and answers their end.
template <class Put>
std::u16string utf8_to_utf16(std::string_view text, Put const& put)
{
    return build_text<char16_t>(text.size(), [&put, text](char16_t* out) {
        for (auto rest = text; !rest.empty();) {
            std::size_t const ascii = widen_ascii(rest, out);
            out += ascii;
            rest.remove_prefix(ascii);
            while (!rest.empty() && static_cast<unsigned char>(rest.front()) >= 0x80) {
                CodePoint const next = decode_utf8(rest);
                out = put(next, rest.substr(0, next.length), out);
                rest.remove_prefix(next.length);
            }
        }
        return out;
    });
}

/// UTF-16 to UTF-8. `put(codePoint, out)` is called for everything beyond ASCII; it writes at most three bytes for each
/// code unit, and answers their end.
template <class Put>
std::string utf16_to_utf8(std::u16string_view text, Put const& put)
{
    return build_text<char>(text.size() * 3, [&put, text](char* out) {
        for (auto rest = text; !rest.empty();) {
            std::size_t const ascii = narrow_ascii(rest, out);
            out += ascii;
            rest.remove_prefix(ascii);
            while (!rest.empty() && rest.front() >= 0x80) {
                CodePoint const next = decode_utf16(rest);
                out = put(next, out);
                rest.remove_prefix(next.length);
            }
        }
        return out;
    });
}

} // namespace fl::i18n::detail
