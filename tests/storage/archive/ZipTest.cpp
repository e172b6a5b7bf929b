#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/failureOf.hpp>

#include <gmock/gmock.h>

#include <sys/stat.h>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

namespace {

std::string numbers(std::size_t size)
{
    std::string text;
    while (text.size() < size)
        text += std::to_string(text.size()) + ' ';
    text.resize(size);
    return text;
}

StorageItem openZip(std::vector<ZipMember> const& members, ArchiveLimits const& limits = {})
{
    return openRoot(ArchiveFormat::Zip, makeFile(makeZip(members)), limits);
}

ArchiveException::Reason reasonOf(std::function<void()> const& action)
{
    try {
        action();
    } catch (ArchiveException const& error) {
        return error.getReason();
    }
    throw std::logic_error("no ArchiveException");
}

using Reason = ArchiveException::Reason;

TEST(Zip, EntriesAreListedInTheOrderOfTheArchive)
{
    StorageItem const root = openZip({{.name = "b"}, {.name = "folder/"}, {.name = "a"}, {.name = "folder/c"}});
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"b", u"folder/", u"folder/c", u"a"));
}

TEST(Zip, WithoutEntriesIsAnEmptyFolder)
{
    StorageItem const root = openZip({});
    EXPECT_TRUE(root.folderExists());
    EXPECT_THAT(pathsBelow(root), ElementsAre());
}

TEST(Zip, ContentIsReadAsItWasStored)
{
    std::string const content = numbers(300'000);
    StorageItem const root = openZip({{.name = "deflated", .content = content},
                                      {.name = "stored", .content = content, .isStored = true},
                                      {.name = "empty"}});
    EXPECT_EQ(read(root, u"deflated"), content);
    EXPECT_EQ(read(root, u"stored"), content);
    EXPECT_EQ(read(root, u"empty"), "");
}

TEST(Zip, StreamsSeekInBothDirections)
{
    std::string const content = numbers(300'000);
    StorageItem const root =
        openZip({{.name = "deflated", .content = content}, {.name = "stored", .content = content, .isStored = true}});
    for (auto const* const name : {u"deflated", u"stored"}) {
        auto const stream = StorageItem(root, name).openReadOnlyStream();
        for (long const position : {200'000L, 10L, 299'990L, 0L, 150'000L, 150'020L}) {
            EXPECT_EQ(stream->seek(position, std::ios_base::beg), position);
            std::string bytes(10, '\0');
            EXPECT_EQ(stream->read(bytes.data(), 10), 10);
            EXPECT_EQ(bytes, content.substr(static_cast<std::size_t>(position), 10));
        }
    }
}

TEST(Zip, SaysWhichContentCanBeReadAtAnyPlace)
{
    StorageItem const root =
        openZip({{.name = "deflated", .content = "abc"}, {.name = "stored", .content = "abc", .isStored = true}});
    auto const accessOf = [&](std::u16string const& name) {
        return boost::any_cast<std::string>(
            StorageItem(root, name).getExtendedAttributes().getAttribute("archive.access"));
    };
    EXPECT_EQ(accessOf(u"deflated"), "sequential");
    EXPECT_EQ(accessOf(u"stored"), "random");
}

TEST(Zip, LinksAreToldApartAndFollowedInside)
{
    StorageItem const root = openZip({{.name = "f/a", .content = "content"},
                                      {.name = "toFile", .content = "f/a", .unixMode = S_IFLNK | 0777},
                                      {.name = "toFolder", .content = "f", .unixMode = S_IFLNK | 0777},
                                      {.name = "outside", .content = "/etc/passwd", .unixMode = S_IFLNK | 0777},
                                      {.name = "above", .content = "../../etc/passwd", .unixMode = S_IFLNK | 0777},
                                      {.name = "loop", .content = "loop", .unixMode = S_IFLNK | 0777},
                                      {.name = "pipe", .unixMode = S_IFIFO | 0666}});
    auto const kindOf = [&](std::u16string const& name) { return StorageItem(root, name).existsExtended(); };
    EXPECT_EQ(kindOf(u"toFile"), ExistenceTypeExtended::SymlinkToFile);
    EXPECT_EQ(kindOf(u"toFolder"), ExistenceTypeExtended::SymlinkToFolder);
    EXPECT_EQ(kindOf(u"outside"), ExistenceTypeExtended::BrokenSymlink);
    EXPECT_EQ(kindOf(u"above"), ExistenceTypeExtended::BrokenSymlink);
    EXPECT_EQ(kindOf(u"loop"), ExistenceTypeExtended::BrokenSymlink);
    EXPECT_EQ(kindOf(u"pipe"), ExistenceTypeExtended::SpecialFile);
    EXPECT_EQ(read(root, u"toFile"), "content");
    EXPECT_EQ(read(root, u"toFolder/a"), "content");
    StorageItem const outside(root, u"outside");
    StorageItem const loop(root, u"loop");
    StorageItem const pipe(root, u"pipe");
    EXPECT_EQ(failureOf([&] { outside.openReadOnlyStream(); }),
              failure(ErrorCode::ResourceNotFound, outside.getLocation()));
    EXPECT_EQ(failureOf([&] { loop.openReadOnlyStream(); }), failure(ErrorCode::InvalidLocation, loop.getLocation()));
    EXPECT_EQ(failureOf([&] { pipe.openReadOnlyStream(); }),
              failure(ErrorCode::UnsupportedOperation, pipe.getLocation()));
}

TEST(Zip, ListsLinksAsWhatTheyLeadTo)
{
    StorageItem const root = openZip({{.name = "f/a", .content = "content"},
                                      {.name = "toFile", .content = "f/a", .unixMode = S_IFLNK | 0777},
                                      {.name = "toFolder", .content = "f", .unixMode = S_IFLNK | 0777},
                                      {.name = "broken", .content = "missing", .unixMode = S_IFLNK | 0777}});
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"f/", u"f/a", u"toFile", u"toFolder/", u"broken"));
    auto const listing = root.listFiles();
    EXPECT_EQ(listing->entry().getName(), u"toFile");
    EXPECT_EQ(listing->entry().getFileAttributes()->getSize(), 7u);
}

