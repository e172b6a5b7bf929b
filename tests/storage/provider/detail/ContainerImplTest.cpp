#include <storage/provider/detail/ContainerImpl.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/detail/HierarchicalImpl.hpp>
#include <storage/provider/detail/UPathIRIImpl.hpp>
#include <tests/support/inThreads.hpp>
#include <tests/support/locations.hpp>
#include <tests/support/thrown.hpp>

namespace foundation::storage::provider::detail {
namespace {

using network::IRI;
using tests::support::internalTextOf;
using tests::support::inThreads;
using tests::support::shown;
using tests::support::Text;
using tests::support::textOf;

using Pointer = std::shared_ptr<StorageIRIImpl>;

Pointer plain(std::u16string const& text)
{
    return std::make_shared<HierarchicalImpl>(IRI(text));
}

ContainerImpl built(std::u16string const& path)
{
    return ContainerImpl(u"s", plain(u"f:/x.c"), path);
}

ContainerImpl parsed(std::u16string const& text)
{
    return ContainerImpl(IRI(text));
}

TEST(ContainerImpl, IsBuiltFromItsParts)
{
    EXPECT_EQ(built(u"/").toString(), u"s:f:/x.c!/");
    EXPECT_EQ(built(u"/d/e").toString(), u"s:f:/x.c!/d/e");
}

TEST(ContainerImpl, AnswersFromItsParts)
{
    Pointer const inner = plain(u"f:/x.c");
    ContainerImpl const location(u"s", inner, u"/d/e f");
    EXPECT_EQ(location.getScheme(), u"s");
    EXPECT_EQ(location.getPath(), u"/d/e f");
    EXPECT_TRUE(location.hasPath());
    EXPECT_EQ(location.getName(), u"e f");
    EXPECT_EQ(location.toString(), u"s:f:/x.c!/d/e%20f");
    EXPECT_EQ(location.toIRI().toString(), u"s:f:/x.c!/d/e%20f");
    EXPECT_TRUE(location.toIRI().isOpaque());
    EXPECT_FALSE(location.hasHost());
    EXPECT_TRUE(location.isOpaque());
    EXPECT_TRUE(location.hasInnerIRI());
    EXPECT_EQ(location.getInnerIRI(), inner);
    EXPECT_TRUE(location.hasParent());
}

TEST(ContainerImpl, HasNoHostAndNoFilePath)
{
    ContainerImpl const location(u"s", plain(u"f:/x.c"), u"/\u00E9");
    EXPECT_EQ(textOf<std::logic_error>([&] { static_cast<void>(location.getHost()); }),
              "StorageIRI s:f:/x.c!/\xC3\xA9 is container based so by definition has no host.");
    EXPECT_EQ(textOf<std::logic_error>([&] { static_cast<void>(location.toUPath()); }),
              "Can not extract a file system path from StorageIRI s:f:/x.c!/\xC3\xA9 as it represents a location "
              "inside a container.");
    EXPECT_EQ(textOf<std::logic_error>([&] { static_cast<void>(parsed(u"s:f:/x.c!/d/").getHost()); }),
              "StorageIRI s:f:/x.c!/d is container based so by definition has no host.");
}

TEST(ContainerImpl, EmptyPathIsTheRoot)
{
    EXPECT_EQ(built(u"").getPath(), u"/");
    EXPECT_EQ(built(u"").toString(), u"s:f:/x.c!/");
}

TEST(ContainerImpl, KeepsATrailingSlashInThePathAlone)
{
    ContainerImpl const location = built(u"/d/");
    EXPECT_EQ(location.getPath(), u"/d/");
    EXPECT_EQ(location.toString(), u"s:f:/x.c!/d");
    EXPECT_EQ(location.toIRI().toString(), u"s:f:/x.c!/d");
    EXPECT_EQ(location.getName(), u"d");
    EXPECT_EQ(location.getParent()->getPath(), u"/");
    EXPECT_EQ(built(u"/d//").toString(), u"s:f:/x.c!/d/");
    EXPECT_EQ(built(u"//").toString(), u"s:f:/x.c!/");
}

TEST(ContainerImpl, RefusesARelativePath)
{
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { built(u"d"); }),
              u"Invalid container-style storage IRI 's:f:/x.c!d'. Path should begin with a '/'.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { built(u"!/d"); }),
              u"Invalid container-style storage IRI 's:f:/x.c!%21/d'. Path should begin with a '/'.");
}

