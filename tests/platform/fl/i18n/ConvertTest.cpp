#include <fl/i18n/convert.hpp>

#include <gtest/gtest.h>

#include <cstddef>
#include <stdexcept>
#include <string>

namespace fl::i18n {
namespace {

TEST(Convert, IsStrictUtf8WithoutAConverter)
{
    EXPECT_EQ(to_string(u"caf\u00E9"), "caf\xC3\xA9");
    EXPECT_EQ(to_ustring("caf\xC3\xA9"), u"caf\u00E9");
    EXPECT_THROW(static_cast<void>(to_string(std::u16string{char16_t{0xD800}})), std::range_error);
    EXPECT_THROW(static_cast<void>(to_ustring("\xFF")), std::range_error);
}

TEST(Convert, StrictConverterRefusesMalformedText)
{
    codecvt_ustring_to_string const toString("UTF-8", true);
    codecvt_string_to_ustring const toUstring("UTF-8", true);
    EXPECT_EQ(to_string(u"\U0001F4C1", toString), "\xF0\x9F\x93\x81");
    EXPECT_EQ(to_ustring("\xF0\x9F\x93\x81", toUstring), u"\U0001F4C1");
    EXPECT_THROW(static_cast<void>(to_string(std::u16string{u'a', char16_t{0xDC00}}, toString)), std::range_error);
    EXPECT_THROW(static_cast<void>(to_ustring("\xED\xA0\x80", toUstring)), std::range_error);
}

TEST(Convert, LenientConverterReplacesMalformedText)
{
    EXPECT_EQ(to_string(std::u16string{u'a', char16_t{0xDC00}}, codecvt_ustring_to_string("UTF-8", false)),
              "a\xEF\xBF\xBD");
    EXPECT_EQ(to_ustring("a\xED\xA0\x80", codecvt_string_to_ustring("UTF-8", false)), u"a\uFFFD\uFFFD\uFFFD");
}

TEST(Convert, KnowsUtf8InAnySpelling)
{
    for (std::string const name : {"UTF-8", "utf-8", "UTF8", "utf8", "Utf-8"}) {
        EXPECT_TRUE(codecvt_ustring_to_string(name, true).isUtf8()) << name;
        EXPECT_TRUE(codecvt_string_to_ustring(name, true).isUtf8()) << name;
    }
    EXPECT_FALSE(codecvt_ustring_to_string("UTF-16", true).isUtf8());
}

TEST(Convert, RefusesUnknownEncodings)
{
    for (std::string const& name : {std::string(), std::string("no such encoding"), std::string("UTF-8\0x", 7)}) {
        EXPECT_THROW(codecvt_ustring_to_string(name, true), std::invalid_argument) << name;
        EXPECT_THROW(codecvt_string_to_ustring(name, false), std::invalid_argument) << name;
    }
}

TEST(Convert, ConvertsOtherEncodings)
{
    EXPECT_EQ(to_ustring("caf\xE9", codecvt_string_to_ustring("ISO-8859-1", true)), u"caf\u00E9");
    EXPECT_EQ(to_ustring("caf\x82", codecvt_string_to_ustring("IBM437", true)), u"caf\u00E9");
    EXPECT_EQ(to_string(u"caf\u00E9", codecvt_ustring_to_string("IBM437", true)), "caf\x82");
    EXPECT_EQ(to_string(u"\u4E2D", codecvt_ustring_to_string("Shift_JIS", true)), "\x92\x86");
    EXPECT_EQ(to_ustring("", codecvt_string_to_ustring("Shift_JIS", true)), u"");
    EXPECT_EQ(to_string(u"", codecvt_ustring_to_string("Shift_JIS", true)), "");
}

TEST(Convert, ConvertsLongTextInOtherEncodings)
{
    EXPECT_EQ(to_string(std::u16string(100000, u'\u4E2D'), codecvt_ustring_to_string("UTF-16LE", true)).size(),
              200000u);
    EXPECT_EQ(to_ustring(std::string(100000, '\xE9'), codecvt_string_to_ustring("ISO-8859-1", true)),
              std::u16string(100000, u'\u00E9'));
}

TEST(Convert, StrictConverterRefusesWhatTheEncodingCannotHold)
{
    EXPECT_THROW(static_cast<void>(to_string(u"\u4E2D", codecvt_ustring_to_string("ISO-8859-1", true))),
                 std::range_error);
    EXPECT_THROW(static_cast<void>(to_ustring("\x81", codecvt_string_to_ustring("Shift_JIS", true))), std::range_error);
}

TEST(Convert, StrictConverterKeepsEveryCharacterOrRefuses)
{
    for (std::string const name : {"IBM437", "ISO-8859-1"}) {
        codecvt_ustring_to_string const toString(name, true);
        codecvt_string_to_ustring const toUstring(name, true);
        std::size_t kept = 0;
        for (char32_t unit = 0; unit <= 0xFFFF; ++unit) {
            std::u16string const text = {u'a', static_cast<char16_t>(unit), u'z'};
            try {
                ASSERT_EQ(to_ustring(to_string(text, toString), toUstring), text) << name << ' ' << unsigned{unit};
                ++kept;
            } catch (std::range_error const&) {
            }
        }
        EXPECT_EQ(kept, 256u) << name;
    }
}

TEST(Convert, StrictConverterRefusesCharactersThatAreNotDrawn)
{
    codecvt_ustring_to_string const strict("Shift_JIS", true);
    for (std::u16string const text : {u"a\u200Dz", u"a\uFE0Fz", u"a\uFEFFz", u"a\U000E0041z"})
        EXPECT_THROW(static_cast<void>(to_string(text, strict)), std::range_error);
}

TEST(Convert, LenientConverterReplacesWhatTheEncodingCannotHold)
{
    EXPECT_EQ(to_string(u"a\u4E2Dz", codecvt_ustring_to_string("ISO-8859-1", false)), "a\x1Az");
    EXPECT_EQ(to_string(u"a\u200Dz", codecvt_ustring_to_string("ISO-8859-1", false)), "a\x1Az");
    EXPECT_EQ(to_string(std::u16string{u'a', char16_t{0xD800}}, codecvt_ustring_to_string("ISO-8859-1", false)),
              "a\x1A");
    EXPECT_EQ(to_ustring("a\x81", codecvt_string_to_ustring("Shift_JIS", false)), u"a\uFFFD");
}

} // namespace
} // namespace fl::i18n
