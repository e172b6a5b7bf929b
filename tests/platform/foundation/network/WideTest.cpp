#include <foundation/network/wide.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <stdexcept>
#include <string>

#include <tests/support/generators.hpp>
#include <tests/support/thrown.hpp>

namespace foundation::network {
namespace {

using tests::support::shown;
using tests::support::Text;
using tests::support::textOfAny;

TEST(Wide, JoinsSurrogatePairs)
{
    EXPECT_EQ(toWide(u"a\u00E9\u4E2D\U0001F600\U0010FFFF"), L"a\u00E9\u4E2D\U0001F600\U0010FFFF");
}

TEST(Wide, SplitsWhatLiesBeyondTheBasicPlane)
{
    EXPECT_EQ(fromWide(L"a\uFFFF\U00010000\U0010FFFF"), u"a\uFFFF\U00010000\U0010FFFF");
}

TEST(Wide, KeepsTheEmptyTextAndNul)
{
    EXPECT_EQ(toWide(u""), L"");
    EXPECT_EQ(fromWide(L""), u"");
    EXPECT_EQ(toWide(std::u16string(2, u'\0')), std::wstring(2, L'\0'));
    EXPECT_EQ(fromWide(std::wstring(2, L'\0')), std::u16string(2, u'\0'));
}

TEST(Wide, RefusesALoneSurrogateWithTheTextOfBoostsIterator)
{
    std::u16string const text{u'a', char16_t{0xDC00}, u'b'};
    EXPECT_EQ(textOfAny<std::out_of_range>([&] { static_cast<void>(toWide(text)); }),
              "Misplaced UTF-16 surrogate U+0xdc00 encountered while trying to encode UTF-32 sequence");
}

TEST(Wide, RefusesASurrogateAtEitherEndAndInTheWrongOrder)
{
    for (std::u16string const& text :
         {std::u16string{char16_t{0xD800}}, std::u16string{char16_t{0xDC00}}, std::u16string{u'a', char16_t{0xD83D}},
          std::u16string{char16_t{0xDE00}, u'a'}, std::u16string{char16_t{0xDE00}, char16_t{0xD83D}},
          std::u16string{char16_t{0xD83D}, char16_t{0xD83D}, char16_t{0xDE00}}})
        EXPECT_THROW(static_cast<void>(toWide(text)), std::out_of_range) << shown(text);
}

TEST(Wide, RefusesWhatIsNoScalarValue)
{
    for (char32_t const c : {0xD800U, 0xDFFFU, 0x110000U, 0xFFFFFFFFU})
        EXPECT_THROW(static_cast<void>(fromWide(std::wstring(1, static_cast<wchar_t>(c)))), std::out_of_range);
    EXPECT_EQ(textOfAny<std::out_of_range>([] { requireScalarValue(0x110000); }),
              "Invalid UTF-32 code point U+0x110000 encountered while trying to encode UTF-16 sequence");
}

RC_GTEST_PROP(Wide, LeadsBackToTheSameText, ())
{
    Text const text = *tests::support::anyText();
    RC_ASSERT(shown(fromWide(toWide(text.value))) == shown(text.value));
}

RC_GTEST_PROP(Wide, RefusesEveryLoneSurrogate, ())
{
    Text const text = *tests::support::brokenText();
    RC_ASSERT_THROWS_AS(static_cast<void>(toWide(text.value)), std::out_of_range);
}

} // namespace
} // namespace foundation::network
