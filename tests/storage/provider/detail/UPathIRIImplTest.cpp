#include <storage/provider/detail/UPathIRIImpl.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <algorithm>
#include <atomic>
#include <iterator>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include <fl/filesystem/path_functions.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/detail/HierarchicalImpl.hpp>
#include <tests/support/generators.hpp>
#include <tests/support/inThreads.hpp>
#include <tests/support/thrown.hpp>

namespace foundation::storage::provider::detail {
namespace {

using fl::filesystem::upath;
using tests::support::internalTextOf;
using tests::support::inThreads;
using tests::support::shown;

UPathIRIImpl made(std::u16string const& path)
{
    return UPathIRIImpl(u"file", upath(path));
}

/// A path whose text is kept as it is.
upath exact(std::u16string const& path)
{
    return upath(path, false);
}

std::u16string textOfPath(std::u16string const& path)
{
    return made(path).toString();
}

TEST(UPathIRIImpl, AnswersFromSchemeAndPath)
{
    UPathIRIImpl const location = made(u"/tmp/x y");
    EXPECT_EQ(location.getScheme(), u"file");
    EXPECT_EQ(location.toString(), u"file:///tmp/x%20y");
    EXPECT_EQ(location.getPath(), u"/tmp/x y");
    EXPECT_TRUE(location.hasPath());
    EXPECT_EQ(location.getName(), u"x y");
    EXPECT_EQ(location.getHost(), u"");
    EXPECT_FALSE(location.hasHost());
    EXPECT_FALSE(location.isOpaque());
    EXPECT_FALSE(location.hasInnerIRI());
    EXPECT_TRUE(location.hasParent());
    EXPECT_EQ(location.toUPath(), upath(u"/tmp/x y"));
}

TEST(UPathIRIImpl, KeepsThePathAsGiven)
{
    for (std::u16string const path : {u"/a//b", u"//a", u"/a/", u"/./a/.."}) {
        UPathIRIImpl const location(u"s", exact(path));
        EXPECT_EQ(location.getPath(), path);
        EXPECT_EQ(location.toUPath().string(), path);
        EXPECT_EQ(location.toString(), u"s://" + path);
    }
}

TEST(UPathIRIImpl, NameIsTheLastElementOfThePathAsGiven)
{
    for (auto const& [path, name] : std::vector<std::pair<std::u16string, std::u16string>>{
             {u"/a//b", u"b"}, {u"//a", u"a"}, {u"/a/", u"a"}, {u"/a//", u"a"}, {u"/./a/..", u".."}, {u"/%41", u"%41"}})
        EXPECT_EQ(UPathIRIImpl(u"s", exact(path)).getName(), name) << shown(path);
}

TEST(UPathIRIImpl, TakesTheSchemeAsGiven)
{
    for (std::u16string const scheme : {u"FILE", u"", u"1x", u"a b"}) {
        UPathIRIImpl const location(scheme, upath(u"/a"));
        EXPECT_EQ(location.getScheme(), scheme);
        EXPECT_EQ(location.toString(), scheme + u":///a");
        EXPECT_EQ(location.toIRI().toString(), location.toString());
    }
}

TEST(UPathIRIImpl, EscapesWhatItsTextMayNotHold)
{
    EXPECT_EQ(textOfPath(u"/AZaz09~$&+-./:@_"), u"file:///AZaz09~$&+-./:@_");
    EXPECT_EQ(textOfPath(u"/ %#?!\"'()*,;<=>[\\]^`{|}"),
              u"file:///%20%25%23%3F%21%22%27%28%29%2A%2C%3B%3C%3D%3E%5B%5C%5D%5E%60%7B%7C%7D");
    EXPECT_EQ(textOfPath(u"/\u00E9\u4F60\U0001F600\u007F\u0080\n"), u"file:///%C3%A9%E4%BD%A0%F0%9F%98%80%7F%C2%80%0A");
    EXPECT_EQ(textOfPath(std::u16string(u"/a\0b", 4)), u"file:///a%00b");
    EXPECT_EQ(textOfPath(u"/%41"), u"file:///%2541");
}

TEST(UPathIRIImpl, EveryAsciiCharacterButSeventyTwoIsEscaped)
{
    int kept = 0;
    for (char16_t c = 1; c < 0x80; ++c) {
        std::u16string const text = UPathIRIImpl(u"s", exact(u"/" + std::u16string(1, c) + u"x")).toString();
        kept += text == u"s:///" + std::u16string(1, c) + u"x" ? 1 : 0;
    }
    EXPECT_EQ(kept, 26 + 26 + 10 + 10);
}

TEST(UPathIRIImpl, RefusesARelativePath)
{
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { made(u"rel/a b"); }), u"IRI 'file://rel/a%20b' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { made(u"."); }), u"IRI 'file://.' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { UPathIRIImpl(u"file", upath(u"rel"), u"known"); }),
              u"IRI 'known' is not absolute.");
}

