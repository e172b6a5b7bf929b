#include <fl/filesystem/upath.hpp>

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <set>
#include <string>
#include <type_traits>
#include <vector>

namespace fl::filesystem {
namespace {

struct Row
{
    std::u16string text;
    std::u16string normal;
};

TEST(UPath, IsEmptyByDefault)
{
    EXPECT_EQ(upath().string(), u"");
}

TEST(UPath, IsMadeFromTextExplicitly)
{
    EXPECT_FALSE((std::is_convertible_v<std::u16string, upath>));
    EXPECT_TRUE((std::is_same_v<upath, basic_path<char16_t>>));
}

TEST(UPath, NormalisesSeparators)
{
    std::u16string const longName(100000, u'x');
    for (auto const& [text, normal] : std::vector<Row>{
             {u"", u""},
             {u"/", u"/"},
             {u"//", u"/"},
             {u"///", u"/"},
             {u"a", u"a"},
             {u"a/", u"a"},
             {u"a//", u"a"},
             {u"/a", u"/a"},
             {u"//a", u"/a"},
             {u"/a/", u"/a"},
             {u"/a//b///c////", u"/a/b/c"},
             {u"a//b", u"a/b"},
             {u".", u"."},
             {u"..", u".."},
             {u"./", u"."},
             {u"/.", u"/."},
             {u"/./a/../b//..", u"/./a/../b/.."},
             {u"/a b/%2F", u"/a b/%2F"},
             {u"/a\\\\b", u"/a\\\\b"},
             {u"//" + longName + u"//", u"/" + longName},
         })
    {
        EXPECT_EQ(upath(text).string(), normal);
        EXPECT_EQ(upath(text, true).string(), normal);
        EXPECT_EQ(upath(text, false).string(), text);
    }
}

TEST(UPath, ComparesByText)
{
    EXPECT_EQ(upath(u"/a/"), upath(u"/a"));
    EXPECT_NE(upath(u"/a/", false), upath(u"/a"));
    EXPECT_NE(upath(u"/a"), upath(u"/A"));
}

TEST(UPath, OrdersByCodeUnit)
{
    EXPECT_LT(upath(u"/a"), upath(u"/b"));
    EXPECT_LT(upath(u"/a"), upath(u"/a/b"));
    EXPECT_LT(upath(u"/a!"), upath(u"/a/b"));
    EXPECT_LT(upath(u"\U0001F4C1"), upath(u"\uE000"));
    EXPECT_FALSE(upath(u"/a") < upath(u"/a"));
    EXPECT_EQ((std::set<upath>{upath(u"/a"), upath(u"/b"), upath(u"//a/")}).size(), 2u);
}

RC_GTEST_PROP(UPath, NormalisingTwiceChangesNothing, ())
{
    auto const text = *rc::gen::container<std::u16string>(rc::gen::element(u'/', u'.', u'a'));
    upath const path(text);
    RC_ASSERT(upath(path.string()) == path);
    RC_ASSERT(path.string().find(u"//") == std::u16string::npos);
}

} // namespace
} // namespace fl::filesystem