TEST(Zip, HostileNamesStayBelowTheRoot)
{
    StorageItem const root = openZip({{.name = "/absolute", .content = "1"},
                                      {.name = "../up", .content = "2"},
                                      {.name = "a/../../b", .content = "3"},
                                      {.name = "..\\back", .content = "4"},
                                      {.name = "c:/drive", .content = "5"},
                                      {.name = "fine", .content = "6"}});
    EXPECT_EQ(read(root, u"absolute"), "1");
    EXPECT_EQ(read(root, u"%2E%2E/up"), "2");
    EXPECT_EQ(read(root, u"a/%2E%2E/%2E%2E/b"), "3");
    EXPECT_EQ(read(root, u"..\\back"), "4");
    EXPECT_EQ(read(root, u"c:/drive"), "5");
    EXPECT_EQ(read(root, u"fine"), "6");
    EXPECT_THAT(pathsBelow(root),
                UnorderedElementsAre(u"absolute", u"%2E%2E/", u"%2E%2E/up", u"a/", u"a/%2E%2E/", u"a/%2E%2E/%2E%2E/",
                                     u"a/%2E%2E/%2E%2E/b", u"..\\back", u"c:/", u"c:/drive", u"fine"));
}

TEST(Zip, EncryptedContentIsDeniedAndTheRestIsRead)
{
    StorageItem const root = openZip(
        {{.name = "secret", .content = "secret", .password = "password"}, {.name = "plain", .content = "plain"}});
    StorageItem const secret(root, u"secret");
    EXPECT_EQ(secret.getFileAttributes().getSize(), 6u);
    EXPECT_EQ(reasonOf([&] { secret.openReadOnlyStream(); }), Reason::Encrypted);
    EXPECT_EQ(failureOf([&] { secret.openReadOnlyStream(); }),
              failure(ErrorCode::PermissionDenied, secret.getLocation()));
    EXPECT_EQ(read(root, u"plain"), "plain");
}