TEST(UPathIRIImpl, AcceptsAnEmptyPath)
{
    UPathIRIImpl const location = made(u"");
    EXPECT_EQ(location.toString(), u"file://");
    EXPECT_EQ(location.toIRI().toString(), u"file://");
    EXPECT_EQ(location.getPath(), u"");
    EXPECT_EQ(location.getName(), u"");
    EXPECT_FALSE(location.hasPath());
    EXPECT_FALSE(location.hasParent());
    EXPECT_EQ(internalTextOf<std::logic_error>([&] { static_cast<void>(location.getParent()); }),
              u"IRI does not have a parent IRI.");
}

TEST(UPathIRIImpl, RefusesALoneSurrogateWhenItsTextIsMade)
{
    UPathIRIImpl const location(u"s", exact(std::u16string{u'/', char16_t{0xD800}}));
    EXPECT_EQ(location.getPath().size(), 2u);
    for (int attempt = 0; attempt != 2; ++attempt)
        EXPECT_THROW(static_cast<void>(location.toString()), std::range_error);
}

TEST(UPathIRIImpl, KeepsATextThatIsKnown)
{
    UPathIRIImpl const location(u"s", upath(u"/a"), u"known");
    EXPECT_EQ(location.toString(), u"known");
    EXPECT_EQ(location.getPath(), u"/a");
}

TEST(UPathIRIImpl, RootHasNoParent)
{
    for (std::u16string const root : {u"/", u"//"}) {
        UPathIRIImpl const location(u"s", exact(root));
        EXPECT_FALSE(location.hasParent());
        EXPECT_EQ(location.getName(), u"/");
        for (int attempt = 0; attempt != 2; ++attempt)
            EXPECT_EQ(internalTextOf<std::logic_error>([&] { static_cast<void>(location.getParent()); }),
                      u"IRI does not have a parent IRI.");
    }
}

TEST(UPathIRIImpl, ParentMakesItsTextWhenTheChildHasNone)
{
    UPathIRIImpl const child = made(u"/a b/c");
    std::shared_ptr<StorageIRIImpl> const parent = child.getParent();
    EXPECT_EQ(parent->toString(), u"file:///a%20b");
    EXPECT_EQ(parent->getPath(), u"/a b");
    EXPECT_EQ(made(u"/a").getParent()->toString(), u"file:///");
    EXPECT_EQ(made(u"/a").getParent()->getPath(), u"/");
}

TEST(UPathIRIImpl, ParentTakesItsTextFromTheChildThatHasOne)
{
    UPathIRIImpl const child(u"file", upath(u"/a b/c"), u"known/text/c");
    EXPECT_EQ(child.getParent()->toString(), u"known/text");
    EXPECT_EQ(child.getParent()->getPath(), u"/a b");
    EXPECT_EQ(UPathIRIImpl(u"file", upath(u"/a"), u"no separator").getParent()->toString(), u"no separator");
}

TEST(UPathIRIImpl, ParentOfATopFolderWithATextHasTheTextOfNoPath)
{
    UPathIRIImpl const child = made(u"/a");
    EXPECT_EQ(child.toString(), u"file:///a");
    std::shared_ptr<StorageIRIImpl> const parent = child.getParent();
    EXPECT_EQ(parent->toString(), u"file://");
    EXPECT_EQ(parent->getPath(), u"/");
    EXPECT_EQ(parent->toIRI().toString(), u"file:///");
    EXPECT_TRUE(parent->equals(*made(u"/a").getParent()));
}

TEST(UPathIRIImpl, ParentTakesTheTextUpToTheLastSlashWhateverThePath)
{
    UPathIRIImpl const child(u"s", exact(u"/a//b//c"));
    EXPECT_EQ(child.toString(), u"s:///a//b//c");
    EXPECT_EQ(child.getParent()->toString(), u"s:///a//b/");
    EXPECT_EQ(child.getParent()->getPath(), u"/a/b");
}

TEST(UPathIRIImpl, ParentIsNormalised)
{
    UPathIRIImpl const location(u"s", exact(u"/a//b//c"));
    EXPECT_EQ(location.getParent()->toUPath().string(), u"/a/b");
}

TEST(UPathIRIImpl, ParentIsMadeOnce)
{
    UPathIRIImpl const location = made(u"/a/b");
    std::shared_ptr<StorageIRIImpl> const parent = location.getParent();
    static_cast<void>(location.toString());
    EXPECT_EQ(location.getParent(), parent);
    EXPECT_EQ(&location.getParent(), &location.getParent());
}

