#include <fl/filesystem/wildcards.hpp>

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <string>

#include <foundation/ustring.hpp>

namespace fl::filesystem {
namespace {

struct Row
{
    std::u16string name;
    std::u16string pattern;
    bool matches;
};

void PrintTo(Row const& row, std::ostream* stream)
{
    foundation::ustring::insert(foundation::ustring::insert(*stream, row.name) << " against ", row.pattern);
}

class Wildcards : public testing::TestWithParam<Row>
{};

TEST_P(Wildcards, MatchAsTheTableSays)
{
    EXPECT_EQ(matches_wildcards(GetParam().name, GetParam().pattern), GetParam().matches);
}

INSTANTIATE_TEST_SUITE_P(PlainText, Wildcards,
                         testing::Values(Row{u"a", u"a", true}, Row{u"a", u"A", false}, Row{u"a", u"", false},
                                         Row{u"", u"", true}, Row{u"ab", u"a", false}, Row{u"a", u"ab", false},
                                         Row{u"\u00E9", u"e\u0301", false}, Row{u"a\\b", u"a\\b", true}));

INSTANTIATE_TEST_SUITE_P(Star, Wildcards,
                         testing::Values(Row{u"", u"*", true}, Row{u"a.txt", u"*", true}, Row{u"a.txt", u"*.txt", true},
                                         Row{u"a.txt.bak", u"*.txt", false}, Row{u"a.txt.txt", u"*.txt", true},
                                         Row{u".hidden", u"*", true}, Row{u"abc", u"a*c", true},
                                         Row{u"ac", u"a*c", true}, Row{u"abcb", u"a*c", false},
                                         Row{u"abcabd", u"*ab?", true}, Row{u"aXbXc", u"a*b*c", true},
                                         Row{u"acb", u"a*b*c", false}, Row{u"a", u"**", true}, Row{u"", u"**", true},
                                         Row{u"line\nbreak", u"line*", true}));

INSTANTIATE_TEST_SUITE_P(QuestionMark, Wildcards,
                         testing::Values(Row{u"a", u"?", true}, Row{u"", u"?", false}, Row{u"ab", u"?", false},
                                         Row{u"\U0001F600", u"?", true}, Row{u"\U0001F600", u"??", false},
                                         Row{u"e\u0301", u"??", true}, Row{u"x\U0001F600y", u"x?y", true}));

INSTANTIATE_TEST_SUITE_P(
    Brackets, Wildcards,
    testing::Values(Row{u"a", u"[abc]", true}, Row{u"d", u"[abc]", false}, Row{u"m", u"[a-z]", true},
                    Row{u"M", u"[a-z]", false}, Row{u"d", u"[!abc]", true}, Row{u"a", u"[!abc]", false},
                    Row{u"a", u"[^abc]", false}, Row{u"d", u"[^abc]", true}, Row{u"", u"[!a]", false},
                    Row{u"*", u"[*]", true}, Row{u"a", u"[*]", false}, Row{u"?", u"[?]", true}, Row{u"[", u"[[]", true},
                    Row{u"]", u"[]]", true}, Row{u"x", u"[]x]", true}, Row{u"]", u"[!]]", false},
                    Row{u"x", u"[!]]", true}, Row{u"-", u"[-a]", true}, Row{u"-", u"[a-]", true},
                    Row{u"b", u"[a-]", false}, Row{u"!", u"[a!]", true}, Row{u"b", u"[z-a]", false},
                    Row{u"\U0001F601", u"[\U0001F600-\U0001F602]", true},
                    Row{u"\U0001F603", u"[\U0001F600-\U0001F602]", false}, Row{u"\uFF5E", u"[a-\U0001F600]", true},
                    Row{u"a1", u"[a-c][0-9]", true}, Row{u"xxb", u"*[a-c]", true}));

INSTANTIATE_TEST_SUITE_P(UnclosedBracket, Wildcards,
                         testing::Values(Row{u"[a", u"[a", true}, Row{u"a", u"[a", false}, Row{u"a[1", u"*[1", true},
                                         Row{u"[", u"[", true}, Row{u"[]", u"[]", true}, Row{u"[!", u"[!", true},
                                         Row{u"[!]", u"[!]", true}));

TEST(Wildcards, TakesALoneSurrogateAsACharacter)
{
    std::u16string const lone{char16_t{0xD800}};
    EXPECT_TRUE(matches_wildcards(lone, u"?"));
    EXPECT_TRUE(matches_wildcards(lone, lone));
    EXPECT_FALSE(matches_wildcards(lone + u"a", u"?"));
}

TEST(Wildcards, TakesNoLongerForManyStars)
{
    std::u16string pattern;
    for (int count = 0; count < 50; ++count)
        pattern += u"*a";
    EXPECT_FALSE(matches_wildcards(std::u16string(2000, u'a') + u"b", pattern + u"c"));
}

// The definition itself, which is too slow to be used.
bool matches_by_definition(std::u16string_view name, std::u16string_view pattern)
{
    if (pattern.empty())
        return name.empty();
    if (pattern[0] == u'*')
        return matches_by_definition(name, pattern.substr(1)) ||
               (!name.empty() && matches_by_definition(name.substr(1), pattern));
    return !name.empty() && (pattern[0] == u'?' || pattern[0] == name[0]) &&
           matches_by_definition(name.substr(1), pattern.substr(1));
}

RC_GTEST_PROP(Wildcards, AgreeWithTheirDefinition, ())
{
    auto const text = [](char16_t const* characters, std::size_t count) {
        std::u16string const all(characters, count);
        return rc::gen::container<std::u16string>(rc::gen::elementOf(all));
    };
    std::u16string const name = *rc::gen::resize(12, text(u"ab", 2));
    std::u16string const pattern = *rc::gen::resize(8, text(u"ab?**", 5));
    RC_ASSERT(matches_wildcards(name, pattern) == matches_by_definition(name, pattern));
}

} // namespace
} // namespace fl::filesystem
