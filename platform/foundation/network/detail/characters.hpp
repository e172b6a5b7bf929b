#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

namespace foundation::network::detail {

using CharacterClass = std::uint16_t;

// Classes of characters (RFC 3986, section 2 and appendix A), one bit each. Beyond ASCII, C1 controls are impossible
// and surrogates have a class; all others have none.
inline constexpr CharacterClass alpha = 1U << 0;
inline constexpr CharacterClass schemeCharacter = 1U << 1;
inline constexpr CharacterClass impossible = 1U << 2; ///< no IRI may hold it
inline constexpr CharacterClass percent = 1U << 3;
inline constexpr CharacterClass inUserInfo = 1U << 4;
inline constexpr CharacterClass inHost = 1U << 5;
inline constexpr CharacterClass inPath = 1U << 6;
inline constexpr CharacterClass inQuery = 1U << 7;
inline constexpr CharacterClass inIPLiteral = 1U << 8;
inline constexpr CharacterClass endsAuthority = 1U << 9;
inline constexpr CharacterClass endsPath = 1U << 10;
inline constexpr CharacterClass surrogate = 1U << 11;
inline constexpr CharacterClass inFragment = 1U << 12;
inline constexpr CharacterClass anyClass = 0xFFFF;

/// Those of the characters up to U+00FF.
extern std::array<CharacterClass, 256> const characterClasses;

inline bool isOf(char32_t character, CharacterClass classes)
{
    return character < characterClasses.size() && (characterClasses[character] & classes) != 0;
}

/// Whether `text` at `position` is '%' and two hex digits.
bool isEscape(std::u16string_view text, std::size_t position);

/// The classes of all characters of a text together.
CharacterClass classesOf(std::u16string_view text);

/// `text` with all that no IRI may hold percent-encoded; throws `std::out_of_range` for a lone surrogate.
/// `present` are the classes of the text.
std::u16string encodeImpossible(std::u16string text, CharacterClass present);

/// Appends a plain component to `text`, percent-encoded but for the characters of `allowed` and those that RFC 3987
/// adds to them: `ucschar`, and in a query `iprivate`.
void appendEncoded(std::u16string& text, std::wstring_view plain, CharacterClass allowed);

/// The plain text of a component: escapes that form valid UTF-8 are decoded, all others stay.
std::u16string decodeEscapes(std::u16string_view text);

} // namespace foundation::network::detail