TEST(UPathIRIImpl, RootIsMadeAnewEachTime)
{
    UPathIRIImpl const location = made(u"/a/b");
    std::shared_ptr<StorageIRIImpl> const first = location.getRoot();
    std::shared_ptr<StorageIRIImpl> const second = location.getRoot();
    EXPECT_NE(first, second);
    EXPECT_TRUE(first->equals(*second));
    EXPECT_EQ(first->getPath(), u"/");
    EXPECT_EQ(first->toString(), u"file:///");
}

TEST(UPathIRIImpl, RootIsMadeThroughTheVirtualOperation)
{
    struct Counting : UPathIRIImpl
    {
        using UPathIRIImpl::UPathIRIImpl;
        std::shared_ptr<StorageIRIImpl> withPath(std::u16string const& path) const override
        {
            asked.push_back(path);
            return UPathIRIImpl::withPath(path);
        }
        mutable std::vector<std::u16string> asked;
    };
    Counting const location(u"s", upath(u"/a/b"));
    static_cast<void>(location.getRoot());
    static_cast<void>(location.getRoot());
    EXPECT_EQ(location.asked, (std::vector<std::u16string>{u"/", u"/"}));
}

TEST(UPathIRIImpl, WithPathKeepsTheSchemeAndTakesThePathAsGiven)
{
    UPathIRIImpl const location = made(u"/a");
    EXPECT_EQ(location.withPath(u"/x y//z/")->toString(), u"file:///x%20y//z/");
    EXPECT_EQ(location.withPath(u"/x y//z/")->toUPath().string(), u"/x y//z/");
    EXPECT_EQ(location.withPath(u"")->toUPath(), upath());
    EXPECT_EQ(internalTextOf<std::runtime_error>([&] { static_cast<void>(location.withPath(u"rel")); }),
              u"IRI 'file://rel' is not absolute.");
}

TEST(UPathIRIImpl, HasNoInnerLocation)
{
    EXPECT_EQ(internalTextOf<std::logic_error>([] { static_cast<void>(made(u"/a").getInnerIRI()); }),
              u"IRI does not have an inner IRI.");
}

TEST(UPathIRIImpl, IsEqualByPathWhateverTheScheme)
{
    UPathIRIImpl const one(u"file", upath(u"/a"));
    UPathIRIImpl const other(u"other", upath(u"/a"));
    EXPECT_TRUE(one.equals(one));
    EXPECT_TRUE(one.equals(other));
    EXPECT_NE(one.toString(), other.toString());
    EXPECT_FALSE(one.equals(made(u"/A")));
    EXPECT_FALSE(one.equals(made(u"/a/b")));
    EXPECT_FALSE(one.equals(UPathIRIImpl(u"file", exact(u"/a/"))));
    EXPECT_FALSE(one.equals(UPathIRIImpl(u"file", exact(u"//a"))));
}

TEST(UPathIRIImpl, LocationsOfOnePathUnderTwoSchemesAreEqualAndHashApart)
{
    StorageIRI const one(u"file", upath(u"/a"));
    StorageIRI const other(u"other", upath(u"/a"));
    EXPECT_TRUE(one == other);
    EXPECT_FALSE(one != other);
    EXPECT_FALSE(one < other || other < one);
    EXPECT_NE(one.hashValue(), other.hashValue());
}

TEST(UPathIRIImpl, IsEqualByTextToAnotherKind)
{
    HierarchicalImpl const hierarchical{network::IRI(u"file:///a%20b")};
    EXPECT_TRUE(made(u"/a b").equals(hierarchical));
    EXPECT_TRUE(hierarchical.equals(made(u"/a b")));
    EXPECT_FALSE(made(u"/a").equals(hierarchical));
    EXPECT_FALSE(made(u"/a!").equals(HierarchicalImpl(network::IRI(u"file:///a!"))));
}

TEST(UPathIRIImpl, IsOrderedByTheElementsOfThePath)
{
    for (auto const& [left, right] : std::vector<std::pair<std::u16string, std::u16string>>{
             {u"", u"/"},
             {u"/", u"/a"},
             {u"/a", u"/b"},
             {u"/a", u"/a/b"},
             {u"/a/z", u"/a!/b"},
             {u"/a/z", u"/ab"},
             {u"/A", u"/a"},
             {u"/a", u"//a"},
             {u"/\U0001F600", u"/\uFF5E"},
             {u"/a/b/c", u"/a/b/d"},
         })
    {
        UPathIRIImpl const lower(u"z", exact(left));
        UPathIRIImpl const upper(u"a", exact(right));
        EXPECT_TRUE(lower.less(upper)) << shown(left);
        EXPECT_FALSE(upper.less(lower)) << shown(left);
        EXPECT_FALSE(lower.less(lower));
    }
    EXPECT_FALSE(UPathIRIImpl(u"a", upath(u"/a")).less(UPathIRIImpl(u"b", upath(u"/a"))));
    EXPECT_FALSE(UPathIRIImpl(u"s", exact(u"/a/")).less(made(u"/a")));
    EXPECT_FALSE(made(u"/a").less(UPathIRIImpl(u"s", exact(u"/a/"))));
}

