#include <fl/filesystem/native_name.hpp>

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

#include <fl/i18n/utf8.hpp>

namespace fl::filesystem {
namespace {

struct Row
{
    std::string bytes;
    std::u16string name;
};

// Bytes in which valid, truncated and mapped sequences are frequent.
rc::Gen<std::string> anyBytes()
{
    auto const pieces =
        rc::gen::element<std::string>("a", "/", "\x7F", "\x80", "\xBF", "\xC3", "\xA9", "\xC3\xA9", "\xE4\xB8\xAD",
                                      "\xEE", "\xBE", "\xEE\xBE\x80", "\xEE\xBF\xBF", "\xEE\xBD\xBF", "\xEF\x80\x80",
                                      "\xED\xA0\x80", "\xF0\x9F\x93\x81", "\xF0\x9F", "\xF4\x90", "\xFF");
    return rc::gen::map(rc::gen::container<std::vector<std::string>>(pieces), [](std::vector<std::string> const& all) {
        std::string bytes;
        for (auto const& piece : all) {
            bytes += piece;
        }
        return bytes;
    });
}

TEST(NativeName, IsUtf8ForOrdinaryNames)
{
    for (auto const& [bytes, name] : std::vector<Row>{
             {"", u""},
             {"/home/user/a file.txt", u"/home/user/a file.txt"},
             {"caf\xC3\xA9", u"caf\u00E9"},
             {"cafe\xCC\x81", u"cafe\u0301"},
             {"\xE4\xB8\xAD\xE6\x96\x87", u"\u4E2D\u6587"},
             {"\xF0\x9F\x93\x81", u"\U0001F4C1"},
             {"\xEE\xBC\x80", u"\uEF00"},
             {"\xEE\xBD\xBF", u"\uEF7F"},
             {"\xEF\x80\x80", u"\uF000"},
         })
    {
        EXPECT_EQ(from_native_bytes(bytes), name);
        EXPECT_EQ(to_native_bytes(name), bytes);
    }
}

TEST(NativeName, MapsEveryOtherByteToACodePointOfItsOwn)
{
    for (auto const& [bytes, name] : std::vector<Row>{
             {"\x80", u"\uEF80"},
             {"\xFF", u"\uEFFF"},
             {"a\xE9z", u"a\uEFE9z"},
             {"\xC3", u"\uEFC3"},
             {"\xC3\xC3\xA9", u"\uEFC3\u00E9"},
             {"\xA9\xC3", u"\uEFA9\uEFC3"},
             {"\xC0\xAF", u"\uEFC0\uEFAF"},
             {"\xED\xA0\x80", u"\uEFED\uEFA0\uEF80"},
             {"\xF0\x9F\x93", u"\uEFF0\uEF9F\uEF93"},
             {"\xF4\x90\x80\x80", u"\uEFF4\uEF90\uEF80\uEF80"},
         })
    {
        EXPECT_EQ(from_native_bytes(bytes), name);
        EXPECT_EQ(to_native_bytes(name), bytes);
    }
}

TEST(NativeName, MapsTheBytesOfAnEncodedStandIn)
{
    EXPECT_EQ(from_native_bytes("\xEE\xBE\x80"), u"\uEFEE\uEFBE\uEF80");
    EXPECT_EQ(from_native_bytes("\xEE\xBF\xBF"), u"\uEFEE\uEFBF\uEFBF");
    EXPECT_EQ(to_native_bytes(u"\uEFEE\uEFBE\uEF80"), "\xEE\xBE\x80");
}

TEST(NativeName, StandInsThatSpellACharacterNameItsFile)
{
    EXPECT_EQ(to_native_bytes(u"\uEFC3\uEFA9"), to_native_bytes(u"\u00E9"));
    EXPECT_EQ(from_native_bytes(to_native_bytes(u"\uEFC3\uEFA9")), u"\u00E9");
}

TEST(NativeName, RefusesLoneSurrogates)
{
    for (char16_t const lone : {char16_t{0xD800}, char16_t{0xDBFF}, char16_t{0xDC00}, char16_t{0xDFFF}}) {
        EXPECT_THROW(static_cast<void>(to_native_bytes(std::u16string{u'a', lone})), std::range_error);
    }
}

TEST(NativeName, MapsNamesOfAnyLength)
{
    for (std::size_t const length : {255u, 341u, 342u, 1024u, 1025u, 4096u}) {
        EXPECT_EQ(from_native_bytes(std::string(length, '\xFF')), std::u16string(length, u'\uEFFF'));
        EXPECT_EQ(to_native_bytes(std::u16string(length, u'\uEFFF')), std::string(length, '\xFF'));
    }
}

RC_GTEST_PROP(NativeName, AnyBytesComeBack, (std::string const& bytes))
{
    RC_ASSERT(to_native_bytes(from_native_bytes(bytes)) == bytes);
}

RC_GTEST_PROP(NativeName, CraftedBytesComeBack, ())
{
    std::string const bytes = *anyBytes();
    RC_ASSERT(to_native_bytes(from_native_bytes(bytes)) == bytes);
}

RC_GTEST_PROP(NativeName, DifferentBytesHaveDifferentNames, ())
{
    std::string const left = *anyBytes();
    std::string const right = *anyBytes();
    RC_ASSERT((left == right) == (from_native_bytes(left) == from_native_bytes(right)));
}

RC_GTEST_PROP(NativeName, NamesOfFilesComeBack, ())
{
    std::u16string const name = from_native_bytes(*anyBytes());
    RC_ASSERT(from_native_bytes(to_native_bytes(name)) == name);
}

RC_GTEST_PROP(NativeName, NamesWithoutStandInsAreUtf8AndComeBack, (std::u16string const& units))
{
    std::u16string name =
        fl::i18n::from_utf8(fl::i18n::to_utf8(units, fl::i18n::Malformed::Replace), fl::i18n::Malformed::Throw);
    std::erase_if(name, [](char16_t unit) { return unit >= 0xEF80 && unit <= 0xEFFF; });
    RC_ASSERT(to_native_bytes(name) == fl::i18n::to_utf8(name, fl::i18n::Malformed::Throw));
    RC_ASSERT(from_native_bytes(to_native_bytes(name)) == name);
}

} // namespace
} // namespace fl::filesystem