TEST(ContainerImpl, RefusesWhatIsNoScheme)
{
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { ContainerImpl(u"1s", plain(u"f:/x"), u"/d"); }),
              u"IRI '1s:f:/x!/d' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { ContainerImpl(u"a/b", plain(u"f:/x"), u"d"); }),
              u"IRI 'a/b:f:/x!d' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([] { ContainerImpl(u"", plain(u"f:/x"), u"/d"); }),
              u"IRI 'f%3A/x!/d' is not absolute.");
}

TEST(ContainerImpl, RefusesALoneSurrogate)
{
    EXPECT_THROW(built(std::u16string{u'/', char16_t{0xD800}}), std::out_of_range);
}

TEST(ContainerImpl, EscapesItsPathAndTheExclamationMark)
{
    EXPECT_EQ(built(u"/a!/b!").toString(), u"s:f:/x.c!/a%21/b%21");
    EXPECT_EQ(built(u"/%21?#[ ]\u00E9\U0001F600").toString(), u"s:f:/x.c!/%2521%3F%23%5B%20%5D\u00E9\U0001F600");
    EXPECT_EQ(built(u"/x!/").toString(), u"s:f:/x.c!/x%21");
}

TEST(ContainerImpl, InnerTextIsThatOfTheInnerIri)
{
    auto const text = [](Pointer const& inner) { return ContainerImpl(u"s", inner, u"/d").toString(); };
    EXPECT_EQ(text(plain(u"f://u@h:8/x%20y/?q!#r/")), u"s:f://u@h:8/x%20y?q!#r/!/d");
    EXPECT_EQ(text(std::make_shared<UPathIRIImpl>(u"file", fl::filesystem::upath(u"/x!y"))), u"s:file:///x%21y!/d");
    EXPECT_EQ(text(std::make_shared<ContainerImpl>(IRI(u"t:f:/x!/in"))), u"s:t:f:/x!/in!/d");
    EXPECT_EQ(text(plain(u"f:/!")), u"s:f:/!!/d");
}

TEST(ContainerImpl, InnerTextIsThatOfTheIriWhereTheInnerLocationPrintsAnother)
{
    UPathIRIImpl const top(u"file", fl::filesystem::upath(u"/x"), u"file:///x");
    EXPECT_EQ(top.getParent()->toString(), u"file://");
    EXPECT_EQ(ContainerImpl(u"s", top.getParent(), u"/d").toString(), u"s:file:///!/d");
    Pointer const inner = std::make_shared<ContainerImpl>(IRI(u"t:f:/x!/in/"));
    EXPECT_EQ(inner->toString(), u"t:f:/x!/in");
    EXPECT_EQ(ContainerImpl(u"s", inner, u"/d").toString(), u"s:t:f:/x!/in/!/d");
}

TEST(ContainerImpl, IsParsedFromText)
{
    ContainerImpl const location = parsed(u"s:f:/x.c!/d/e/");
    EXPECT_EQ(location.getScheme(), u"s");
    EXPECT_EQ(location.getPath(), u"/d/e");
    EXPECT_EQ(location.getName(), u"e");
    EXPECT_EQ(location.toString(), u"s:f:/x.c!/d/e");
    EXPECT_EQ(location.toIRI().toString(), u"s:f:/x.c!/d/e/");
    EXPECT_EQ(location.getInnerIRI()->toString(), u"f:/x.c");
    EXPECT_FALSE(location.getInnerIRI()->isOpaque());
}

struct Row
{
    std::u16string text;
    std::u16string canonical;
    std::u16string inner;
    std::u16string path;
};

TEST(ContainerImpl, SplitsItsTextAtTheLastExclamationMark)
{
    for (Row const& row : std::vector<Row>{
             {u"s:f:/x.c!/", u"s:f:/x.c!/", u"f:/x.c", u"/"},
             {u"s:f:/x.c!//", u"s:f:/x.c!/", u"f:/x.c", u"/"},
             {u"s:f:/x.c!/d/", u"s:f:/x.c!/d", u"f:/x.c", u"/d"},
             {u"s:f:/x.c!/d//", u"s:f:/x.c!/d/", u"f:/x.c", u"/d/"},
             {u"s:f:/x!y!/d", u"s:f:/x!y!/d", u"f:/x!y", u"/d"},
             {u"s:f:/x!!/d", u"s:f:/x!!/d", u"f:/x!", u"/d"},
             {u"s:f:/x/!/d", u"s:f:/x/!/d", u"f:/x", u"/d"},
             {u"s:f:/x?q!/a#b!/d", u"s:f:/x?q!/a#b!/d", u"f:/x?q!/a#b", u"/d"},
             {u"s:f:/x!/d%2Fe%21%20%FF", u"s:f:/x!/d%2Fe%21%20%FF", u"f:/x", u"/d/e! %FF"},
             {u"s:f:/x!/d%2F", u"s:f:/x!/d%2F", u"f:/x", u"/d/"},
             {u"s:f:/x!/d%21/", u"s:f:/x!/d%21", u"f:/x", u"/d!"},
             {u"s:f:/x!/d e", u"s:f:/x!/d%20e", u"f:/x", u"/d e"},
             {u"s:f:/x!/d?q", u"s:f:/x!/d?q", u"f:/x", u"/d?q"},
         })
    {
        SCOPED_TRACE(shown(row.text));
        ContainerImpl const location = parsed(row.text);
        EXPECT_EQ(location.toString(), row.canonical);
        EXPECT_EQ(location.getInnerIRI()->toString(), row.inner);
        EXPECT_EQ(location.getPath(), row.path);
        EXPECT_EQ(location.hasParent(), row.path != u"/");
    }
}

