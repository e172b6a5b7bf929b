#include <fl/filesystem/wildcards.hpp>

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <optional>
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

bool matches(std::u16string_view name, std::u16string_view pattern)
{
    return Wildcards(pattern).matches(name);
}

class WildcardsTable : public testing::TestWithParam<Row>
{};

TEST_P(WildcardsTable, HoldsWhereCaseMatters)
{
    EXPECT_EQ(matches(GetParam().name, GetParam().pattern), GetParam().matches);
}

INSTANTIATE_TEST_SUITE_P(PlainText, WildcardsTable,
                         testing::Values(Row{u"a", u"a", true}, Row{u"a", u"A", false}, Row{u"a", u"", false},
                                         Row{u"", u"", true}, Row{u"ab", u"a", false}, Row{u"a", u"ab", false},
                                         Row{u"\u00E9", u"e\u0301", false}, Row{u"a\\b", u"a\\b", true}));

INSTANTIATE_TEST_SUITE_P(Star, WildcardsTable,
                         testing::Values(Row{u"", u"*", true}, Row{u"a.txt", u"*", true}, Row{u"a.txt", u"*.txt", true},
                                         Row{u"a.txt.bak", u"*.txt", false}, Row{u"a.txt.txt", u"*.txt", true},
                                         Row{u".hidden", u"*", true}, Row{u"abc", u"a*c", true},
                                         Row{u"ac", u"a*c", true}, Row{u"abcb", u"a*c", false},
                                         Row{u"abcabd", u"*ab?", true}, Row{u"aXbXc", u"a*b*c", true},
                                         Row{u"acb", u"a*b*c", false}, Row{u"a", u"**", true}, Row{u"", u"**", true},
                                         Row{u"line\nbreak", u"line*", true}));

INSTANTIATE_TEST_SUITE_P(QuestionMark, WildcardsTable,
                         testing::Values(Row{u"a", u"?", true}, Row{u"", u"?", false}, Row{u"ab", u"?", false},
                                         Row{u"\U0001F600", u"?", true}, Row{u"\U0001F600", u"??", false},
                                         Row{u"e\u0301", u"??", true}, Row{u"x\U0001F600y", u"x?y", true}));

INSTANTIATE_TEST_SUITE_P(
    Brackets, WildcardsTable,
    testing::Values(Row{u"a", u"[abc]", true}, Row{u"d", u"[abc]", false}, Row{u"m", u"[a-z]", true},
                    Row{u"M", u"[a-z]", false}, Row{u"d", u"[!abc]", true}, Row{u"a", u"[!abc]", false},
                    Row{u"a", u"[^abc]", false}, Row{u"d", u"[^abc]", true}, Row{u"", u"[!a]", false},
                    Row{u"*", u"[*]", true}, Row{u"a", u"[*]", false}, Row{u"?", u"[?]", true}, Row{u"[", u"[[]", true},
                    Row{u"]", u"[]]", true}, Row{u"x", u"[]x]", true}, Row{u"]", u"[!]]", false},
                    Row{u"x", u"[!]]", true}, Row{u"-", u"[-a]", true}, Row{u"-", u"[a-]", true},
                    Row{u"b", u"[a-]", false}, Row{u"!", u"[a!]", true}, Row{u"b", u"[z-a]", false},
                    Row{u"b", u"[!z-a]", true}, Row{u"x", u"[z-ax]", true},
                    Row{u"\U0001F601", u"[\U0001F600-\U0001F602]", true},
                    Row{u"\U0001F603", u"[\U0001F600-\U0001F602]", false}, Row{u"\uFF5E", u"[a-\U0001F600]", true},
                    Row{u"a1", u"[a-c][0-9]", true}, Row{u"xxb", u"*[a-c]", true}));

INSTANTIATE_TEST_SUITE_P(UnclosedBracket, WildcardsTable,
                         testing::Values(Row{u"[a", u"[a", true}, Row{u"a", u"[a", false}, Row{u"a[1", u"*[1", true},
                                         Row{u"[", u"[", true}, Row{u"[]", u"[]", true}, Row{u"[!", u"[!", true},
                                         Row{u"[!]", u"[!]", true}));

