#pragma once

#include <rapidcheck.h>

#include <cstddef>
#include <ios>
#include <numeric>
#include <ostream>
#include <sstream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// Text that locations have to cope with, for properties that hold for all text.
namespace foundation::tests::support {

/// UTF-16 as a failed property shows it: printable ASCII as it is, every other code unit as "{hex}".
inline std::string shown(std::u16string_view text)
{
    std::ostringstream result;
    result << std::hex << '"';
    for (char16_t const unit : text) {
        if (unit >= u' ' && unit <= u'~' && unit != u'{')
            result << static_cast<char>(unit);
        else
            result << '{' << static_cast<unsigned>(unit) << '}';
    }
    result << '"';
    return result.str();
}

/// A generated text.
struct Text
{
    std::u16string value;

    operator std::u16string const&() const { return value; }
};

inline void showValue(Text const& text, std::ostream& stream)
{
    stream << shown(text.value);
}

inline std::u16string fromCodePoint(char32_t c)
{
    if (c < 0x10000)
        return {static_cast<char16_t>(c)};
    return {static_cast<char16_t>(0xD7C0 + (c >> 10)), static_cast<char16_t>(0xDC00 + (c & 0x3FF))};
}

namespace detail {

using Piece = std::u16string;

inline rc::Gen<Piece> codePointIn(unsigned first, unsigned last)
{
    return rc::gen::map(rc::gen::inRange(first, last + 1), [](unsigned c) { return fromCodePoint(c); });
}

/// Characters that mean something in an IRI, or to a careless parser.
inline rc::Gen<Piece> notableCharacter()
{
    return rc::gen::map(rc::gen::elementOf(std::u16string(u"%!#?[];=+&@: '\"()*,$~-_.<>\\^`{|}")),
                        [](char16_t c) { return Piece(1, c); });
}

inline rc::Gen<Piece> validEscape()
{
    return rc::gen::element<Piece>(u"%41", u"%2F", u"%2f", u"%25", u"%20", u"%21", u"%3A", u"%3F", u"%23", u"%00",
                                   u"%7f", u"%2E", u"%C3%A9", u"%c3%a9", u"%E4%BD%A0", u"%F0%9F%98%80", u"%EF%BF%BE");
}

/// No escapes at all, and escapes of bytes that are no UTF-8.
inline rc::Gen<Piece> invalidEscape()
{
    return rc::gen::element<Piece>(u"%", u"%%", u"%4", u"%zz", u"%4z", u"%u0041", u"%FF", u"%C3", u"%80", u"%C0%AF",
                                   u"%E0%80%AF", u"%ED%A0%80", u"%F4%90%80%80", u"%F8%88%80%80%80");
}

/// Latin, combining marks, Hangul, CJK, and what lies beyond U+FFFF.
inline rc::Gen<Piece> foreignCharacter()
{
    return rc::gen::oneOf(codePointIn(0xA0, 0x24F), codePointIn(0x300, 0x36F), codePointIn(0xAC00, 0xD7A3),
                          codePointIn(0x4E00, 0x9FFF), codePointIn(0x1F300, 0x1F6FF), codePointIn(0x20000, 0x2A6DF));
}

/// Controls, private use, noncharacters, tags, format characters, and the ends of every range.
inline rc::Gen<Piece> oddCharacter()
{
    static std::vector<unsigned> const odd{
        0x1,    0x9,    0xA,     0x1F,    0x7F,    0x80,    0x85,    0x9F,    0xAD,     0x200D,   0x202E,
        0xD7FF, 0xE000, 0xEF80,  0xEFFF,  0xF8FF,  0xFDCF,  0xFDD0,  0xFEFF,  0xFFEF,   0xFFF0,   0xFFFD,
        0xFFFE, 0xFFFF, 0x10000, 0x1FFFE, 0xE0001, 0xE1000, 0xEFFFD, 0xF0000, 0x10FFFD, 0x10FFFE, 0x10FFFF};
    return rc::gen::map(rc::gen::elementOf(odd), [](unsigned c) { return fromCodePoint(c); });
}

inline rc::Gen<Piece> plainCharacter()
{
    return codePointIn(0x21, 0x7E);
}

/// A piece of a file name: anything but '/' and U+0000.
inline rc::Gen<Piece> namePiece()
{
    auto const noSlash = rc::gen::suchThat(plainCharacter(), [](Piece const& piece) { return piece != u"/"; });
    return rc::gen::weightedOneOf<Piece>({{4, notableCharacter()},
                                          {3, noSlash},
                                          {2, validEscape()},
                                          {2, invalidEscape()},
                                          {2, foreignCharacter()},
                                          {1, oddCharacter()}});
}

inline rc::Gen<Piece> anyPiece()
{
    return rc::gen::weightedOneOf<Piece>(
        {{12, namePiece()}, {2, rc::gen::just(Piece(u"/"))}, {1, rc::gen::just(Piece(1, u'\0'))}});
}

inline rc::Gen<Text> join(rc::Gen<std::vector<Piece>> pieces)
{
    return rc::gen::map(std::move(pieces), [](std::vector<Piece> const& parts) {
        return Text{std::accumulate(parts.begin(), parts.end(), std::u16string())};
    });
}

/// Short texts find the same faults as long ones, sooner.
inline rc::Gen<std::vector<Piece>> several(rc::Gen<Piece> piece)
{
    return rc::gen::scale(0.2, rc::gen::container<std::vector<Piece>>(std::move(piece)));
}

} // namespace detail

/// Any valid UTF-16.
inline rc::Gen<Text> anyText()
{
    return detail::join(detail::several(detail::anyPiece()));
}

/// Text with a surrogate that is not part of a pair.
inline rc::Gen<Text> brokenText()
{
    auto const lone = rc::gen::element<char16_t>(0xD800, 0xDBFF, 0xDC00, 0xDFFF);
    auto const text =
        rc::gen::tuple(detail::several(detail::plainCharacter()), lone, detail::several(detail::plainCharacter()));
    return rc::gen::map(text, [](auto const& parts) {
        std::vector<detail::Piece> pieces = std::get<0>(parts);
        pieces.push_back(detail::Piece(1, std::get<1>(parts)));
        pieces.insert(pieces.end(), std::get<2>(parts).begin(), std::get<2>(parts).end());
        return Text{std::accumulate(pieces.begin(), pieces.end(), std::u16string())};
    });
}

/// A name that a disk can hold: not empty, without '/' and U+0000. "." and ".." are among them.
inline rc::Gen<Text> fileName()
{
    auto const any = detail::join(rc::gen::nonEmpty(detail::several(detail::namePiece())));
    auto const known = rc::gen::element<std::u16string>(u".", u"..", u"...", u".a", u"a.", u" ", u"%", u"a:b", u"x!",
                                                        u"%2E%2E", u"~", u"a[1]", u"::", u"a?b#c");
    return rc::gen::weightedOneOf<Text>(
        {{4, any}, {1, rc::gen::map(known, [](std::u16string const& name) { return Text{name}; })}});
}

namespace detail {

inline rc::Gen<Text> joinPath(rc::Gen<Text> segment, bool hasEmptySegments)
{
    auto const empty = rc::gen::just(Text{});
    auto const segments = hasEmptySegments ? rc::gen::weightedOneOf<Text>({{4, segment}, {1, empty}}) : segment;
    return rc::gen::map(rc::gen::scale(0.08, rc::gen::container<std::vector<Text>>(segments)),
                        [](std::vector<Text> const& names) {
                            std::u16string path = names.empty() ? u"/" : u"";
                            for (Text const& name : names)
                                path.append(u"/").append(name.value);
                            return Text{path};
                        });
}

} // namespace detail

/// A plain absolute path without empty segments, so that none but the root ends with '/'.
inline rc::Gen<Text> normalPath()
{
    return detail::joinPath(fileName(), false);
}

/// A plain absolute path; '/' may be doubled and stand at the end.
inline rc::Gen<Text> absolutePath()
{
    return detail::joinPath(fileName(), true);
}

inline rc::Gen<Text> concatenate(rc::Gen<Text> left, rc::Gen<Text> right)
{
    return rc::gen::map(rc::gen::pair(std::move(left), std::move(right)),
                        [](auto const& parts) { return Text{parts.first.value + parts.second.value}; });
}

/// A well-formed scheme.
inline rc::Gen<Text> scheme()
{
    auto const letter = rc::gen::elementOf(std::u16string(u"abcxyzABCXYZ"));
    auto const other = rc::gen::elementOf(std::u16string(u"azAZ09+-."));
    auto const rest = rc::gen::scale(0.1, rc::gen::container<std::u16string>(other));
    return rc::gen::map(rc::gen::pair(letter, rest), [](std::pair<char16_t, std::u16string> const& parts) {
        return Text{parts.first + parts.second};
    });
}

/// An authority as it is written in an IRI.
inline rc::Gen<Text> authority()
{
    return rc::gen::map(rc::gen::element<std::u16string>(u"", u"h", u"Host.example", u"h:8080", u"h:", u"u@h",
                                                         u"u:p%40@h:1", u"@h", u"[::1]", u"[fe80::1%25eth0]:22",
                                                         u"192.0.2.1", u"h%C3%A9", u"h\u00E9", u"%FF", u"a%2Fb",
                                                         u"h%3A1", u"!$&'()*+,;=", u"h:x"),
                        [](std::u16string const& text) { return Text{text}; });
}

namespace detail {

/// `text` between `before` and `after`, or nothing at all.
inline rc::Gen<Text> maybe(std::u16string const& before, rc::Gen<Text> text, std::u16string const& after)
{
    auto const present =
        rc::gen::map(std::move(text), [before, after](Text const& part) { return Text{before + part.value + after}; });
    return rc::gen::oneOf(rc::gen::just(Text{}), present);
}

} // namespace detail

/// The text of an IRI or relative reference, with or without each of its components.
inline rc::Gen<Text> iriText()
{
    using namespace detail;
    auto const slashed = rc::gen::map(authority(), [](Text const& text) { return Text{u"//" + text.value}; });
    auto const path = rc::gen::oneOf(anyText(), absolutePath(), concatenate(slashed, maybe(u"", absolutePath(), u"")));
    return concatenate(concatenate(maybe(u"", scheme(), u":"), path),
                       concatenate(maybe(u"?", anyText(), u""), maybe(u"#", anyText(), u"")));
}

} // namespace foundation::tests::support