TEST(ContainerImpl, NestedTextIsParsedFromTheOutside)
{
    ContainerImpl const location = parsed(u"s:t:f:/x.c!/in.c!/d");
    EXPECT_EQ(location.getPath(), u"/d");
    Pointer const inner = location.getInnerIRI();
    EXPECT_TRUE(inner->isOpaque());
    EXPECT_EQ(inner->toString(), u"t:f:/x.c!/in.c");
    EXPECT_EQ(inner->getPath(), u"/in.c");
    EXPECT_EQ(inner->getInnerIRI()->toString(), u"f:/x.c");
}

TEST(ContainerImpl, RefusesTextThatIsNone)
{
    for (auto const& [text, error] : std::vector<std::pair<std::u16string, std::u16string>>{
             {u"s:f:/x.c",
              u"Invalid container-style storage IRI 's:f:/x.c'. Expected to find a '!' to begin the path section."},
             {u"s:", u"Invalid container-style storage IRI 's:'. Expected to find a '!' to begin the path section."},
             {u"s:f:/x%21/\u00E9/",
              u"Invalid container-style storage IRI 's:f:/x%21/\u00E9/'. Expected to find a '!' to begin the path "
              u"section."},
             {u"s:f:/x.c!d", u"Invalid container-style storage IRI 's:f:/x.c!d'. Path should begin with a '/'."},
             {u"s:f:/x.c!", u"Invalid container-style storage IRI 's:f:/x.c!'. Path should begin with a '/'."},
             {u"s:f:/x.c!/d!", u"Invalid container-style storage IRI 's:f:/x.c!/d!'. Path should begin with a '/'."},
             {u"s:f:/x.c!%2Fd", u"Invalid container-style storage IRI 's:f:/x.c!%2Fd'. Path should begin with a '/'."},
             {u"f:/x.c", u"Invalid container-style storage IRI 'f:/x.c'. Expected to find a '!' to begin the path "
                         u"section."},
             {u"s:rel!d", u"Invalid container-style storage IRI 's:rel!d'. Path should begin with a '/'."},
             {u"rel!/d", u"IRI 'rel!/d' is not absolute."},
             {u"rel", u"IRI 'rel' is not absolute."},
             {u"s:rel!/d", u"IRI 'rel' is not absolute."},
             {u"s:!/d", u"IRI '' is not absolute."},
             {u"s:t:f!/d", u"Invalid container-style storage IRI 't:f'. Expected to find a '!' to begin the path "
                           u"section."},
         })
        EXPECT_EQ(internalTextOf<std::runtime_error>([&, text = text] { parsed(text); }), error) << shown(text);
}

TEST(ContainerImpl, RefusesAnInnerPortBeyond65535)
{
    EXPECT_THROW(parsed(u"s:f://h:65536/x!/d"), std::invalid_argument);
}

TEST(ContainerImpl, NameIsTheLastSegment)
{
    EXPECT_EQ(built(u"/").getName(), u"/");
    EXPECT_EQ(built(u"/d").getName(), u"d");
    EXPECT_EQ(built(u"/d/e!").getName(), u"e!");
    EXPECT_EQ(built(u"/d//").getName(), u"");
}

TEST(ContainerImpl, ParentIsTheFolderAround)
{
    EXPECT_EQ(built(u"/a/b").getParent()->getPath(), u"/a");
    EXPECT_EQ(built(u"/a").getParent()->getPath(), u"/");
    EXPECT_EQ(built(u"/a").getParent()->toString(), u"s:f:/x.c!/");
    EXPECT_EQ(parsed(u"s:f:/x.c!/a/b").getParent()->toString(), u"s:f:/x.c!/a");
    EXPECT_EQ(built(u"/a//b").getParent()->getPath(), u"/a/");
}