INSTANTIATE_TEST_SUITE_P(OrdinaryCharacters, WildcardsTable,
                         testing::Values(Row{u"a*", u"a\\*", false}, Row{u"a\\b", u"a\\*", true},
                                         Row{u"\\", u"[\\]", true}, Row{u"]", u"[\\]", false},
                                         Row{u"\\]", u"[\\]]", true}, Row{u"-", u"[\\-c]", false},
                                         Row{u"]", u"[\\-c]", true}, Row{u"a.b", u"a.b", true},
                                         Row{u"axb", u"a.b", false}, Row{u"(a|b){2}+$^", u"(a|b){2}+$^", true},
                                         Row{u"(*UTF)a", u"(*UTF)a", true}, Row{u"a#b c", u"a#b*c", true},
                                         Row{u"\\Qa\\E", u"\\Qa\\E", true}, Row{u"a]", u"a]", true},
                                         Row{std::u16string(u"a\0b", 3), u"a?b", true}, Row{u"{a,b}", u"{a,b}", true},
                                         Row{u"a", u"{a,b}", false}));

INSTANTIATE_TEST_SUITE_P(NoClasses, WildcardsTable,
                         testing::Values(Row{u"5", u"[[:digit:]]", false}, Row{u"d]", u"[[:digit:]]", true},
                                         Row{u":]", u"[[:nonsense:]]", true}, Row{u"a]", u"[[=a=]]", true},
                                         Row{u".]", u"[[.-.]]", true}, Row{u":", u"[:digit:]", true},
                                         Row{u"d", u"[=d=]", true}, Row{u".", u"[.]", true}, Row{u"^", u"[a^]", true},
                                         Row{u"s", u"[!a]", true}, Row{u":", u"[::]", true},
                                         Row{u"a", u"[!:digit:]", true}));

INSTANTIATE_TEST_SUITE_P(Slash, WildcardsTable,
                         testing::Values(Row{u"a/b", u"a/b", true}, Row{u"a/b", u"a*b", true},
                                         Row{u"a/b", u"a?b", true}, Row{u"a/b", u"a[/]b", true},
                                         Row{u"a/b", u"a[+-9]b", true}, Row{u"a/b", u"a[!x]b", true}));

// What each of these stands for is an ordinary character of its own, whatever it was made for.
INSTANTIATE_TEST_SUITE_P(StandInsForBytes, WildcardsTable,
                         testing::Values(Row{u"a\uEFFF", u"a?", true}, Row{u"\uEFC3\uEFA9", u"?", false},
                                         Row{u"\uEFC3\uEFA9", u"??", true}, Row{u"\uEF80", u"[\uEF80-\uEFFF]", true},
                                         Row{u"\u00E9", u"[\uEF80-\uEFFF]", false}));

std::u16string const high{char16_t{0xD83D}};
std::u16string const low{char16_t{0xDE00}};

// High and low side by side are a pair, and one character.
INSTANTIATE_TEST_SUITE_P(LoneSurrogates, WildcardsTable,
                         testing::Values(Row{high, u"?", true}, Row{low, u"?", true}, Row{low + high, u"??", true},
                                         Row{high + low, u"?", true}, Row{high + low, high + u"*", false},
                                         Row{high + low, u"*" + low, false}, Row{high + u"a", u"?", false},
                                         Row{high, high, true}, Row{high, low, false}, Row{high, u"[!a]", true},
                                         Row{high, u"[" + high + u"]", true},
                                         Row{u"x" + low, u"x[!" + low + u"]", false},
                                         Row{low, u"[" + high + u"-\uE000]", true},
                                         Row{u"a" + high + u"b", u"a*b", true}));

TEST(Wildcards, IgnoreCaseWhereAskedTo)
{
    struct
    {
        std::u16string name;
        std::u16string pattern;
    } const rows[] = {
        {u"Name.TXT", u"*.txt"}, {u"name", u"N[A-B]ME"},         {u"\u0413\u0440\u0423", u"\u0433?\u0443"},
        {u"\u00D6", u"\u00F6"},  {u"\u00F6", u"\u00D6"},         {u"\U00010400", u"\U00010428"},
        {u"x", u"[\u00D6X]"},    {u"\u0413", u"[\u0430-\u044F]"}};
    for (auto const& [name, pattern] : rows) {
        EXPECT_TRUE(Wildcards(pattern, LetterCase::Ignored).matches(name)) << testing::PrintToString(pattern);
        EXPECT_FALSE(Wildcards(pattern).matches(name)) << testing::PrintToString(pattern);
    }
    EXPECT_FALSE(Wildcards(u"[!a]", LetterCase::Ignored).matches(u"A"));
    EXPECT_FALSE(Wildcards(u"STRASSE", LetterCase::Ignored).matches(u"stra\u00DFe"));
}

