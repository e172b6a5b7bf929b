#include <storage/archive/ArchiveProviderFactory.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;

namespace {

TEST(ArchiveProviderFactory, SharesTheProviderOfAContainerHoweverItIsSpelled)
{
    ArchiveProviderFactory const factory(ArchiveFormat::Zip);
    StorageItem const file = makeFile(makeZip({}));
    auto const provider = factory.buildProvider(file);
    EXPECT_EQ(factory.buildProvider(StorageItem(file.getParent(), u"./archive")), provider);
    EXPECT_NE(factory.buildProvider(StorageItem(file.getParent(), u"other")), provider);
    EXPECT_EQ(factory.getKey(file), StorageIRI(u"mem://archives/archive"));
}

TEST(ArchiveProviderFactory, HandsItsLimitsOn)
{
    StorageItem const file = makeFile(makeZip({{.name = "a"}}));
    auto const provider = ArchiveProviderFactory(ArchiveFormat::Zip, {.entries = 0}).buildProvider(file);
    EXPECT_THROW(provider->listAll(StorageIRI(u"zip", file.getLocation(), u"/")), ArchiveException);
}

TEST(ArchiveProviderFactory, RefusesWhatLiesTooDeep)
{
    ArchiveProviderFactory const factory(ArchiveFormat::Zip, {.nesting = 1});
    StorageItem const file = makeFile(makeZip({{.name = "in.zip", .content = makeZip({})}}));
    EXPECT_NE(factory.buildProvider(file), nullptr);
    StorageItem const inner(openRoot(ArchiveFormat::Zip, file), u"in.zip");
    EXPECT_EQ(failureOf([&] { factory.buildProvider(inner); }),
              failure(ErrorCode::InvalidLocation, inner.getLocation()));
}

} // namespace

} // namespace foundation::storage::archive