TEST(UPathIRIImpl, IsOrderedByTextBesideAnotherKind)
{
    HierarchicalImpl const hierarchical{network::IRI(u"file:///b")};
    EXPECT_TRUE(made(u"/a").less(hierarchical));
    EXPECT_FALSE(made(u"/b").less(hierarchical));
    EXPECT_TRUE(hierarchical.less(made(u"/c")));
    EXPECT_TRUE(UPathIRIImpl(u"a", upath(u"/z")).less(hierarchical));
}

/// The elements of a path, by the functions that walk one.
std::vector<std::u16string> elementsOf(std::u16string const& path)
{
    namespace functions = fl::filesystem::detail;
    std::vector<std::u16string> elements{functions::extract_root_path(path)};
    for (std::u16string rest = path.substr(functions::get_root_path_length(path)); !rest.empty();
         rest = functions::move_down(rest))
        elements.push_back(functions::extract_first_element(rest));
    return elements;
}

RC_GTEST_PROP(UPathIRIImpl, OrderIsThatOfTheLibrarysElements, ())
{
    auto const path =
        rc::gen::map(rc::gen::container<std::vector<int>>(rc::gen::inRange(0, 6)), [](std::vector<int> const& pieces) {
            std::u16string text = u"/";
            for (int const piece : pieces)
                text += std::u16string(u"/ab!-/").substr(static_cast<std::size_t>(piece), 1);
            return text;
        });
    std::u16string const left = *path;
    std::u16string const right = *path;
    RC_ASSERT(UPathIRIImpl(u"s", exact(left)).less(UPathIRIImpl(u"s", exact(right))) ==
              (elementsOf(left) < elementsOf(right)));
}

RC_GTEST_PROP(UPathIRIImpl, IriPrintsAsTheLocationDoes, ())
{
    std::u16string const path = *rc::gen::oneOf(tests::support::normalPath(), tests::support::absolutePath());
    UPathIRIImpl const location(*tests::support::scheme(), exact(path));
    RC_ASSERT(shown(location.toIRI().toString()) == shown(location.toString()));
    RC_ASSERT(shown(location.toIRI().getPath(network::iri::Encoding::Decoded)) == shown(path));
}

RC_GTEST_PROP(UPathIRIImpl, TextLeadsBackToThePath, ())
{
    upath const path((*tests::support::normalPath()).value);
    StorageIRI const location(std::u16string(u"file"), path);
    StorageIRI const parsed(location.toString());
    RC_ASSERT(shown(parsed.toString()) == shown(location.toString()));
    RC_ASSERT(shown(parsed.toUPath().string()) == shown(path.string()));
    RC_ASSERT(shown(parsed.getName()) == shown(location.getName()));
    RC_ASSERT(parsed == location);
}

RC_GTEST_PROP(UPathIRIImpl, NameOfAChildIsTheNameGiven, ())
{
    StorageIRI const folder(std::u16string(u"file"), upath((*tests::support::normalPath()).value));
    tests::support::Text const name = *tests::support::fileName();
    StorageIRI const child(folder, name);
    RC_ASSERT(shown(child.getName()) == shown(name.value));
    RC_ASSERT(child.getParent() == folder);
    RC_ASSERT(folder < child);
    RC_ASSERT(shown(StorageIRI(child.toString()).getName()) == shown(name.value));
}

TEST(UPathIRIImplConcurrency, ManyThreadsGetOneParentAndOneText)
{
    for (int round = 0; round != 20; ++round) {
        UPathIRIImpl const location(u"file", upath(u"/a b/c"));
        std::vector<std::pair<StorageIRIImpl const*, std::u16string const*>> seen(32);
        inThreads(32, [&](int i) {
            auto& [parent, text] = seen[static_cast<std::size_t>(i)];
            if (i % 2 == 0)
                text = &location.toString();
            parent = location.getParent().get();
            text = &location.toString();
            EXPECT_EQ(parent->toString(), u"file:///a%20b");
            EXPECT_EQ(location.getName(), u"c");
            EXPECT_EQ(location.getRoot()->getPath(), u"/");
            EXPECT_EQ(location.getResolvedPath(), u"/a b/c");
        });
        EXPECT_EQ(std::count(seen.begin(), seen.end(), seen.front()), 32);
    }
}

} // namespace
} // namespace foundation::storage::provider::detail
