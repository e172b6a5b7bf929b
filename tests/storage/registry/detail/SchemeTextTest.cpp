#include <storage/registry/detail/schemeText.hpp>

#include <tests/support/generators.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::registry::detail {
namespace {

using tests::support::shown;

TEST(SchemeText, KnowsSchemes)
{
    for (char16_t const* const text : {u"a", u"Z", u"a1", u"a+b-c.d9", u"FILE"})
        EXPECT_TRUE(isScheme(text)) << shown(text);
    for (char16_t const* const text : {u"", u"1a", u"+a", u".a", u"a b", u"a:", u"a/", u"a_", u"\u00E9", u"a\u00E9"})
        EXPECT_FALSE(isScheme(text)) << shown(text);
}

TEST(SchemeText, FindsTheSchemeOfALocation)
{
    EXPECT_EQ(schemeOf(u"file:///a:b"), u"file");
    EXPECT_EQ(schemeOf(u"zip:file:/a!/b"), u"zip");
    EXPECT_EQ(schemeOf(u"a:"), u"a");
    for (char16_t const* const text : {u"", u":", u"a", u"/a:b", u"1:b", u"a b:c"})
        EXPECT_EQ(schemeOf(text), std::nullopt) << shown(text);
}

TEST(SchemeText, LowersTheLettersOfASchemeAndNothingElse)
{
    EXPECT_EQ(lowerCased(u"FiLeAZaz@[`{09+-."), u"fileazaz@[`{09+-.");
    EXPECT_EQ(lowerCased(u"\u00C9\u0130"), u"\u00C9\u0130");
}

} // namespace
} // namespace foundation::storage::registry::detail
