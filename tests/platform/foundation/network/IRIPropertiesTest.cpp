#include <foundation/network/IRI.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <algorithm>
#include <cctype>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>

#include <fl/i18n/convert.hpp>
#include <foundation/network/IRIArgs.hpp>
#include <foundation/network/wide.hpp>
#include <tests/support/generators.hpp>

// The rules of IRI text hold for all text. What they promise is worked out here once more, in another way, and
// compared.

namespace foundation::network {
namespace {

using iri::Encoding;
using tests::support::shown;
using tests::support::Text;

bool isHex(char16_t c)
{
    return c < 0x80 && std::isxdigit(static_cast<int>(c)) != 0;
}

std::string byteOf(std::u16string_view escape)
{
    return std::string(1, static_cast<char>(std::stoi(std::string(escape.begin() + 1, escape.end()), nullptr, 16)));
}

bool isEscapeAt(std::u16string_view text, std::size_t position)
{
    std::u16string_view const three = text.substr(position, 3);
    return three.size() == 3 && three[0] == u'%' && isHex(three[1]) && isHex(three[2]);
}

std::u16string escaped(std::u16string const& text)
{
    std::u16string result;
    for (char const c : fl::i18n::to_string(text)) {
        auto const byte = static_cast<unsigned char>(c);
        constexpr std::u16string_view digits = u"0123456789ABCDEF";
        ((result += u'%') += digits[byte / 16]) += digits[byte % 16];
    }
    return result;
}

std::u16string withImpossibleEscaped(std::u16string_view text)
{
    std::u16string result;
    for (std::size_t i = 0; i != text.size(); ++i) {
        char16_t const c = text[i];
        bool const impossible = c <= 0x20 || (c >= 0x7F && c <= 0x9F) ||
                                std::u16string_view(u"\"<>\\^`{|}").find(c) != std::u16string_view::npos ||
                                (c == u'%' && !isEscapeAt(text, i));
        result += impossible ? escaped(std::u16string(1, c)) : std::u16string(1, c);
    }
    return result;
}

/// The one character that `count` escapes from the front of `text` stand for, if they are its UTF-8.
std::optional<std::u16string> characterOf(std::u16string_view text, std::size_t count)
{
    std::string bytes;
    for (std::size_t i = 0; i != count; ++i) {
        if (3 * i >= text.size() || !isEscapeAt(text, 3 * i))
            return std::nullopt;
        bytes += byteOf(text.substr(3 * i, 3));
    }
    try {
        std::u16string const decoded = fl::i18n::to_ustring(bytes);
        return toWide(decoded).size() == 1 ? std::optional(decoded) : std::nullopt;
    } catch (std::range_error const&) {
        return std::nullopt;
    }
}

std::u16string plainTextOf(std::u16string_view written)
{
    std::u16string result;
    while (!written.empty()) {
        std::size_t taken = 1;
        std::u16string next(written.substr(0, 1));
        for (std::size_t count = 1; count <= 4; ++count) {
            if (auto const character = characterOf(written, count)) {
                next = *character;
                taken = 3 * count;
                break;
            }
        }
        result += next;
        written.remove_prefix(taken);
    }
    return result;
}

/// RFC 3987, section 2.2: ipchar and '/'.
bool mayStandInAPath(char32_t c)
{
    static constexpr std::pair<char32_t, char32_t> ucschar[] = {
        {0xA0, 0xD7FF},     {0xF900, 0xFDCF},   {0xFDF0, 0xFFEF},   {0x10000, 0x1FFFD}, {0x20000, 0x2FFFD},
        {0x30000, 0x3FFFD}, {0x40000, 0x4FFFD}, {0x50000, 0x5FFFD}, {0x60000, 0x6FFFD}, {0x70000, 0x7FFFD},
        {0x80000, 0x8FFFD}, {0x90000, 0x9FFFD}, {0xA0000, 0xAFFFD}, {0xB0000, 0xBFFFD}, {0xC0000, 0xCFFFD},
        {0xD0000, 0xDFFFD}, {0xE1000, 0xEFFFD}};
    if (c < 0x80)
        return std::isalnum(static_cast<int>(c)) != 0 ||
               (c != 0 && std::string_view("-._~!$&'()*+,;=:@/").find(static_cast<char>(c)) != std::string_view::npos);
    return std::any_of(std::begin(ucschar), std::end(ucschar),
                       [c](auto const& range) { return c >= range.first && c <= range.second; });
}

std::u16string writtenPathOf(std::u16string const& plain)
{
    std::u16string result;
    for (wchar_t const c : toWide(plain)) {
        std::u16string const character = fromWide(std::wstring(1, c));
        result += mayStandInAPath(static_cast<char32_t>(c)) ? character : escaped(character);
    }
    return result;
}

std::optional<std::size_t> schemeLength(std::u16string_view text)
{
    std::size_t const colon = text.find(u':');
    if (colon == std::u16string_view::npos || colon == 0)
        return std::nullopt;
    auto const isLetter = [](char16_t c) { return c < 0x80 && std::isalpha(static_cast<int>(c)) != 0; };
    auto const isOther = [&](char16_t c) {
        return isLetter(c) || (c >= u'0' && c <= u'9') || c == u'+' || c == u'-' || c == u'.';
    };
    std::u16string_view const scheme = text.substr(0, colon);
    return isLetter(scheme[0]) && std::all_of(scheme.begin(), scheme.end(), isOther) ? std::optional(colon)
                                                                                     : std::nullopt;
}

IRIArgs record(std::u16string const& scheme, bool hasAuthority, std::u16string const& path)
{
    IRIArgs args;
    args.scheme = toWide(scheme);
    args.hasScheme = !scheme.empty();
    args.hasHost = hasAuthority;
    args.path = toWide(path);
    args.hasPath = true;
    return args;
}

RC_GTEST_PROP(IRIText, IsKeptAsWrittenButForWhatNoIriMayHold, ())
{
    Text const text = *tests::support::iriText();
    RC_ASSERT(shown(IRI(text.value).toString()) == shown(withImpossibleEscaped(text.value)));
}

RC_GTEST_PROP(IRIText, IsAFixedPointOfParsingAndPrinting, ())
{
    std::u16string const printed = IRI((*tests::support::iriText()).value).toString();
    RC_ASSERT(shown(IRI(printed).toString()) == shown(printed));
}

RC_GTEST_PROP(IRIText, WithALoneSurrogateIsRefused, ())
{
    Text const text = *tests::support::brokenText();
    RC_ASSERT_THROWS_AS(IRI{text.value}, std::out_of_range);
    RC_ASSERT_THROWS_AS(IRI{u"s://h/%41\u0085" + text.value}, std::out_of_range);
}

RC_GTEST_PROP(IRIText, IsAbsoluteExactlyWithAScheme, ())
{
    IRI const iri((*tests::support::iriText()).value);
    std::u16string const text = iri.toString();
    auto const length = schemeLength(text);
    RC_CLASSIFY(length.has_value());
    RC_ASSERT(iri.isAbsolute() == length.has_value());
    RC_ASSERT(shown(iri.getScheme()) == shown(text.substr(0, length.value_or(0))));
}

RC_GTEST_PROP(IRIText, IsOpaqueExactlyWhenAbsoluteAndNoSlashFollowsTheScheme, ())
{
    IRI const iri((*tests::support::iriText()).value);
    std::u16string const rest = iri.getSchemeSpecificPart(Encoding::Decoded);
    RC_CLASSIFY(iri.isOpaque());
    RC_ASSERT(iri.isOpaque() == (iri.isAbsolute() && !rest.starts_with(u'/')));
}

RC_GTEST_PROP(IRIText, SchemeSpecificPartIsAsWrittenUnderBothSelectors, ())
{
    IRI const iri((*tests::support::iriText()).value);
    auto const length = schemeLength(iri.toString());
    std::u16string const expected = iri.toString().substr(length ? *length + 1 : 0);
    RC_ASSERT(shown(iri.getSchemeSpecificPart(Encoding::Decoded)) == shown(expected));
    RC_ASSERT(shown(iri.getSchemeSpecificPart(Encoding::Encoded)) == shown(expected));
}

RC_GTEST_PROP(IRIText, SelectorZeroDecodesEscapesOfValidUtf8AndNoOthers, ())
{
    IRI const iri((*tests::support::iriText()).value);
    RC_ASSERT(shown(iri.getPath(Encoding::Decoded)) == shown(plainTextOf(iri.getPath(Encoding::Encoded))));
    RC_ASSERT(shown(iri.getHost(Encoding::Decoded)) == shown(plainTextOf(iri.getHost(Encoding::Encoded))));
}

RC_GTEST_PROP(IRIText, ComponentsAreSplitAtTheirDelimiters, ())
{
    std::u16string const start = u"s://" + (*tests::support::authority()).value;
    std::u16string const path = writtenPathOf((*tests::support::absolutePath()).value);
    std::u16string const query = *rc::gen::element<std::u16string>(u"", u"?", u"?q/?%3F", u"#", u"?#", u"#/?x");
    IRI const iri(start + path + query);
    RC_ASSERT(shown(iri.getPath(Encoding::Encoded)) == shown(path));
    RC_ASSERT(iri.hasHost());
}

RC_GTEST_PROP(IRIRecord, EncodesThePathAsItMayBeWritten, ())
{
    Text const path = *tests::support::absolutePath();
    RC_ASSERT(shown(IRI(record(u"s", true, path)).toString()) == shown(u"s://" + writtenPathOf(path)));
    RC_ASSERT(shown(iri::encodePath(path.value)) == shown(writtenPathOf(path)));
}

RC_GTEST_PROP(IRIRecord, KeepsEveryPlainPath, ())
{
    bool const hasAuthority = *rc::gen::arbitrary<bool>();
    std::u16string const scheme = *rc::gen::element<std::u16string>(u"s", u"");
    Text const path = *(hasAuthority ? tests::support::absolutePath()
                                     : rc::gen::oneOf(tests::support::absolutePath(), tests::support::anyText()));
    IRI const iri(record(scheme, hasAuthority, path));
    RC_ASSERT(shown(iri.getPath(Encoding::Decoded)) == shown(path.value));
    RC_ASSERT(iri.hasHost() == hasAuthority);
    RC_ASSERT(shown(iri.getScheme()) == shown(scheme));
}

RC_GTEST_PROP(IRIRecord, KeepsThePlainTextOfEveryOtherComponent, ())
{
    IRIArgs args = record(u"s", true, u"/");
    args.userInfo = toWide((*tests::support::anyText()).value);
    args.host = toWide((*tests::support::anyText()).value);
    args.query = toWide((*tests::support::anyText()).value);
    args.fragment = toWide((*tests::support::anyText()).value);
    args.hasUserInfo = args.hasQuery = args.hasFragment = true;
    IRIArgs const again{IRI(args)};
    RC_ASSERT(shown(fromWide(again.userInfo)) == shown(fromWide(args.userInfo)));
    RC_ASSERT(shown(fromWide(again.host)) == shown(fromWide(args.host)));
    RC_ASSERT(shown(fromWide(again.query)) == shown(fromWide(args.query)));
    RC_ASSERT(shown(fromWide(again.fragment)) == shown(fromWide(args.fragment)));
}

RC_GTEST_PROP(IRIRecord, OfAnIriMakesAnIriOfTheSamePlainText, ())
{
    IRIArgs const first{IRI((*tests::support::iriText()).value)};
    IRI const rebuilt{first};
    IRIArgs const second{rebuilt};
    RC_LOG() << shown(rebuilt.toString()) << '\n';
    RC_ASSERT(second.scheme == first.scheme);
    RC_ASSERT(second.userInfo == first.userInfo);
    RC_ASSERT(second.host == first.host);
    RC_ASSERT(second.path == first.path);
    RC_ASSERT(second.query == first.query);
    RC_ASSERT(second.fragment == first.fragment);
    RC_ASSERT(second.port == first.port);
    RC_ASSERT(second.hasScheme == first.hasScheme);
    RC_ASSERT(second.hasUserInfo == first.hasUserInfo);
    RC_ASSERT(second.hasHost == first.hasHost);
    RC_ASSERT(second.hasPort == first.hasPort);
    RC_ASSERT(second.hasQuery == first.hasQuery);
    RC_ASSERT(second.hasFragment == first.hasFragment);
}

RC_GTEST_PROP(IRIRecord, PrintsTextThatIsAFixedPoint, ())
{
    IRIArgs args{IRI((*tests::support::iriText()).value)};
    args.pathIsEncoded = *rc::gen::arbitrary<bool>();
    std::u16string const printed = IRI(args).toString();
    RC_ASSERT(shown(IRI(printed).toString()) == shown(printed));
}

RC_GTEST_PROP(IRIText, LosesOneWrittenTrailingSlashAndNothingElse, ())
{
    std::u16string const start = *rc::gen::element<std::u16string>(u"s://h", u"s://", u"s:/x");
    std::u16string const path = u"/" + withImpossibleEscaped((*tests::support::fileName()).value);
    std::u16string const rest = *rc::gen::element<std::u16string>(u"", u"?q/", u"#f/");
    RC_PRE(path.find_first_of(u"?#") == std::u16string::npos);
    RC_ASSERT(shown(IRI(start + path + u"/" + rest).withoutTrailingSlash().toString()) == shown(start + path + rest));
    RC_ASSERT(shown(IRI(start + path + rest).withoutTrailingSlash().toString()) == shown(start + path + rest));
}

} // namespace
} // namespace foundation::network
