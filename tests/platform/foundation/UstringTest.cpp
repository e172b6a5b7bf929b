#include <foundation/ustring.hpp>

#include <gtest/gtest.h>

#include <iomanip>
#include <ios>
#include <sstream>
#include <stdexcept>
#include <streambuf>
#include <string>

#include <fl/i18n/case.hpp>

namespace foundation::ustring {
namespace {

std::string inserted(std::u16string_view text)
{
    std::ostringstream stream;
    insert(stream, text);
    return stream.str();
}

struct FullDevice : std::streambuf
{};

TEST(Ustring, InsertWritesUtf8)
{
    EXPECT_EQ(inserted(u""), "");
    EXPECT_EQ(inserted(u"/a b"), "/a b");
    EXPECT_EQ(inserted(u"\u00E9\u4E2D\U0001F4C1"), "\xC3\xA9\xE4\xB8\xAD\xF0\x9F\x93\x81");
}

TEST(Ustring, InsertWritesANulAsItIs)
{
    EXPECT_EQ(inserted(std::u16string_view(u"a\0b", 3)), std::string("a\0b", 3));
}

TEST(Ustring, InsertReplacesLoneSurrogates)
{
    EXPECT_EQ(inserted(std::u16string{u'a', char16_t{0xD800}, u'b'}), "a\xEF\xBF\xBD"
                                                                      "b");
    EXPECT_EQ(inserted(std::u16string{char16_t{0xDC00}, char16_t{0xD800}}), "\xEF\xBF\xBD\xEF\xBF\xBD");
}

TEST(Ustring, InsertReturnsTheStream)
{
    std::ostringstream stream;
    EXPECT_EQ(&insert(stream, u"x"), &stream);
}

TEST(Ustring, InsertTreatsTheWidthAsAStringDoes)
{
    std::ostringstream stream;
    stream << std::setw(4) << std::setfill('.');
    insert(stream, u"ab");
    insert(stream, u"cd");
    EXPECT_EQ(stream.str(), "..abcd");
}

TEST(Ustring, InsertTellsAFailureByTheState)
{
    FullDevice device;
    std::ostream stream(&device);
    insert(stream, u"x");
    EXPECT_TRUE(stream.bad());
}

TEST(Ustring, InsertThrowsWhatTheStreamIsToldToThrow)
{
    FullDevice device;
    std::ostream stream(&device);
    stream.exceptions(std::ios_base::badbit);
    EXPECT_THROW(insert(stream, u"x"), std::ios_base::failure);
}

TEST(Ustring, InsertWritesNothingToAFailedStream)
{
    std::ostringstream stream;
    stream.setstate(std::ios_base::failbit);
    insert(stream, u"x");
    EXPECT_EQ(stream.str(), "");
}

TEST(Ustring, TransformGoesByCodePoint)
{
    EXPECT_EQ(transform(u"", fl::i18n::to_lower), u"");
    EXPECT_EQ(transform(u"ABC/\u00C9", fl::i18n::to_lower), u"abc/\u00E9");
    EXPECT_EQ(transform(u"\U00010400x", fl::i18n::to_lower), u"\U00010428x");
}

TEST(Ustring, TransformMayChangeTheLength)
{
    auto const beyond = [](char32_t c) { return c == U'a' ? char32_t{0x1F4C1} : c; };
    EXPECT_EQ(transform(u"banana", beyond), u"b\U0001F4C1n\U0001F4C1n\U0001F4C1");
}

TEST(Ustring, TransformKeepsLoneSurrogates)
{
    std::u16string const text = {char16_t{0xDC00}, u'A', char16_t{0xD83D}};
    std::u16string const lower = {char16_t{0xDC00}, u'a', char16_t{0xD83D}};
    EXPECT_EQ(transform(text, fl::i18n::to_lower), lower);
}

TEST(Ustring, TransformGivesLoneSurrogatesToTheFunction)
{
    auto const mended = [](char32_t c) { return c >= 0xD800 && c <= 0xDFFF ? U'?' : c; };
    EXPECT_EQ(transform(std::u16string{u'a', char16_t{0xD800}}, mended), u"a?");
}

TEST(Ustring, TransformRefusesWhatIsNoCodePoint)
{
    auto const tooFar = [](char32_t) { return char32_t{0x110000}; };
    EXPECT_THROW(static_cast<void>(transform(u"x", tooFar)), std::range_error);
}

} // namespace
} // namespace foundation::ustring
