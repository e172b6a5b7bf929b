#include <fl/i18n/detail/transcode.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <string_view>
#include <vector>

namespace fl::i18n::detail {
namespace {

TEST(Transcode, DecodesOneCodePointFromUtf8)
{
    CodePoint const decoded = decode_utf8("\xE4\xB8\xAD"
                                          "x");
    EXPECT_TRUE(decoded.isValid);
    EXPECT_EQ(decoded.value, U'\u4E2D');
    EXPECT_EQ(decoded.length, 3u);
}

TEST(Transcode, MeasuresAMalformedStartOfUtf8)
{
    CodePoint const decoded = decode_utf8("\xF0\x9F\x93"
                                          "x");
    EXPECT_FALSE(decoded.isValid);
    EXPECT_EQ(decoded.length, 3u);
}

TEST(Transcode, DecodesASurrogatePair)
{
    CodePoint const decoded = decode_utf16(u"\U0001F4C1x");
    EXPECT_TRUE(decoded.isValid);
    EXPECT_EQ(decoded.value, U'\U0001F4C1');
    EXPECT_EQ(decoded.length, 2u);
}

TEST(Transcode, GivesTheValueOfALoneSurrogate)
{
    CodePoint const decoded = decode_utf16(std::u16string{char16_t{0xDBFF}, u'x'});
    EXPECT_FALSE(decoded.isValid);
    EXPECT_EQ(decoded.value, char32_t{0xDBFF});
    EXPECT_EQ(decoded.length, 1u);
}

TEST(Transcode, CallsBackForEverythingBeyondAsciiWithItsBytes)
{
    std::vector<std::string> seen;
    auto const collect = [&seen](CodePoint const&, std::string_view bytes, char16_t* out) {
        seen.emplace_back(bytes);
        return out;
    };
    EXPECT_EQ(utf8_to_utf16("a\xC3\xA9z\xFF\xE1\x80", collect), u"az");
    EXPECT_EQ(seen, (std::vector<std::string>{"\xC3\xA9", "\xFF", "\xE1\x80"}));
}

TEST(Transcode, BuildsTextOfItsExactLength)
{
    for (std::size_t const bound : {0u, 1u, 1024u, 1025u}) {
        std::string const text =
            build_text<char>(bound, [bound](char* out) { return std::fill_n(out, bound / 2, 'x'); });
        EXPECT_EQ(text, std::string(bound / 2, 'x'));
    }
}

} // namespace
} // namespace fl::i18n::detail
