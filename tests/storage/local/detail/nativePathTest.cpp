#include <storage/local/detail/nativePath.hpp>

#include <gtest/gtest.h>

#include <fl/filesystem/upath.hpp>
#include <tests/support/failureOf.hpp>

#include <utility>
#include <vector>

namespace foundation::storage::local::detail {
namespace {

using provider::ErrorCode;
using provider::StorageIRI;
using tests::support::failure;
using tests::support::failureOf;

TEST(NativePath, IsThePlainPathOfALocationOnThisMachine)
{
    for (auto const& [text, path] : std::vector<std::pair<std::u16string, std::string>>{
             {u"file:///tmp/x", "/tmp/x"},
             {u"file:/tmp/x", "/tmp/x"},
             {u"file://localhost/tmp/x", "/tmp/x"},
             {u"FILE://LocalHost/tmp/x", "/tmp/x"},
             {u"file:///", "/"},
             {u"file:/", "/"},
             {u"file:///tmp/x/", "/tmp/x"},
             {u"file:///tmp/x//", "/tmp/x"},
             {u"file:////", "/"},
             {u"file:///tmp//x", "/tmp//x"},
             {u"file:///tmp/./a/../x", "/tmp/./a/../x"},
             {u"file:///a%20b", "/a b"},
             {u"file:///%2541", "/%41"},
             {u"file:///a%23b%3Fc!d", "/a#b?c!d"},
             {u"file:///caf\u00E9", "/caf\xC3\xA9"},
             {u"file:///caf\uEFE9", "/caf\xE9"},
         })
        EXPECT_EQ(nativePath(StorageIRI(text)), path) << path;
}

TEST(NativePath, IsThePathOfALocationMadeFromOne)
{
    for (auto const& [path, expected] : std::vector<std::pair<std::u16string, std::string>>{
             {u"/", "/"},
             {u"/tmp/x", "/tmp/x"},
             {u"/tmp/x/", "/tmp/x"},
             {u"/tmp/a b%41?c#d!e", "/tmp/a b%41?c#d!e"},
             {u"/caf\uEFE9", "/caf\xE9"},
         })
    {
        StorageIRI const iri(u"file", fl::filesystem::upath(path));
        EXPECT_EQ(nativePath(iri), expected);
        EXPECT_EQ(nativePath(StorageIRI(iri, u"new")), expected == "/" ? "/new" : expected + "/new");
        EXPECT_EQ(nativePath(StorageIRI(iri.toString())), expected);
    }
}

TEST(NativePath, OfTheTopAboveAPathIsTheRootHoweverItPrints)
{
    StorageIRI const plain(u"file", fl::filesystem::upath(u"/tmp"));
    EXPECT_EQ(nativePath(plain.getParent()), "/");
    StorageIRI const printed(u"file", fl::filesystem::upath(u"/tmp"));
    EXPECT_EQ(printed.toString(), u"file:///tmp");
    EXPECT_EQ(printed.getParent().toString(), u"file://");
    EXPECT_EQ(nativePath(printed.getParent()), "/");
}

TEST(NativePath, RefusesAPathUnderAnotherSchemeAndAnEmptyOne)
{
    for (StorageIRI const& iri :
         {StorageIRI(u"zip", fl::filesystem::upath(u"/tmp/x")), StorageIRI(u"file", fl::filesystem::upath())})
        EXPECT_EQ(failureOf([&] { static_cast<void>(nativePath(iri)); }), failure(ErrorCode::InvalidLocation, iri));
}

TEST(NativePath, RefusesALocationThatNamesNoLocalFile)
{
    for (std::u16string const& text : std::vector<std::u16string>{
             u"http:///tmp/x",
             u"files:///tmp/x",
             u"fil:///tmp/x",
             u"f:/tmp/x",
             u"file://example.org/tmp/x",
             u"file://localhost.example.org/tmp/x",
             u"file://user@localhost/tmp/x",
             u"file://localhost:80/tmp/x",
             u"file://",
             u"file://localhost",
             u"file:///tmp/a?b",
             u"file:///tmp/a#b",
             u"file://localhost?/tmp",
             u"file:///tmp/a%00b",
             u"file:s:/a!/b",
             u"zip:file:///a.zip!/b",
         })
    {
        StorageIRI const iri(text);
        EXPECT_EQ(failureOf([&] { static_cast<void>(nativePath(iri)); }), failure(ErrorCode::InvalidLocation, iri));
    }
}

TEST(NativePath, RefusesANameWithNUL)
{
    StorageIRI const iri(StorageIRI(u"file:///tmp"), std::u16string(u"a\0b", 3));
    EXPECT_EQ(failureOf([&] { static_cast<void>(nativePath(iri)); }), failure(ErrorCode::InvalidLocation, iri));
}

TEST(NativePath, KeepsWhatANameHoldsOfTheSyntaxOfLocations)
{
    StorageIRI const folder(u"file:///tmp");
    for (std::u16string const& name : std::vector<std::u16string>{u"%41", u"a#b", u"a?b", u"a!b", u"a b", u"%2F"})
        EXPECT_EQ(nativePath(StorageIRI(folder, name)), "/tmp/" + std::string(name.begin(), name.end()));
}

TEST(NativePath, IsSplitAtItsLastSlash)
{
    EXPECT_EQ(parentOf("/a/b c"), "/a/");
    EXPECT_EQ(nameOf("/a/b c"), "b c");
    EXPECT_EQ(parentOf("/a"), "/");
    EXPECT_EQ(nameOf("/a"), "a");
    EXPECT_EQ(parentOf("/"), "/");
    EXPECT_EQ(nameOf("/"), "");
}

} // namespace
} // namespace foundation::storage::local::detail
