#include <storage/archive/ArchiveProviderFactory.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <filesystem>

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

/// Two archives, and links that lead to them.
class ArchivesBehindLinks : public testing::Test
{
protected:
    ArchivesBehindLinks()
    {
        std::filesystem::create_directories(folder / "x");
        std::filesystem::create_directories(folder / "y/deep");
        folder.write("x/a.zip", makeZip({{.name = "file", .content = "x"}}));
        folder.write("y/a.zip", makeZip({{.name = "file", .content = "y"},
                                         {.name = "in.zip", .content = makeZip({{.name = "file", .content = "in"}})}}));
        std::filesystem::create_symlink("../y/deep", folder / "x/link");
        std::filesystem::create_symlink("../y/a.zip", folder / "x/b.zip");
    }

    StorageItem file(std::u16string const& path) const { return StorageItem(local, folder.iri(path)); }

    /// An item in the archive at a location that is spelled as it is given.
    StorageItem inside(StorageItem const& container, std::u16string const& path) const
    {
        return StorageItem(factory.buildProvider(container), StorageIRI(u"zip", container.getLocation(), path));
    }

    TemporaryFolder folder;
    std::shared_ptr<local::LocalProvider> local = std::make_shared<local::LocalProvider>();
    ArchiveProviderFactory factory{ArchiveFormat::Zip};
};

TEST_F(ArchivesBehindLinks, AreToldApart)
{
    StorageItem const ofX = inside(file(u"x/a.zip"), u"/file");
    StorageItem const ofY = inside(file(u"x/link/../a.zip"), u"/file");
    EXPECT_EQ(read(ofX), "x");
    EXPECT_EQ(read(ofY), "y");
}

TEST_F(ArchivesBehindLinks, AreOneHoweverTheyAreReached)
{
    for (bool const linkFirst : {true, false}) {
        StorageItem const first = inside(file(linkFirst ? u"x/b.zip" : u"y/a.zip"), u"/file");
        StorageItem const second = inside(file(linkFirst ? u"y/a.zip" : u"x/b.zip"), u"/file");
        StorageItem const third = inside(file(u"x/link/./../a.zip"), u"/file");
        StorageItem const fourth =
            inside(StorageItem(local, StorageIRI(u"file://localhost" + folder.iri(u"y/a.zip").getPath())), u"/file");
        for (StorageItem const& item : {first, second, third, fourth}) {
            EXPECT_TRUE(item.hasSameProviderInstance(first));
            EXPECT_EQ(read(item), "y");
        }
    }
}

TEST_F(ArchivesBehindLinks, InEachOtherAreOneToo)
{
    StorageItem const first = inside(inside(file(u"x/b.zip"), u"/in.zip"), u"/file");
    StorageItem const second = inside(inside(file(u"y/a.zip"), u"/./in.zip"), u"/file");
    EXPECT_TRUE(first.hasSameProviderInstance(second));
    EXPECT_EQ(read(first), "in");
    EXPECT_EQ(read(second), "in");
}

TEST_F(ArchivesBehindLinks, StayTheOnesThatWereOpenedWhenTheLinkChanges)
{
    StorageItem const before = inside(file(u"x/b.zip"), u"/file");
    std::filesystem::remove(folder / "x/b.zip");
    std::filesystem::create_symlink("a.zip", folder / "x/b.zip");
    StorageItem const straight = inside(file(u"y/a.zip"), u"/file");
    StorageItem const after = inside(file(u"x/b.zip"), u"/file");
    EXPECT_TRUE(straight.hasSameProviderInstance(before));
    EXPECT_FALSE(after.hasSameProviderInstance(before));
    EXPECT_EQ(read(straight), "y");
    EXPECT_EQ(read(after), "x");
}

TEST_F(ArchivesBehindLinks, AnotherArchiveIsNoPlaceInOne)
{
    StorageItem const item = inside(file(u"x/b.zip"), u"/file");
    for (auto const* const path : {u"x/a.zip", u"x/none.zip"}) {
        StorageIRI const other(u"zip", folder.iri(path), u"/file");
        auto const provider = factory.buildProvider(file(u"y/a.zip"));
        EXPECT_EQ(failureOf([&] { provider->exists(other); }), failure(ErrorCode::InvalidLocation, other));
    }
}

TEST(ArchiveProviderFactory, TellsArchivesInOneApartByTheLinksInThat)
{
    ArchiveProviderFactory const factory(ArchiveFormat::Zip);
    StorageItem const outer = makeFile(makeZip({{.name = "x/a.zip", .content = makeZip({{.name = "x"}})},
                                                {.name = "y/a.zip", .content = makeZip({{.name = "y"}})},
                                                {.name = "y/deep/"},
                                                {.name = "x/link", .content = "../y/deep", .unixMode = 0120777}}));
    StorageItem const root(factory.buildProvider(outer), StorageIRI(u"zip", outer.getLocation(), u"/"));
    StorageItem const ofX(root, u"x/a.zip");
    StorageItem const ofY(root, u"x/link/../a.zip");
    EXPECT_NE(factory.getKey(ofX), factory.getKey(ofY));
    EXPECT_EQ(factory.getKey(StorageItem(root, u"y/a.zip")), factory.getKey(ofY));
    EXPECT_EQ(factory.getKey(StorageItem(root, u"x/link/none")), factory.getKey(StorageItem(root, u"y/deep/none")));
    auto const x = factory.buildProvider(ofX);
    auto const y = factory.buildProvider(ofY);
    EXPECT_TRUE(x->fileExists(StorageIRI(u"zip", ofX.getLocation(), u"/x")));
    EXPECT_TRUE(y->fileExists(StorageIRI(u"zip", ofY.getLocation(), u"/y")));
}

} // namespace

} // namespace foundation::storage::archive