TEST(Zip, LimitsAreKeptEachWithAReasonOfItsOwn)
{
    std::vector<ZipMember> const members{{.name = "zeros", .content = std::string(2'000'000, '\0')},
                                         {.name = "stored", .content = std::string(100, 'a'), .isStored = true}};
    auto const openZeros = [&](ArchiveLimits const& limits) {
        return reasonOf([&] { StorageItem(openZip(members, limits), u"zeros").openReadOnlyStream(); });
    };
    EXPECT_EQ(openZeros({.entries = 1}), Reason::TooManyEntries);
    EXPECT_EQ(openZeros({.indexBytes = 100}), Reason::IndexTooLarge);
    EXPECT_EQ(openZeros({.nesting = 0}), Reason::NestedTooDeep);
    EXPECT_EQ(openZeros({.entryBytes = 1'999'999}), Reason::EntryTooLarge);
    EXPECT_EQ(openZeros({.ratio = 500, .bytesOfAnyRatio = 1'999'999}), Reason::RatioTooHigh);
    EXPECT_EQ(read(openZip(members, {.ratio = 500}), u"zeros").size(), 2'000'000u);
    EXPECT_EQ(read(openZip(members, {.ratio = 1, .bytesOfAnyRatio = 10}), u"stored").size(), 100u);
}

TEST(Zip, ANameThatIsNotUTF8IsInTheCharactersOfTheFirstPCs)
{
    StorageItem const root = openZip({{.name = "caf\x82"}, {.name = "caf\xC3\xA9s"}});
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"caf\u00E9", u"caf\u00E9s"));
}

TEST(Zip, WhatIsNoArchiveIsAFailureOfTheContainer)
{
    for (std::string const& content : {std::string(), std::string("text"), std::string(100'000, 'x')}) {
        StorageItem const file = makeFile(content);
        StorageItem const root = openRoot(ArchiveFormat::Zip, file);
        EXPECT_EQ(reasonOf([&] { root.listAll(); }), Reason::NotAnArchive);
        EXPECT_EQ(failureOf([&] { root.exists(); }), failure(ErrorCode::IOError, file.getLocation()));
    }
}

TEST(Zip, InAMissingContainerIsNothing)
{
    StorageItem const file = makeFile("");
    file.removeFile();
    StorageItem const root = openRoot(ArchiveFormat::Zip, file);
    EXPECT_EQ(root.exists(), ExistenceType::AsNeither);
    EXPECT_EQ(root.existsExtended(), ExistenceTypeExtended::None);
    EXPECT_EQ(failureOf([&] { root.listAll(); }), failure(ErrorCode::ResourceNotFound, file.getLocation()));
}

TEST(Zip, AChangedContainerIsReadAnewByTheNextListing)
{
    StorageItem const file = makeFile(makeZip({{.name = "old"}}));
    StorageItem const root = openRoot(ArchiveFormat::Zip, file);
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"old"));
    write(file, makeZip({{.name = "new", .content = "content"}}));
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"new"));
    EXPECT_EQ(read(root, u"new"), "content");
}

TEST(Zip, StreamsAndListingsOutliveTheProvider)
{
    auto root = std::make_unique<StorageItem>(openZip({{.name = "a", .content = "content"}}));
    auto const stream = StorageItem(*root, u"a").openReadOnlyStream();
    auto const listing = root->listAll();
    root.reset();
    std::string bytes(7, '\0');
    EXPECT_EQ(stream->read(bytes.data(), 7), 7);
    EXPECT_EQ(bytes, "content");
    listing->reset();
    EXPECT_EQ(listing->entry().getName(), u"a");
}

TEST(Zip, LiesInAnotherStoredOrDeflated)
{
    for (bool const isStored : {true, false}) {
        std::string const inner = makeZip({{.name = "x", .content = numbers(50'000)}});
        StorageItem const outer = openZip(
            {{.name = "in.zip", .content = makeZip({{.name = "in2.zip", .content = inner}}), .isStored = isStored}});
        StorageItem const middle = openRoot(ArchiveFormat::Zip, StorageItem(outer, u"in.zip"));
        StorageItem const root = openRoot(ArchiveFormat::Zip, StorageItem(middle, u"in2.zip"));
        EXPECT_EQ(read(root, u"x"), numbers(50'000));
        EXPECT_EQ(root.getLocation().toString(), u"zip:zip:zip:mem://archives/archive!/in.zip!/in2.zip!/");
    }
}

TEST(Zip, InADeflatedEntryIsKeptToItsLimit)
{
    std::string const inner = makeZip({{.name = "x", .content = numbers(5'000)}});
    StorageItem const outer = openZip({{.name = "in.zip", .content = inner}});
    StorageItem const root =
        openRoot(ArchiveFormat::Zip, StorageItem(outer, u"in.zip"), {.spoolBytes = inner.size() - 1});
    EXPECT_EQ(reasonOf([&] { root.listAll(); }), Reason::SpoolTooLarge);
}

} // namespace

} // namespace foundation::storage::archive
