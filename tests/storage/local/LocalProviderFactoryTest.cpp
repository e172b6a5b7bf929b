#include <storage/local/LocalProviderFactory.hpp>

#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::local {
namespace {

using namespace provider;
using namespace tests::support;

StorageIRI const locations[] = {
    StorageIRI(u"file:///"),
    StorageIRI(u"file:///a/b%20c"),
    StorageIRI(u"file:/a"),
    StorageIRI(u"FILE://LocalHost/a"),
    StorageIRI(u"file", fl::filesystem::upath(u"/a b#c")),
};

TEST(LocalProviderFactory, SharesOneProviderForAllLocations)
{
    LocalProviderFactory const factory;
    auto const provider = factory.buildProvider(StorageIRI(u"file:///x"));
    for (StorageIRI const& location : locations)
        EXPECT_EQ(factory.buildProvider(location), provider) << location;
}

TEST(LocalProviderFactory, HasOneKeyForAllLocations)
{
    LocalProviderFactory const factory;
    for (StorageIRI const& location : locations) {
        EXPECT_EQ(factory.getKey(location), StorageIRI(u"file:///")) << location;
        EXPECT_EQ(factory.getKey(location).toString(), u"file:///") << location;
    }
}

TEST(LocalProviderFactory, ServesTheFilesOfThisMachine)
{
    TemporaryFolder const folder;
    folder.write("file", "content");
    StorageIRI const file = folder.iri(u"file");
    EXPECT_TRUE(LocalProviderFactory().buildProvider(file)->fileExists(file));
}

TEST(LocalProviderFactory, RefusesWhatNamesNoLocalFile)
{
    LocalProviderFactory const factory;
    for (char16_t const* const text : {u"mem:///a", u"file://elsewhere/a", u"file://localhost:80/a", u"file:///a?b",
                                       u"file:///a#b", u"file:///a%00b", u"file://", u"zip:file:///a.zip!/b"})
    {
        StorageIRI const iri(text);
        EXPECT_EQ(failureOf([&] { static_cast<void>(factory.getKey(iri)); }), failure(ErrorCode::InvalidLocation, iri));
        EXPECT_EQ(failureOf([&] { factory.buildProvider(iri); }), failure(ErrorCode::InvalidLocation, iri));
    }
}

TEST(LocalProviderFactory, BuildsAnewWhenNobodyHoldsTheProvider)
{
    LocalProviderFactory const factory;
    std::weak_ptr<IProvider> const gone = factory.buildProvider(StorageIRI(u"file:///a"));
    EXPECT_TRUE(gone.expired());
    EXPECT_NE(factory.buildProvider(StorageIRI(u"file:///a")), nullptr);
}

} // namespace
} // namespace foundation::storage::local
