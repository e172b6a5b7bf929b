#include <fl/i18n/utf8.hpp>

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

namespace fl::i18n {
namespace {

std::u16string repeated(std::size_t count)
{
    return std::u16string(count, u'\uFFFD');
}

std::u16string utf16Of(char32_t codePoint)
{
    if (codePoint < 0x10000) {
        return {static_cast<char16_t>(codePoint)};
    }
    char32_t const offset = codePoint - 0x10000;
    return {static_cast<char16_t>(0xD800 + offset / 0x400), static_cast<char16_t>(0xDC00 + offset % 0x400)};
}

// The definition of UTF-8 in RFC 3629, section 3, in arithmetic.
std::string utf8Of(char32_t codePoint)
{
    auto const tail = [codePoint](unsigned place) { return static_cast<char>(0x80 + codePoint / place % 0x40); };
    auto const head = [codePoint](unsigned mark, unsigned place) {
        return static_cast<char>(mark + codePoint / place);
    };
    if (codePoint < 0x80) {
        return {static_cast<char>(codePoint)};
    }
    if (codePoint < 0x800) {
        return {head(0xC0, 0x40), tail(1)};
    }
    if (codePoint < 0x10000) {
        return {head(0xE0, 0x1000), tail(0x40), tail(1)};
    }
    return {head(0xF0, 0x40000), tail(0x1000), tail(0x40), tail(1)};
}

rc::Gen<std::u16string> anyUtf16()
{
    return rc::gen::arbitrary<std::u16string>();
}

struct Sample
{
    std::string utf8;
    std::u16string utf16;
};

TEST(Utf8, ConvertsEveryCodePointBothWays)
{
    for (char32_t codePoint = 0; codePoint <= 0x10FFFF; ++codePoint) {
        if (codePoint == 0xD800) {
            codePoint = 0xE000;
        }
        ASSERT_EQ(to_utf8(utf16Of(codePoint), Malformed::Throw), utf8Of(codePoint));
        ASSERT_EQ(from_utf8(utf8Of(codePoint), Malformed::Throw), utf16Of(codePoint));
    }
}

TEST(Utf8, TakesMalformedBytesByMaximalSubparts)
{
    for (auto const& [utf8, utf16] : std::vector<Sample>{
             {"\x80", repeated(1)},
             {"\xBF\x80", repeated(2)},
             {"\xFE\xFF", repeated(2)},
             {"\xC3", repeated(1)},
             {"\xC3/", repeated(1) + u"/"},
             {"\xE4\xB8", repeated(1)},
             {"\xF0\x9F\x93", repeated(1)},
             {"\xF0\x9F\x93\xF0\x9F\x93\x81", repeated(1) + u"\U0001F4C1"},
             {"\xC0\xAF\xE0\x80\xBF\xF0\x81\x82"
              "A",
              repeated(8) + u"A"},
             {"\xED\xA0\x80\xED\xBF\xBF\xED\xAF"
              "A",
              repeated(8) + u"A"},
             {"\xF4\x91\x92\x93\xFF"
              "A\x80\xBF"
              "B",
              repeated(5) + u"A" + repeated(2) + u"B"},
             {"\xE1\x80\xE2\xF0\x91\x92\xF1\xBF"
              "A",
              repeated(4) + u"A"},
             {"\xF5\x80\x80\x80", repeated(4)},
         })
    {
        EXPECT_EQ(from_utf8(utf8, Malformed::Replace), utf16);
        EXPECT_THROW(static_cast<void>(from_utf8(utf8, Malformed::Throw)), std::range_error);
    }
}

// A sequence is well formed exactly when some code point is encoded so.
bool isWellFormed(std::string const& bytes)
{
    auto const bits = [&](std::size_t at, unsigned mask) { return static_cast<unsigned char>(bytes[at]) & mask; };
    char32_t codePoint = bits(0, bytes.size() == 2 ? 0x1F : bytes.size() == 3 ? 0x0F : 0x07);
    for (std::size_t at = 1; at < bytes.size(); ++at) {
        codePoint = codePoint * 0x40 + bits(at, 0x3F);
    }
    bool const isScalar = codePoint <= 0x10FFFF && (codePoint < 0xD800 || codePoint > 0xDFFF);
    return isScalar && utf8Of(codePoint) == bytes;
}

bool isOneCodePoint(std::u16string const& text)
{
    bool const isPair = text.size() == 2 && text[0] >= 0xD800 && text[0] <= 0xDBFF;
    return (isPair || text.size() == 1) && text[0] != u'\uFFFD';
}

TEST(Utf8, AcceptsExactlyTheWellFormedSequences)
{
    std::string const edges = "\x7F\x80\x8F\x90\x9F\xA0\xBF\xC0\xFF";
    for (int lead = 0x80; lead <= 0xFF; ++lead) {
        for (std::size_t code = 0; code < 9 * 9 * 9; ++code) {
            std::string const full = {static_cast<char>(lead), edges[code % 9], edges[code / 9 % 9], edges[code / 81]};
            for (std::size_t const length : {2u, 3u, 4u}) {
                std::string const bytes = full.substr(0, length);
                bool const isOneCharacter = isOneCodePoint(from_utf8(bytes, Malformed::Replace));
                ASSERT_EQ(isOneCharacter, isWellFormed(bytes)) << lead << ' ' << code << ' ' << length;
            }
        }
    }
}

TEST(Utf8, RefusesOrReplacesLoneSurrogates)
{
    for (auto const& [utf8, utf16] : std::vector<Sample>{
             {"\xEF\xBF\xBD", {char16_t{0xD800}}},
             {"\xEF\xBF\xBD", {char16_t{0xDFFF}}},
             {"a\xEF\xBF\xBD"
              "b",
              {u'a', char16_t{0xDBFF}, u'b'}},
             {"\xEF\xBF\xBD\xF0\x90\x80\x80", {char16_t{0xD800}, char16_t{0xD800}, char16_t{0xDC00}}},
             {"\xEF\xBF\xBD\xEF\xBF\xBD", {char16_t{0xDC00}, char16_t{0xD800}}},
         })
    {
        EXPECT_EQ(to_utf8(utf16, Malformed::Replace), utf8);
        EXPECT_THROW(static_cast<void>(to_utf8(utf16, Malformed::Throw)), std::range_error);
    }
}

TEST(Utf8, ConvertsTextsOfAnyLength)
{
    for (std::size_t const length : {0u, 1u, 15u, 16u, 17u, 341u, 342u, 1023u, 1024u, 1025u, 100000u}) {
        std::u16string utf16(length, u'x');
        std::string utf8(length, 'x');
        EXPECT_EQ(to_utf8(utf16, Malformed::Throw), utf8);
        EXPECT_EQ(from_utf8(utf8, Malformed::Throw), utf16);
        utf16 += std::u16string(length, u'\u4E2D');
        for (std::size_t done = 0; done < length; ++done) {
            utf8 += "\xE4\xB8\xAD";
        }
        EXPECT_EQ(to_utf8(utf16, Malformed::Throw), utf8);
        EXPECT_EQ(from_utf8(utf8, Malformed::Throw), utf16);
    }
}

TEST(Utf8, KeepsNul)
{
    EXPECT_EQ(to_utf8(std::u16string(3, u'\0'), Malformed::Throw), std::string(3, '\0'));
    EXPECT_EQ(from_utf8(std::string(3, '\0'), Malformed::Throw), std::u16string(3, u'\0'));
}

RC_GTEST_PROP(Utf8, ReplacingIsTheIdentityOnWhatStrictAccepts, ())
{
    std::u16string const text = *anyUtf16();
    std::string const utf8 = to_utf8(text, Malformed::Replace);
    std::u16string const mended = from_utf8(utf8, Malformed::Throw);
    RC_ASSERT(mended.size() == text.size());
    RC_ASSERT(to_utf8(mended, Malformed::Throw) == utf8);
}

RC_GTEST_PROP(Utf8, AnyBytesBecomeWellFormedText, (std::string const& bytes))
{
    std::u16string const text = from_utf8(bytes, Malformed::Replace);
    RC_ASSERT(from_utf8(to_utf8(text, Malformed::Throw), Malformed::Throw) == text);
}

} // namespace
} // namespace fl::i18n
