#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/rawZips.hpp>

#include <gmock/gmock.h>

namespace foundation::storage::archive {

using namespace provider;
using testing::ElementsAre;
using Reason = ArchiveException::Reason;

namespace {

StorageItem openRaw(std::vector<RawEntry> const& entries, ArchiveLimits const& limits = {})
{
    return openRoot(ArchiveFormat::Zip, makeFile(makeRawZip(entries)), limits);
}

template <typename Action>
Reason reasonFor(Action const& action)
{
    try {
        action();
    } catch (ArchiveException const& error) {
        return error.getReason();
    }
    throw std::logic_error("no ArchiveException");
}

TEST(ZipHostile, ASizeInTheArchiveThatIsALieDoesNotExcuseTheRatio)
{
    ArchiveLimits const limits{.ratio = 500, .bytesOfAnyRatio = 1'000'000};
    StorageItem const root = openRaw(
        {{.name = "a", .content = std::string(2'000'000, '\0'), .method = 8, .sizeInArchive = 4'000'000}}, limits);
    EXPECT_EQ(reasonFor([&] { StorageItem(root, u"a").openReadOnlyStream(); }), Reason::RatioTooHigh);
}

TEST(ZipHostile, WithARatioOfNothingOnlySmallContentIsLetThrough)
{
    ArchiveLimits const limits{.ratio = 0, .bytesOfAnyRatio = 10};
    StorageItem const root =
        openRaw({{.name = "small", .content = "0123456789"}, {.name = "large", .content = "0123456789a"}}, limits);
    EXPECT_EQ(read(root, u"small"), "0123456789");
    EXPECT_EQ(reasonFor([&] { StorageItem(root, u"large").openReadOnlyStream(); }), Reason::RatioTooHigh);
}

TEST(ZipHostile, ALinkThatIsNotAsLongAsItIsSaidToBeIsBroken)
{
    StorageItem const root = openRaw({{.name = "ok", .content = "content"},
                                      {.name = "o", .content = "wrong"},
                                      {.name = "long", .content = "ok", .attributes = linkAttributes, .size = 1},
                                      {.name = "short", .content = "ok", .attributes = linkAttributes, .size = 3},
                                      {.name = "right", .content = "ok", .attributes = linkAttributes}});
    EXPECT_EQ(StorageItem(root, u"long").existsExtended(), ExistenceTypeExtended::BrokenSymlink);
    EXPECT_EQ(StorageItem(root, u"short").existsExtended(), ExistenceTypeExtended::BrokenSymlink);
    EXPECT_EQ(read(root, u"right"), "content");
}

TEST(ZipHostile, TargetsOfLinksAreInTheSameCharactersAsNames)
{
    StorageItem const root = openRaw(
        {{.name = "caf\x82", .content = "content"}, {.name = "l", .content = "caf\x82", .attributes = linkAttributes}});
    EXPECT_EQ(read(root, u"l"), "content");
    EXPECT_EQ(read(root, u"caf\u00E9"), "content");
}

TEST(ZipHostile, NamesThatAreAlmostUtf8AreInTheCharactersOfTheFirstPCs)
{
    StorageItem const root =
        openRaw({{.name = "\xC0\xAE\xC0\xAE/x"}, {.name = "a\xED\xA0\x80"}, {.name = "\x80\x81\xFF"}});
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"└«└«/", u"└«└«/x", u"aφáÇ", u"Çü\u00A0"));
}

TEST(ZipHostile, AFolderIsOneByItsAttributesToo)
{
    StorageItem const root = openRaw({{.name = "unix", .attributes = 040755u << 16},
                                      {.name = "dos", .system = 0, .attributes = 0x10},
                                      {.name = "file", .system = 0, .attributes = 0x20},
                                      {.name = "full", .content = "content", .system = 0, .attributes = 0x10},
                                      {.name = "contradiction", .attributes = 0100644u << 16 | 0x10}});
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"unix/", u"dos/", u"file", u"full", u"contradiction"));
    EXPECT_EQ(read(root, u"full"), "content");
}

TEST(ZipHostile, TheContentOfAFolderIsNotShown)
{
    StorageItem const root = openRaw({{.name = "a/", .content = "content"}, {.name = "a/b", .content = "b"}});
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"a/", u"a/b"));
}

} // namespace

} // namespace foundation::storage::archive
