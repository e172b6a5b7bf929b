#include <storage/registry/registerAll.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;

namespace {

struct ZipInRegistry : testing::Test
{
    /// Keeps the store that holds the archives.
    StorageItem openStore()
    {
        registry::registerAll(stores);
        return stores.open(u"mem://zips/");
    }

    registry::Registry stores;
    StorageItem const folder = openStore();
};

TEST_F(ZipInRegistry, IsWrittenFromTheInsideOut)
{
    {
        StorageItem const deep = stores.open(u"zip:zip:zip:mem://zips/a.zip!/b.zip!/c.zip!/deep");
        StorageItem const shallow = stores.open(u"zip:mem://zips/a.zip!/shallow");
        write(deep, "deep");
        write(shallow, "shallow");
        stores.flush();
    }
    EXPECT_EQ(read(stores.open(u"zip:zip:zip:mem://zips/a.zip!/b.zip!/c.zip!/deep")), "deep");
    EXPECT_EQ(read(stores.open(u"zip:mem://zips/a.zip!/shallow")), "shallow");
}

TEST_F(ZipInRegistry, IsWrittenOnShutdown)
{
    StorageItem const file = stores.open(u"zip:mem://zips/a.zip!/file");
    write(file, "content");
    stores.shutdown();
    EXPECT_TRUE(stores.open(u"mem://zips/a.zip").fileExists());
}

TEST_F(ZipInRegistry, ThatFailsStopsNoOther)
{
    StorageItem const broken = stores.open(u"zip:mem://zips/a.zip!/file");
    StorageItem const sound = stores.open(u"zip:mem://zips/b.zip!/file");
    write(broken, "content");
    write(sound, "content");
    write(stores.open(u"mem://zips/a.zip"), "of somebody else");
    EXPECT_EQ(failureOf([&] { stores.flush(); }), failure(ErrorCode::IOError, StorageIRI(u"mem://zips/a.zip")));
    EXPECT_TRUE(stores.open(u"mem://zips/b.zip").fileExists());
}

} // namespace

} // namespace foundation::storage::archive
