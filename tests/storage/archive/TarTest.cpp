#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/failureOf.hpp>

#include <gmock/gmock.h>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;
using testing::ElementsAre;
using testing::UnorderedElementsAre;
using Reason = ArchiveException::Reason;

namespace {

StorageItem openTar(std::vector<Member> const& members, std::string const& compression = "",
                    ArchiveLimits const& limits = {})
{
    return openRoot(ArchiveFormat::Tar, makeFile(makeArchive("pax", compression, members)), limits);
}

TEST(Tar, IsReadInEveryCompression)
{
    for (char const* const compression : {"", "gzip", "bzip2", "xz", "lzma", "zstd"}) {
        SCOPED_TRACE(compression);
        StorageItem const root =
            openTar({{.name = "a", .content = numbers(100'000)}, {.name = "b"}, {.name = "f/"}}, compression);
        EXPECT_THAT(pathsBelow(root), ElementsAre(u"a", u"b", u"f/"));
        EXPECT_EQ(read(root, u"a"), numbers(100'000));
        EXPECT_EQ(read(root, u"b"), "");
    }
}

TEST(Tar, IsReadAtAnyPlaceUnlessItIsCompressed)
{
    auto const accessOf = [](std::string const& compression) {
        StorageItem const file(openTar({{.name = "a", .content = "abc"}}, compression), u"a");
        return boost::any_cast<std::string>(file.getExtendedAttributes().getAttribute("archive.access"));
    };
    EXPECT_EQ(accessOf(""), "random");
    EXPECT_EQ(accessOf("gzip"), "sequential");
}

TEST(Tar, LinksOfBothKindsAreToldApartAndFollowedInside)
{
    StorageItem const root = openTar({{.name = "a", .content = "content"},
                                      {.name = "hard", .hardLinkTarget = "a"},
                                      {.name = "soft", .linkTarget = "a"},
                                      {.name = "outside", .linkTarget = "/etc/passwd"},
                                      {.name = "hardOutside", .hardLinkTarget = "../../etc/passwd"},
                                      {.name = "pipe", .isPipe = true}});
    auto const kindOf = [&](std::u16string const& name) { return StorageItem(root, name).existsExtended(); };
    EXPECT_EQ(kindOf(u"hard"), ExistenceTypeExtended::RegularFile);
    EXPECT_EQ(kindOf(u"soft"), ExistenceTypeExtended::SymlinkToFile);
    EXPECT_EQ(kindOf(u"outside"), ExistenceTypeExtended::BrokenSymlink);
    EXPECT_EQ(kindOf(u"hardOutside"), ExistenceTypeExtended::BrokenSymlink);
    EXPECT_EQ(kindOf(u"pipe"), ExistenceTypeExtended::SpecialFile);
    EXPECT_EQ(read(root, u"hard"), "content");
    EXPECT_EQ(read(root, u"soft"), "content");
    EXPECT_EQ(StorageItem(root, u"hardOutside").exists(), ExistenceType::AsNeither);
}

TEST(Tar, HostileNamesStayBelowTheRoot)
{
    StorageItem const root = openTar({{.name = "/absolute", .content = "1"},
                                      {.name = "../up", .content = "2"},
                                      {.name = "twice", .content = "3"},
                                      {.name = "twice", .content = "4"},
                                      {.name = "caf\x82", .content = "5"},
                                      {.name = "way", .linkTarget = "/tmp"},
                                      {.name = "way/in", .content = "6"}});
    EXPECT_THAT(pathsBelow(root), UnorderedElementsAre(u"absolute", u"%2E%2E/", u"%2E%2E/up", u"twice", u"twice~1",
                                                       u"caf\uEF82", u"way/", u"way/in", u"way~1"));
    EXPECT_EQ(read(root, u"twice"), "4");
    EXPECT_EQ(read(root, u"twice~1"), "3");
    EXPECT_EQ(read(root, u"caf\uEF82"), "5");
    EXPECT_EQ(read(root, u"way/in"), "6");
}

TEST(Tar, LiesInAZip)
{
    for (char const* const compression : {"", "gzip"}) {
        std::string const tar = makeArchive("pax", compression, {{.name = "x", .content = numbers(50'000)}});
        StorageItem const zip = openRoot(ArchiveFormat::Zip, makeFile(makeZip({{.name = "in", .content = tar}})));
        EXPECT_EQ(read(openRoot(ArchiveFormat::Tar, StorageItem(zip, u"in")), u"x"), numbers(50'000));
    }
}

TEST(TarDamage, OfATruncatedArchiveWhatIsThereIsReadAndTheEndIsAFailure)
{
    std::string const tar =
        makeArchive("ustar", "", {{.name = "a", .content = "whole"}, {.name = "b", .content = numbers(10'000)}});
    StorageItem const file = makeFile(tar.substr(0, 4000));
    StorageItem const root = openRoot(ArchiveFormat::Tar, file);
    EXPECT_EQ(read(root, u"a"), "whole");
    StorageItem const broken(root, u"b");
    EXPECT_EQ(failureOf([&] { broken.openReadOnlyStream(); }), failure(ErrorCode::IOError, broken.getLocation()));
    auto const listing = root.listAll();
    EXPECT_EQ(listing->entry().getName(), u"a");
    listing->next();
    EXPECT_EQ(listing->entry().getName(), u"b");
    EXPECT_EQ(failureOf([&] { listing->next(); }), failure(ErrorCode::IOError, file.getLocation()));
}

TEST(TarDamage, ATruncatedCompressedArchiveIsRefused)
{
    for (char const* const compression : {"gzip", "bzip2", "xz", "zstd"}) {
        std::string const tar = makeArchive("ustar", compression, {{.name = "a", .content = numbers(10'000)}});
        for (std::size_t const missing : {std::size_t{1}, std::size_t{9}, tar.size() / 2}) {
            StorageItem const file = makeFile(tar.substr(0, tar.size() - missing));
            StorageItem const root = openRoot(ArchiveFormat::Tar, file);
            EXPECT_EQ(failureOf([&] { root.listAll(); }), failure(ErrorCode::IOError, file.getLocation()))
                << compression << " without " << missing;
        }
    }
}

TEST(TarDamage, WhatIsNoArchiveIsAFailureOfTheContainer)
{
    for (std::string const& content : {std::string(), std::string("text"), numbers(100'000)}) {
        StorageItem const file = makeFile(content);
        for (ArchiveFormat const format :
             {ArchiveFormat::Tar, ArchiveFormat::Cpio, ArchiveFormat::Iso, ArchiveFormat::SevenZip})
            EXPECT_EQ(failureOf([&] { openRoot(format, file).listAll(); }),
                      failure(ErrorCode::IOError, file.getLocation()));
    }
}

TEST(Tar, LimitsAreKept)
{
    std::vector<Member> const members{{.name = "a", .content = std::string(3'000'000, '\0')}, {.name = "b"}};
    auto const openFirst = [&](ArchiveLimits const& limits) {
        return reasonOf([&] { StorageItem(openTar(members, "gzip", limits), u"a").openReadOnlyStream(); });
    };
    EXPECT_EQ(openFirst({.entries = 1}), Reason::TooManyEntries);
    EXPECT_EQ(openFirst({.entryBytes = 2'000'000}), Reason::EntryTooLarge);
    EXPECT_EQ(openFirst({.ratio = 100, .bytesOfAnyRatio = 1'000'000}), Reason::RatioTooHigh);
}

} // namespace

} // namespace foundation::storage::archive