TEST(ContainerImpl, FolderNamedWithAnExclamationMarkKeepsItsName)
{
    Pointer const folder = built(u"/x!/b").getParent();
    EXPECT_EQ(folder->getPath(), u"/x!");
    EXPECT_EQ(folder->getName(), u"x!");
    EXPECT_EQ(folder->toString(), u"s:f:/x.c!/x%21");
    EXPECT_EQ(parsed(u"s:f:/x.c!/x%21/b").getParent()->toString(), u"s:f:/x.c!/x%21");
}

TEST(ContainerImpl, RootHasNoParent)
{
    for (int attempt = 0; attempt != 2; ++attempt) {
        EXPECT_EQ(internalTextOf<std::logic_error>([] { static_cast<void>(built(u"/").getParent()); }),
                  u"IRI does not have a parent IRI.");
        EXPECT_EQ(internalTextOf<std::logic_error>([] { static_cast<void>(parsed(u"s:f:/x!/").getParent()); }),
                  u"IRI does not have a parent IRI.");
    }
    EXPECT_FALSE(built(u"/").hasParent());
    EXPECT_TRUE(built(u"/a").hasParent());
}

TEST(ContainerImpl, RelativesKeepTheInnerLocationItself)
{
    for (Pointer const& location : {Pointer(std::make_shared<ContainerImpl>(u"s", plain(u"f:/x.c"), u"/a/b")),
                                    Pointer(std::make_shared<ContainerImpl>(IRI(u"s:f:/x.c!/a/b")))})
    {
        Pointer const inner = location->getInnerIRI();
        EXPECT_EQ(location->getParent()->getInnerIRI(), inner);
        EXPECT_EQ(location->getRoot()->getInnerIRI(), inner);
        EXPECT_EQ(location->withPath(u"/c")->getInnerIRI(), inner);
        EXPECT_EQ(location->getInnerIRI(), inner);
    }
}

TEST(ContainerImpl, RootAndWithPathKeepTheScheme)
{
    EXPECT_EQ(built(u"/a/b").getRoot()->toString(), u"s:f:/x.c!/");
    EXPECT_EQ(parsed(u"s:t:f:/x!/y!/a/b").withPath(u"/c d")->toString(), u"s:t:f:/x!/y!/c%20d");
}

TEST(ContainerImpl, ComparesTexts)
{
    EXPECT_TRUE(built(u"/d").equals(parsed(u"s:f:/x.c!/d/")));
    EXPECT_FALSE(built(u"/d").equals(built(u"/D")));
    EXPECT_FALSE(built(u"/d").equals(ContainerImpl(u"t", plain(u"f:/x.c"), u"/d")));
    EXPECT_TRUE(built(u"/d").less(built(u"/e")));
    EXPECT_FALSE(built(u"/d").less(built(u"/d")));
}

TEST(ContainerImpl, ResolvedPathHasNoDotSegments)
{
    EXPECT_EQ(built(u"/a/./b/../c!").getResolvedPath(), u"/a/c!");
}

TEST(ContainerImpl, SharesTheImplementationOfTheInnerLocation)
{
    StorageIRI const inner(u"f:/x.c");
    StorageIRI const location(u"zip", inner, u"/d");
    EXPECT_EQ(&location.getInnerIRI().toString(), &inner.toString());
    EXPECT_EQ(location.toString(), u"zip:f:/x.c!/d");
    EXPECT_EQ(StorageIRI(location, u"e").toString(), u"zip:f:/x.c!/d/e");
    EXPECT_EQ(StorageIRI(location, u"/e!").toString(), u"zip:f:/x.c!/e%21");
    EXPECT_EQ(StorageIRI(u"zip:f:/x.c!/d"), location);
}

TEST(ContainerImpl, IsParsedAThousandDeep)
{
    std::u16string text = u"f:/x";
    for (int i = 0; i != 1000; ++i)
        text = u"s:" + text + u"!/d";
    StorageIRI location(text);
    for (int i = 0; i != 1000; ++i) {
        EXPECT_EQ(location.getPath(), u"/d");
        location = location.getInnerIRI();
    }
    EXPECT_EQ(location.toString(), u"f:/x");
}

