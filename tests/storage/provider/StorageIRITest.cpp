#include <storage/provider/StorageIRI.hpp>

#include <gtest/gtest.h>

#include <foundation/network/IRIArgs.hpp>
#include <storage/provider/detail/HierarchicalImpl.hpp>

#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <tests/support/inThreads.hpp>
#include <tests/support/printed.hpp>
#include <tests/support/thrown.hpp>

namespace foundation::storage::provider {
namespace {

using tests::support::internalTextOf;
using tests::support::inThreads;
using tests::support::printed;
using tests::support::textOf;
using tests::support::textOfAny;
using Rows = std::vector<std::pair<std::u16string, std::u16string>>;

TEST(StorageIRI, IsMadeExplicitly)
{
    EXPECT_FALSE((std::is_convertible_v<std::u16string, StorageIRI>));
    EXPECT_FALSE((std::is_convertible_v<network::IRI, StorageIRI>));
    EXPECT_FALSE((std::is_convertible_v<std::shared_ptr<detail::StorageIRIImpl>, StorageIRI>));
    EXPECT_FALSE((std::is_default_constructible_v<StorageIRI>));
}

TEST(StorageIRI, IsCopiedAndNeverMovedFrom)
{
    StorageIRI source(u"s://h/a");
    StorageIRI const taken(std::move(source));
    EXPECT_EQ(source.toString(), u"s://h/a");
    StorageIRI assigned(u"s://h/b");
    assigned = std::move(source);
    EXPECT_EQ(source.getPath(), u"/a");
    EXPECT_EQ(source, assigned);
    EXPECT_EQ(source, taken);
}

TEST(StorageIRI, CopiesShareOneImplementation)
{
    StorageIRI const original(u"s://h/a");
    StorageIRI const copy = original;
    EXPECT_EQ(&copy.toString(), &original.toString());
    EXPECT_EQ(&copy.getPath(), &original.getPath());
    EXPECT_EQ(&copy.getName(), &original.getName());
    EXPECT_EQ(&copy.getResolvedPath(), &original.getResolvedPath());
}

TEST(StorageIRI, ReferencesLiveAsLongAsAnyCopy)
{
    auto original = std::make_unique<StorageIRI>(u"s://h/a");
    std::u16string const& text = original->toString();
    StorageIRI const copy = *original;
    original.reset();
    EXPECT_EQ(text, u"s://h/a");
}

TEST(StorageIRI, AdoptsAnImplementation)
{
    auto const implementation = std::make_shared<detail::HierarchicalImpl>(network::IRI(u"s://h/a"));
    StorageIRI const location{std::shared_ptr<detail::StorageIRIImpl>(implementation)};
    EXPECT_EQ(&location.toString(), &implementation->toString());
    EXPECT_EQ(implementation.use_count(), 2);
}

TEST(StorageIRI, ParsesTextAsTheIriOfThatText)
{
    for (std::u16string const text : {u"s://h/a/b", u"f:/x y", u"file:///tmp/", u"s://h"}) {
        EXPECT_EQ(StorageIRI(text), StorageIRI(network::IRI(text)));
        EXPECT_EQ(StorageIRI(text).toIRI().toString(), StorageIRI(text).toString());
    }
}

TEST(StorageIRI, RefusesTextWithoutAScheme)
{
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { StorageIRI{std::u16string(u"rel/a")}; }),
              u"IRI 'rel/a' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { StorageIRI{network::IRI(u"//h/a")}; }),
              u"IRI '//h/a' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { StorageIRI{std::u16string()}; }), u"IRI '' is not absolute.");
}

TEST(StorageIRI, RefusesALoneSurrogateInTextAndInAChild)
{
    std::u16string const lone{char16_t{0xDFFF}};
    EXPECT_EQ(textOfAny<std::out_of_range>([&] { StorageIRI(u"s:/" + lone); }),
              "Misplaced UTF-16 surrogate U+0xdfff encountered while trying to encode UTF-32 sequence");
    EXPECT_EQ(textOfAny<std::out_of_range>([&] { StorageIRI(StorageIRI(u"s:/"), lone); }),
              "Misplaced UTF-16 surrogate U+0xdfff encountered while trying to encode UTF-32 sequence");
}

TEST(StorageIRI, TrailingSlashIsNotPartOfTheLocation)
{
    StorageIRI const location(u"s://h/a/b/");
    EXPECT_EQ(location, StorageIRI(u"s://h/a/b"));
    EXPECT_EQ(location.toString(), u"s://h/a/b");
    EXPECT_EQ(location.getPath(), u"/a/b");
    EXPECT_EQ(location.getName(), u"b");
}

TEST(StorageIRI, AnswersEveryQueryFromItsImplementation)
{
    StorageIRI const location(u"s://u@h:8/a/b%20c?q");
    EXPECT_EQ(location.getScheme(), u"s");
    EXPECT_TRUE(location.hasHost());
    EXPECT_EQ(location.getHost(), u"h");
    EXPECT_FALSE(location.hasInnerIRI());
    EXPECT_TRUE(location.hasPath());
    EXPECT_EQ(location.getPath(), u"/a/b c");
    EXPECT_EQ(location.getPathView().toStringView().data(), location.getPath().data());
    EXPECT_EQ(location.toUPath().string(), u"/a/b c");
    EXPECT_TRUE(location.hasParent());
    EXPECT_EQ(location.getParent().toString(), u"s://u@h:8/a?q");
    EXPECT_EQ(location.getName(), u"b c");
    EXPECT_FALSE(location.isOpaque());
    EXPECT_EQ(location.toIRI().toString(), u"s://u@h:8/a/b%20c?q");
    EXPECT_EQ(location.toString(), u"s://u@h:8/a/b%20c?q");
}

TEST(StorageIRI, HasNoHostWhereThereIsNone)
{
    EXPECT_FALSE(StorageIRI(u"f:/x").hasHost());
    EXPECT_FALSE(StorageIRI(u"file:///x").hasHost());
    EXPECT_EQ(StorageIRI(u"f:/x").getHost(), u"");
}

TEST(StorageIRI, TopHasNoParentAndAPlainLocationNoInnerOne)
{
    EXPECT_FALSE(StorageIRI(u"s://h/").hasParent());
    EXPECT_EQ(internalTextOf<std::logic_error>([] { StorageIRI(u"s://h/").getParent(); }),
              u"IRI does not have a parent IRI.");
    EXPECT_TRUE(StorageIRI(u"s://h").hasParent());
    EXPECT_EQ(internalTextOf<std::logic_error>([] { StorageIRI(u"s://h").getParent(); }),
              u"IRI does not have a parent IRI.");
    EXPECT_EQ(internalTextOf<std::logic_error>([] { StorageIRI(u"s://h/a").getInnerIRI(); }),
              u"IRI does not have an inner IRI.");
}

TEST(StorageIRI, ChildWithLeadingSlashReplacesThePath)
{
    for (auto const& [child, text] : Rows{{u"/", u"s://h/"},
                                          {u"//", u"s://h/"},
                                          {u"///x", u"s://h/x"},
                                          {u"/a/b", u"s://h/a/b"},
                                          {u"//a/b", u"s://h/a/b"},
                                          {u"/a/", u"s://h/a/"},
                                          {u"/a//b", u"s://h/a//b"},
                                          {u"/../x", u"s://h/../x"}})
        EXPECT_EQ(StorageIRI(StorageIRI(u"s://h/p/q"), child).toString(), text);
}

TEST(StorageIRI, RelativeChildIsJoinedToThePath)
{
    for (auto const& [child, text] : Rows{{u"sub", u"s://h/a/sub"},
                                          {u"sub/", u"s://h/a/sub"},
                                          {u"sub//", u"s://h/a/sub/"},
                                          {u"b/c", u"s://h/a/b/c"},
                                          {u"", u"s://h/a"},
                                          {u".", u"s://h/a/."},
                                          {u"../b", u"s://h/a/../b"},
                                          {u"./", u"s://h/a/."},
                                          {u"a:b", u"s://h/a/a:b"},
                                          {u"%41 ?#", u"s://h/a/%2541%20%3F%23"}})
        EXPECT_EQ(StorageIRI(StorageIRI(u"s://h/a"), child).toString(), text);
}

TEST(StorageIRI, ChildOfAPathThatEndsWithASlashGetsNoSecondOne)
{
    StorageIRI const folder(StorageIRI(u"s://h/x"), u"/a/");
    EXPECT_EQ(folder.getPath(), u"/a/");
    EXPECT_EQ(StorageIRI(folder, u"sub/").getPath(), u"/a/sub");
    EXPECT_EQ(StorageIRI(folder, u"").getPath(), u"/a/");
    EXPECT_EQ(StorageIRI(StorageIRI(u"s://h/"), u"a").getPath(), u"/a");
    EXPECT_EQ(StorageIRI(StorageIRI(u"s://h"), u"a").getPath(), u"/a");
    EXPECT_EQ(StorageIRI(StorageIRI(u"s://h"), u"").toString(), u"s://h");
}

TEST(StorageIRI, NameOfAChildIsPlainText)
{
    for (std::u16string const name : {u"a b", u"100%", u"%41", u"a?b#c", u"x!", u"[1]", u"::", u"a\\b",
                                      u"e\u0301\u00E9", u"\U0001F600", u"\n\t\u007F", u"-", u"~.", u"\uEF80\uFFFE"})
    {
        StorageIRI const child(StorageIRI(u"s://h/a"), name);
        EXPECT_EQ(child.getName(), name);
        EXPECT_EQ(StorageIRI(child.toString()).getName(), name);
        EXPECT_EQ(StorageIRI(child.toString()), child);
        EXPECT_EQ(child.getParent(), StorageIRI(u"s://h/a"));
    }
}

TEST(StorageIRI, ResolvedFormHasNoDotSegments)
{
    EXPECT_EQ(StorageIRI(u"s://h/a/./b/../c").getResolvedPath(), u"/a/c");
    EXPECT_EQ(StorageIRI(u"s://h/a/./b/../c").getResolvedIRI().toString(), u"s://h/a/c");
    EXPECT_EQ(StorageIRI(u"s://h/").getResolvedIRI(), StorageIRI(u"s://h/"));
    EXPECT_EQ(StorageIRI(u"s://h").getResolvedIRI(), StorageIRI(u"s://h"));
    EXPECT_EQ(StorageIRI(u"s://h/../..").getResolvedIRI().toString(), u"s://h/");
}

TEST(StorageIRI, AncestorStandsAbove)
{
    StorageIRI const folder(u"s://h/a");
    EXPECT_TRUE(folder.isAncestorOf(StorageIRI(u"s://h/a/b")));
    EXPECT_TRUE(folder.isAncestorOf(StorageIRI(u"s://h/a/b/c")));
    EXPECT_TRUE(StorageIRI(u"s://h/").isAncestorOf(folder));
    EXPECT_FALSE(folder.isAncestorOf(folder));
    EXPECT_FALSE(StorageIRI(u"s://h/a/b").isAncestorOf(folder));
    EXPECT_FALSE(folder.isAncestorOf(StorageIRI(u"s://h/ab/c")));
    EXPECT_FALSE(folder.isAncestorOf(StorageIRI(u"s://h/A/b")));
    EXPECT_FALSE(StorageIRI(u"s://h/").isAncestorOf(StorageIRI(u"s://h/")));
    EXPECT_FALSE(StorageIRI(u"s://h").isAncestorOf(StorageIRI(u"s://h/a")));
}

TEST(StorageIRI, AncestryLooksAtSchemeAndPathAlone)
{
    EXPECT_TRUE(StorageIRI(u"s://h/a").isAncestorOf(StorageIRI(u"s://other/a/b")));
    EXPECT_TRUE(StorageIRI(u"s:/a%20b").isAncestorOf(StorageIRI(u"s://h/a%20b/c?q")));
    EXPECT_FALSE(StorageIRI(u"s://h/a").isAncestorOf(StorageIRI(u"t://h/a/b")));
    EXPECT_FALSE(StorageIRI(u"s://h/a").isAncestorOf(StorageIRI(u"S://h/a/b")));
}

TEST(StorageIRI, RelativePathLeadsFromTheFolder)
{
    struct Row
    {
        std::u16string path;
        std::u16string base;
        std::u16string relative;
    };
    for (auto const& [path, base, relative] : std::vector<Row>{
             {u"/a/b/c", u"/a", u"b/c"},
             {u"/a", u"/a/b", u"../../a"},
             {u"/a/b", u"/", u"a/b"},
             {u"/", u"/a/b", u"../../"},
             {u"/a", u"/a", u"../a"},
             {u"/a%20%25b", u"/", u"a %b"},
             {u"/a/b:c", u"/a", u"b:c"},
             {u"/a//b", u"/a", u".//b"},
             {u"/a/./b", u"/a", u"./b"},
             {u"/a/b", u"", u"/a/b"},
             {u"", u"/a", u"../"},
             {u"//a", u"/", u".//a"},
             {u"/a", u"//b", u"../../a"},
             {u"//b/c", u"//b", u"c"},
         })
        EXPECT_EQ(StorageIRI(u"s://h" + path).makePathRelativeTo(StorageIRI(u"s://h" + base)), relative);
}

TEST(StorageIRI, RelativePathNeedsACommonRoot)
{
    StorageIRI const base(u"s://other/b");
    EXPECT_EQ(textOf<std::runtime_error>([&] { StorageIRI(u"s://h/\u00E9").makePathRelativeTo(base); }),
              "Can not make relative path between s://h/\xC3\xA9 and s://other/b as they don't have a common root.");
    EXPECT_THROW(StorageIRI(u"t://h/a").makePathRelativeTo(StorageIRI(u"s://h/a")), std::runtime_error);
}

TEST(StorageIRI, EqualityIsThatOfTheCanonicalTexts)
{
    EXPECT_TRUE(StorageIRI(u"s://h/a") == StorageIRI(u"s://h/a/"));
    EXPECT_FALSE(StorageIRI(u"s://h/a") != StorageIRI(u"s://h/a/"));
    EXPECT_FALSE(StorageIRI(u"s://h/a") == StorageIRI(u"s://h/A"));
    EXPECT_TRUE(StorageIRI(u"s://h/a") != StorageIRI(u"s://H/a"));
    EXPECT_FALSE(StorageIRI(u"s://h/%41") == StorageIRI(u"s://h/A"));
    EXPECT_FALSE(StorageIRI(u"s://h/%2f") == StorageIRI(u"s://h/%2F"));
}

TEST(StorageIRI, OrderIsThatOfTheCanonicalTexts)
{
    EXPECT_TRUE(StorageIRI(u"s://h/A") < StorageIRI(u"s://h/a"));
    EXPECT_TRUE(StorageIRI(u"s://h/a") < StorageIRI(u"s://h/a/b"));
    EXPECT_FALSE(StorageIRI(u"s://h/a") < StorageIRI(u"s://h/a/"));
    EXPECT_TRUE(StorageIRI(u"s://h/\U0001F600") < StorageIRI(u"s://h/\uFF5E"));
    std::map<StorageIRI, int> const map{{StorageIRI(u"s:/b"), 2}, {StorageIRI(u"s:/a"), 1}, {StorageIRI(u"s:/a/"), 3}};
    EXPECT_EQ(map.size(), 2u);
    EXPECT_EQ(map.begin()->second, 1);
}

TEST(StorageIRI, IsWrittenInUtf8)
{
    EXPECT_EQ(printed(StorageIRI(u"s://h/\u00E9\u4F60\U0001F600 ")), "s://h/\xC3\xA9\xE4\xBD\xA0\xF0\x9F\x98\x80%20");
    EXPECT_TRUE(tests::support::answersItsStream(StorageIRI(u"s:/")));
}

TEST(StorageIRIConcurrency, ManyThreadsAskOneFreshLocation)
{
    for (int round = 0; round != 10; ++round) {
        StorageIRI const location(u"s://h/a/./b/../c/");
        std::vector<std::u16string const*> parents(32);
        inThreads(32, [&](int i) {
            parents[static_cast<std::size_t>(i)] = &location.getParent().getPath();
            EXPECT_EQ(location.getName(), u"c");
            EXPECT_EQ(location.toString(), u"s://h/a/./b/../c");
            EXPECT_EQ(location.getPath(), u"/a/./b/../c");
            EXPECT_EQ(location.getResolvedPath(), u"/a/c");
            EXPECT_EQ(location.getResolvedIRI(), StorageIRI(u"s://h/a/c"));
        });
        EXPECT_EQ(parents, std::vector<std::u16string const*>(32, parents.front()));
    }
}

TEST(StorageIRIConcurrency, CopiesComeAndGoInManyThreads)
{
    StorageIRI const location(u"s://h/a/b");
    inThreads(32, [&](int) {
        for (int i = 0; i != 100; ++i) {
            StorageIRI const copy = location;
            EXPECT_EQ(copy.getParent(), StorageIRI(u"s://h/a"));
        }
    });
}

} // namespace
} // namespace foundation::storage::provider