TEST(Wildcards, HoldForNamesOfAnyLength)
{
    for (std::size_t const length : {254U, 255U, 256U, 100'000U}) {
        std::u16string const name = std::u16string(length - 1, u'a') + u"b";
        EXPECT_TRUE(matches(name, u"*b"));
        EXPECT_TRUE(matches(name, name));
        EXPECT_FALSE(matches(name, u"*a"));
    }
}

TEST(Wildcards, AreThoseTheyWereCopiedFrom)
{
    std::optional<Wildcards> original(u"*.txt");
    Wildcards const copy = *original;
    original.reset();
    EXPECT_TRUE(copy.matches(u"a.txt"));
    EXPECT_FALSE(copy.matches(u"a.md"));
}

std::u16string repeated(std::u16string const& text, int count)
{
    std::u16string result;
    for (int i = 0; i < count; ++i)
        result += text;
    return result;
}

// Each takes years where every way of dividing the name among the stars is tried.
TEST(Wildcards, TakeNoLongerForManyStars)
{
    std::u16string const name(2000, u'a');
    EXPECT_FALSE(matches(name, u"*a*a*a*a*a*b"));
    EXPECT_FALSE(matches(name + u"b", repeated(u"*a", 50) + u"c"));
    EXPECT_FALSE(matches(name + u"bc", repeated(u"*a", 50) + u"b"));
    EXPECT_FALSE(matches(name, repeated(u"*[ab]", 50) + u"[bc]"));
    EXPECT_FALSE(matches(name, repeated(u"*?a", 50) + u"?b"));
    EXPECT_FALSE(Wildcards(repeated(u"*a", 50) + u"B", LetterCase::Ignored).matches(name));
}

TEST(Wildcards, TakeThousandsOfStars)
{
    EXPECT_TRUE(matches(std::u16string(20'000, u'a'), repeated(u"*a", 20'000)));
    EXPECT_FALSE(matches(std::u16string(19'999, u'a'), repeated(u"*a", 20'000)));
    EXPECT_TRUE(matches(std::u16string(5000, u'a'), repeated(u"*[ab]*", 5000)));
}

using Characters = std::u32string;

/// Whether a bracket, given without its ends, lists a character.
bool lists(Characters list, char32_t character)
{
    bool const isNegated = list[0] == U'!' || list[0] == U'^';
    bool found = false;
    for (std::size_t at = isNegated ? 1 : 0; at < list.size(); ++at) {
        if (at + 2 < list.size() && list[at + 1] == U'-') {
            found = found || (list[at] <= character && character <= list[at + 2]);
            at += 2;
        } else {
            found = found || list[at] == character;
        }
    }
    return found != isNegated;
}

/// The definition itself, which is too slow to be used.
bool matches_by_definition(Characters const& name, Characters const& pattern)
{
    if (pattern.empty())
        return name.empty();
    if (pattern[0] == U'*')
        return matches_by_definition(name, pattern.substr(1)) ||
               (!name.empty() && matches_by_definition(name.substr(1), pattern));
    if (name.empty())
        return false;
    std::size_t const least = pattern.size() > 1 && (pattern[1] == U'!' || pattern[1] == U'^') ? 3 : 2;
    std::size_t const closing = pattern[0] == U'[' ? pattern.find(U']', least) : Characters::npos;
    if (closing != Characters::npos)
        return lists(pattern.substr(1, closing - 1), name[0]) &&
               matches_by_definition(name.substr(1), pattern.substr(closing + 1));
    return (pattern[0] == U'?' || pattern[0] == name[0]) && matches_by_definition(name.substr(1), pattern.substr(1));
}

std::u16string encode(Characters const& text)
{
    std::u16string result;
    for (char32_t const character : text) {
        if (character > 0xFFFF)
            result += static_cast<char16_t>(0xD800 + ((character - 0x10000) >> 10));
        result += static_cast<char16_t>(character > 0xFFFF ? 0xDC00 + (character & 0x3FF) : character);
    }
    return result;
}

Characters text_of(Characters const& characters, int size)
{
    return *rc::gen::resize(size, rc::gen::container<Characters>(rc::gen::elementOf(characters)));
}

RC_GTEST_PROP(Wildcards, AgreeWithTheirDefinition, ())
{
    Characters const name = text_of(U"ab", 12);
    Characters const pattern = text_of(U"ab?**", 8);
    RC_ASSERT(matches(encode(name), encode(pattern)) == matches_by_definition(name, pattern));
}

RC_GTEST_PROP(Wildcards, AgreeWithTheirDefinitionForBrackets, ())
{
    Characters const name = text_of(U"as]-!:[\\\U0001F600", 3);
    Characters const list = text_of(U"as]]-!^:[\\\U0001F600", 12);
    Characters const pattern = text_of(U"*?a", 3) + U"[" + list + text_of(U"*]a", 2);
    RC_ASSERT(matches(encode(name), encode(pattern)) == matches_by_definition(name, pattern));
}

} // namespace
} // namespace fl::filesystem