void checkAgreement(StorageIRI const& one, StorageIRI const& other)
{
    RC_ASSERT(one.getScheme() == other.getScheme());
    RC_ASSERT(shown(one.toString()) == shown(other.toString()));
    RC_ASSERT(shown(one.getPath()) == shown(other.getPath()));
    RC_ASSERT(shown(one.getName()) == shown(other.getName()));
    RC_ASSERT(one.hasInnerIRI() == other.hasInnerIRI());
    RC_ASSERT(one == other);
    RC_ASSERT(one.hashValue() == other.hashValue());
    if (one.hasInnerIRI())
        checkAgreement(one.getInnerIRI(), other.getInnerIRI());
}

RC_GTEST_PROP(ContainerImpl, BuiltAndParsedAgreeAtEveryDepth, ())
{
    using namespace tests::support;
    int const depth = *rc::gen::element(1, 2, 3);
    rc::Gen<StorageIRI> location = plainLocation();
    for (int i = 0; i != depth; ++i)
        location = containerLocation(location);
    StorageIRI const made = *location;
    RC_TAG(depth);
    checkAgreement(StorageIRI(made.toString()), made);
}

RC_GTEST_PROP(ContainerImpl, KeepsSchemeInnerTextAndPath, ())
{
    std::u16string const scheme = *tests::support::scheme();
    StorageIRI const inner = *tests::support::anyLocation();
    Text const path = *tests::support::innerPath();
    for (StorageIRI const& location :
         {StorageIRI(scheme, inner, path), StorageIRI(StorageIRI(scheme, inner, path).toString())})
    {
        RC_ASSERT(location.getScheme() == scheme);
        RC_ASSERT(shown(location.getInnerIRI().toString()) == shown(inner.toString()));
        RC_ASSERT(shown(location.getPath()) == shown(path.value));
    }
}

constexpr char32_t blockSize = 0x400;

/// All characters of a block of code points, with '/' in the middle at most.
std::u16string charactersFrom(char32_t first)
{
    std::u16string characters;
    for (char32_t c = first; c != first + blockSize; ++c) {
        if (c < 0xD800 || c > 0xDFFF)
            characters += tests::support::fromCodePoint(c);
    }
    return characters;
}

/// Beyond U+FFFF only where the rules of IRIs change: at the ends of a plane, and at U+E1000.
bool isWorthTesting(char32_t block)
{
    char32_t const inPlane = block & 0xFFFF;
    return block < 0x10000 || inPlane == 0 || inPlane == 0x1000 || inPlane == 0x10000 - blockSize;
}

TEST(ContainerImpl, EveryCharacterComesBackFromThreeDeep)
{
    for (char32_t block = 0; block != 0x110000; block += blockSize) {
        if (!isWorthTesting(block))
            continue;
        SCOPED_TRACE(static_cast<std::uint32_t>(block));
        std::u16string const path = u"/" + charactersFrom(block);
        for (StorageIRI const& plainInner :
             {StorageIRI(u"file", fl::filesystem::upath(path, false)), StorageIRI(StorageIRI(u"f://h/"), path)})
        {
            StorageIRI const made(u"a", StorageIRI(u"b", StorageIRI(u"c", plainInner, path), path), path);
            StorageIRI location(made.toString());
            EXPECT_EQ(location, made);
            for (; location.hasInnerIRI(); location = location.getInnerIRI())
                EXPECT_TRUE(location.getPath() == path);
            EXPECT_TRUE(location.getPath() == path);
            EXPECT_EQ(location.toString(), plainInner.toString());
        }
    }
}

TEST(ContainerImplConcurrency, ManyThreadsGetOneOfEach)
{
    for (int round = 0; round != 20; ++round) {
        ContainerImpl const location = parsed(u"s:t:f:/x!/y!/a b/c/");
        std::vector<std::pair<StorageIRIImpl const*, std::u16string const*>> seen(32);
        inThreads(32, [&](int i) {
            auto& [parent, text] = seen[static_cast<std::size_t>(i)];
            if (i % 2 == 0)
                static_cast<void>(location.getName());
            parent = location.getParent().get();
            text = &location.toString();
            EXPECT_EQ(location.getName(), u"c");
            EXPECT_EQ(location.getRoot()->getPath(), u"/");
            EXPECT_EQ(location.getResolvedPath(), u"/a b/c");
            EXPECT_EQ(location.getInnerIRI()->getParent()->toString(), u"t:f:/x!/");
        });
        EXPECT_EQ(std::count(seen.begin(), seen.end(), seen.front()), 32);
        EXPECT_EQ(*seen.front().second, u"s:t:f:/x!/y!/a%20b/c");
    }
}

} // namespace
} // namespace foundation::storage::provider::detail
