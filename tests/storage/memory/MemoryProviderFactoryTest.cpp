#include <storage/memory/MemoryProviderFactory.hpp>

#include <gtest/gtest.h>

#include <tests/storage/memory/MemoryStore.hpp>

#include <stdexcept>

namespace foundation::storage::memory {
namespace {

using namespace provider;

boost::property_tree::ptree limitOf(char const* bytes)
{
    boost::property_tree::ptree tree;
    tree.put("limit", bytes);
    return tree;
}

TEST(MemoryProviderFactory, SharesOneProviderPerAuthority)
{
    MemoryProviderFactory const factory;
    auto const provider = factory.buildProvider(StorageIRI(u"mem://a/x/y"));
    EXPECT_EQ(factory.buildProvider(StorageIRI(u"mem://a/")), provider);
    EXPECT_EQ(factory.buildProvider(StorageIRI(u"MEM://a/z")), provider);
    EXPECT_NE(factory.buildProvider(StorageIRI(u"mem://b/x/y")), provider);
    EXPECT_NE(factory.buildProvider(StorageIRI(u"mem:///x/y")), provider);
}

TEST(MemoryProviderFactory, KeysByTheRootOfTheAuthority)
{
    MemoryProviderFactory const factory;
    EXPECT_EQ(factory.getKey(StorageIRI(u"mem://a/x")), StorageIRI(u"mem://a/"));
    EXPECT_EQ(factory.getKey(StorageIRI(u"mem:/x")), StorageIRI(u"mem:///"));
    EXPECT_EQ(factory.getKey(StorageIRI(u"mem://u@a:1/x")).toString(), u"mem://u@a:1/");
}

/// Locations that are made of others write it in the one way, whatever these were.
TEST(MemoryProviderFactory, TakesAllWaysToWriteAnAuthorityForOne)
{
    MemoryProviderFactory const factory;
    for (std::u16string const authority : {u"%41b:80", u"h:080", u"h:", u"a%c3%a9", u"u%2Dv@h%2Fi", u"[::1]:01"}) {
        StorageIRI const written(u"mem://" + authority + u"/folder");
        StorageIRI const made(written, u"/folder");
        auto const provider = factory.buildProvider(written);
        provider->createFolder(written);
        EXPECT_TRUE(provider->folderExists(made)) << made;
        EXPECT_NO_THROW(provider->createFolderRecursive(StorageIRI(written, u"a/b"))) << written;
        EXPECT_EQ(factory.getKey(made), factory.getKey(written));
        EXPECT_EQ(factory.buildProvider(made), provider) << made;
    }
}

TEST(MemoryProviderFactory, KeepsAuthoritiesOfOtherLetterCaseApart)
{
    MemoryProviderFactory const factory;
    auto const provider = factory.buildProvider(StorageIRI(u"mem://%41/"));
    EXPECT_EQ(factory.buildProvider(StorageIRI(u"mem://A/")), provider);
    EXPECT_NE(factory.buildProvider(StorageIRI(u"mem://a/")), provider);
}

TEST(MemoryProviderFactory, ServesLocationsMadeOfPaths)
{
    MemoryProviderFactory const factory;
    StorageIRI const file(u"mem", fl::filesystem::upath(u"/a b#c"));
    auto const provider = factory.buildProvider(file);
    EXPECT_EQ(factory.buildProvider(StorageIRI(u"mem:///")), provider);
    provider->createFile(file);
    EXPECT_TRUE(provider->fileExists(StorageIRI(u"mem:/a%20b%23c")));
}

TEST(MemoryProviderFactory, KeepsStoresApart)
{
    MemoryProviderFactory const factory;
    auto const a = factory.buildProvider(StorageIRI(u"mem://a/"));
    auto const b = factory.buildProvider(StorageIRI(u"mem://b/"));
    a->createFile(StorageIRI(u"mem://a/file"));
    EXPECT_FALSE(b->fileExists(StorageIRI(u"mem://b/file")));
    EXPECT_EQ(failureOf([&] { a->fileExists(StorageIRI(u"mem://b/file")); }),
              failure(ErrorCode::InvalidLocation, StorageIRI(u"mem://b/file")));
}

TEST(MemoryProviderFactory, RefusesForeignLocations)
{
    MemoryProviderFactory const factory;
    for (char16_t const* const text : {u"file:///a", u"mem://a/b?c", u"zip:mem://a/b.zip!/c", u"mem:mem:///b.zip!/c"}) {
        StorageIRI const iri(text);
        EXPECT_EQ(failureOf([&] { factory.buildProvider(iri); }), failure(ErrorCode::InvalidLocation, iri));
        EXPECT_EQ(failureOf([&] { static_cast<void>(factory.getKey(iri)); }), failure(ErrorCode::InvalidLocation, iri));
    }
}

TEST(MemoryProviderFactory, KeepsWhatIsStoredWhileNobodyHoldsTheProvider)
{
    MemoryProviderFactory const factory;
    StorageIRI const file(u"mem://a/file");
    factory.buildProvider(file)->createFile(file);
    EXPECT_TRUE(factory.buildProvider(file)->fileExists(file));
}

TEST(MemoryProviderFactory, SharesNothingWithOtherFactories)
{
    MemoryProviderFactory const one;
    MemoryProviderFactory const other;
    StorageIRI const file(u"mem://a/file");
    one.buildProvider(file)->createFile(file);
    EXPECT_FALSE(other.buildProvider(file)->fileExists(file));
}

TEST(MemoryProviderFactory, ConfiguresTheLimit)
{
    MemoryProviderFactory factory;
    StorageIRI const file(u"mem://a/file");
    factory.configure(limitOf("3"));
    auto const stream = factory.buildProvider(file)->openStream(file, rewrite);
    EXPECT_THROW(stream->write("1234", 4), ByteStreamFailure);
}

TEST(MemoryProviderFactory, TakesTheLimitAwayWithTheConfiguration)
{
    MemoryProviderFactory factory;
    StorageIRI const file(u"mem://a/file");
    factory.configure(limitOf("3"));
    factory.buildProvider(file)->createFile(file);
    factory.configure({});
    auto const stream = factory.buildProvider(file)->openStream(file, rewrite);
    EXPECT_EQ(stream->write("1234", 4), 4);
}

TEST(MemoryProviderFactory, ShutsDownItsProviders)
{
    MemoryProviderFactory const factory;
    auto const provider = factory.buildProvider(StorageIRI(u"mem://a/"));
    bool told = false;
    provider->publishFolderEventsFor(StorageIRI(u"mem://a/"), [&](auto const&...) { told = true; },
                                     {events::Kind::Created});
    factory.shutdownProvider();
    provider->createFile(StorageIRI(u"mem://a/file"));
    EXPECT_FALSE(told);
}

} // namespace
} // namespace foundation::storage::memory
