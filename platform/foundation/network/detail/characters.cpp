#include <foundation/network/detail/characters.hpp>

#include <foundation/network/wide.hpp>

#include <algorithm>
#include <optional>

namespace foundation::network::detail {

namespace {

constexpr void mark(std::array<CharacterClass, 256>& classes, std::string_view characters, unsigned bits)
{
    for (char const c : characters)
        classes[static_cast<unsigned char>(c)] |= static_cast<CharacterClass>(bits);
}

constexpr std::array<CharacterClass, 256> makeClasses()
{
    std::array<CharacterClass, 256> classes{};
    constexpr unsigned data = inUserInfo | inHost | inPath | inQuery | inFragment | inIPLiteral;
    for (unsigned c = 0; c <= ' '; ++c)
        classes[c] = impossible;
    for (unsigned c = 0x7F; c <= 0x9F; ++c)
        classes[c] = impossible;
    mark(classes, "\"<>\\^`{|}", impossible);
    mark(classes, "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz", alpha | schemeCharacter | data);
    mark(classes, "0123456789+-.", schemeCharacter | data);
    mark(classes, "_~!$&'()*,;=", data);
    mark(classes, ":", inUserInfo | inPath | inQuery | inFragment | inIPLiteral);
    mark(classes, "@", inPath | inQuery | inFragment);
    mark(classes, "/", inPath | inQuery | inFragment | endsAuthority);
    mark(classes, "?", inQuery | inFragment | endsAuthority | endsPath);
    mark(classes, "#", endsAuthority | endsPath);
    mark(classes, "%", percent);
    return classes;
}

/// RFC 3987, section 2.2.
bool isUcschar(char32_t c)
{
    if (c < 0x10000)
        return (c >= 0xA0 && c <= 0xD7FF) || (c >= 0xF900 && c <= 0xFDCF) || (c >= 0xFDF0 && c <= 0xFFEF);
    return c <= 0xEFFFD && (c & 0xFFFF) <= 0xFFFD && (c < 0xE0000 || c >= 0xE1000);
}

/// RFC 3987, section 2.2.
bool isIprivate(char32_t c)
{
    return (c >= 0xE000 && c <= 0xF8FF) || (c >= 0xF0000 && c <= 0x10FFFD && (c & 0xFFFF) <= 0xFFFD);
}

int hexValue(char16_t c)
{
    if (c >= u'0' && c <= u'9')
        return c - u'0';
    if (c >= u'a' && c <= u'f')
        return c - u'a' + 10;
    return c >= u'A' && c <= u'F' ? c - u'A' + 10 : -1;
}

void appendEscape(std::u16string& text, unsigned byte)
{
    constexpr std::u16string_view digits = u"0123456789ABCDEF";
    text += u'%';
    text += digits[(byte >> 4) & 0xF];
    text += digits[byte & 0xF];
}

/// The escapes of the UTF-8 bytes of a code point.
void appendEscaped(std::u16string& text, char32_t c)
{
    if (c < 0x80) {
        appendEscape(text, c);
        return;
    }
    unsigned const following = c < 0x800 ? 1 : c < 0x10000 ? 2 : 3;
    appendEscape(text, ((0xFF00U >> (following + 1)) & 0xFF) | (c >> (6 * following)));
    for (unsigned left = following; left-- > 0;)
        appendEscape(text, 0x80 | ((c >> (6 * left)) & 0x3F));
}

void appendASCII(std::u16string& text, std::wstring_view characters)
{
    std::size_t const size = text.size();
    text.resize(size + characters.size());
    std::transform(characters.begin(), characters.end(), text.data() + size,
                   [](wchar_t c) { return static_cast<char16_t>(c); });
}

/// The byte of the escape at `position`, if there is one.
std::optional<unsigned> escapedByte(std::u16string_view text, std::size_t position)
{
    if (!isEscape(text, position))
        return std::nullopt;
    return static_cast<unsigned>(hexValue(text[position + 1]) * 16 + hexValue(text[position + 2]));
}

struct Decoded
{
    char32_t codePoint = 0;
    std::size_t bytes = 0; ///< 0 when the escapes are no valid UTF-8
};

/// Decodes the UTF-8 sequence that the escapes at the front of `text` hold (RFC 3629, section 4).
Decoded decodeSequence(std::u16string_view text)
{
    constexpr char32_t smallest[] = {0, 0x80, 0x800, 0x10000};
    unsigned const lead = escapedByte(text, 0).value_or(0xFF);
    if (lead < 0x80)
        return {lead, 1};
    std::size_t const following = lead >= 0xC2 && lead < 0xE0 ? 1
                                  : (lead & 0xF0) == 0xE0     ? 2
                                  : (lead & 0xF8) == 0xF0     ? 3
                                                              : 0;
    if (following == 0)
        return {};
    char32_t codePoint = lead & (0x3FU >> following);
    for (std::size_t i = 1; i <= following; ++i) {
        unsigned const byte = escapedByte(text, 3 * i).value_or(0);
        if ((byte & 0xC0) != 0x80)
            return {};
        codePoint = (codePoint << 6) | (byte & 0x3F);
    }
    if (codePoint < smallest[following] || codePoint > 0x10FFFF || isSurrogate(codePoint))
        return {};
    return {codePoint, following + 1};
}

bool allEscapesAreWellFormed(std::u16string_view text)
{
    for (std::size_t i = text.find(u'%'); i != std::u16string_view::npos; i = text.find(u'%', i + 3)) {
        if (!isEscape(text, i))
            return false;
    }
    return true;
}

} // namespace

constinit std::array<CharacterClass, 256> const characterClasses = makeClasses();

bool isEscape(std::u16string_view text, std::size_t position)
{
    return position + 2 < text.size() && text[position] == u'%' && hexValue(text[position + 1]) >= 0 &&
           hexValue(text[position + 2]) >= 0;
}

CharacterClass classesOf(std::u16string_view text)
{
    unsigned classes = 0;
    for (char16_t const c : text) {
        if (c < characterClasses.size())
            classes |= characterClasses[c];
        else if (isSurrogate(c))
            classes |= surrogate;
    }
    return static_cast<CharacterClass>(classes);
}

std::u16string encodeImpossible(std::u16string text, CharacterClass present)
{
    if ((present & surrogate) != 0)
        static_cast<void>(toWide(text));
    if ((present & impossible) == 0 && ((present & percent) == 0 || allEscapesAreWellFormed(text)))
        return text;
    std::u16string result;
    result.reserve(text.size() + 16);
    for (std::size_t i = 0; i != text.size(); ++i) {
        char16_t const c = text[i];
        if (isOf(c, impossible) || (c == u'%' && !isEscape(text, i)))
            appendEscaped(result, c);
        else
            result += c;
    }
    return result;
}

void appendEncoded(std::u16string& text, std::wstring_view plain, CharacterClass allowed)
{
    auto const isAllowed = [allowed](wchar_t c) { return isOf(static_cast<char32_t>(c), allowed); };
    bool const isQuery = (allowed & inQuery) != 0;
    while (!plain.empty()) {
        auto const stop = std::find_if_not(plain.begin(), plain.end(), isAllowed);
        appendASCII(text, std::wstring_view(plain.begin(), stop));
        if (stop == plain.end())
            return;
        char32_t const c = static_cast<char32_t>(*stop);
        requireScalarValue(c);
        if (isUcschar(c) || (isQuery && isIprivate(c)))
            appendCodePoint(text, c);
        else
            appendEscaped(text, c);
        plain = std::wstring_view(stop + 1, plain.end());
    }
}

std::u16string decodeEscapes(std::u16string_view text)
{
    std::u16string result;
    result.reserve(text.size());
    for (std::size_t next = text.find(u'%'); next != std::u16string_view::npos; next = text.find(u'%')) {
        result += text.substr(0, next);
        text.remove_prefix(next);
        Decoded const decoded = decodeSequence(text);
        appendCodePoint(result, decoded.bytes != 0 ? decoded.codePoint : u'%');
        text.remove_prefix(std::max<std::size_t>(3 * decoded.bytes, 1));
    }
    result += text;
    return result;
}

} // namespace foundation::network::detail
