#include <fl/i18n/detail/ascii.hpp>

#include <gtest/gtest.h>

#include <string>

namespace fl::i18n::detail {
namespace {

constexpr std::size_t longest = 70;

std::string ascii(std::size_t length)
{
    std::string text;
    for (std::size_t at = 0; at < length; ++at) {
        text += static_cast<char>(at * 37 % 0x80);
    }
    return text;
}

std::u16string widened(std::string const& text)
{
    return std::u16string(text.begin(), text.end());
}

TEST(Ascii, WidensTextOfEveryLength)
{
    for (std::size_t length = 0; length <= longest; ++length) {
        std::string const text = ascii(length);
        std::u16string out(length, u'?');
        EXPECT_EQ(widen_ascii(text, out.data()), length);
        EXPECT_EQ(out, widened(text));
    }
}

TEST(Ascii, NarrowsTextOfEveryLength)
{
    for (std::size_t length = 0; length <= longest; ++length) {
        std::string const text = ascii(length);
        std::string out(length, '?');
        EXPECT_EQ(narrow_ascii(widened(text), out.data()), length);
        EXPECT_EQ(out, text);
    }
}

TEST(Ascii, WideningStopsAtTheFirstOtherByte)
{
    for (std::size_t at = 0; at < longest; ++at) {
        for (char const other : {'\x80', '\xC3', '\xFF'}) {
            std::string text = ascii(longest);
            text[at] = other;
            std::u16string out(longest, u'?');
            EXPECT_EQ(widen_ascii(text, out.data()), at);
            EXPECT_EQ(out.substr(0, at), widened(text.substr(0, at)));
        }
    }
}

TEST(Ascii, NarrowingStopsAtTheFirstOtherUnit)
{
    for (std::size_t at = 0; at < longest; ++at) {
        for (char16_t const other : {u'\u0080', u'\u00FF', u'\u0100', u'\u4100', char16_t{0xD800}, u'\uFF41'}) {
            std::string const text = ascii(longest);
            std::u16string wide = widened(text);
            wide[at] = other;
            std::string out(longest, '?');
            EXPECT_EQ(narrow_ascii(wide, out.data()), at);
            EXPECT_EQ(out.substr(0, at), text.substr(0, at));
        }
    }
}

} // namespace
} // namespace fl::i18n::detail
