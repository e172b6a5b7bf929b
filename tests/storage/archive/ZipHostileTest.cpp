#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/storage/archive/ObservedStore.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/rawZips.hpp>

#include <gmock/gmock.h>

#include <memory>

namespace foundation::storage::archive {

using namespace provider;
using testing::ElementsAre;
using Reason = ArchiveException::Reason;

namespace {

StorageItem openRaw(std::vector<RawEntry> const& entries, ArchiveLimits const& limits = {})
{
    return openRoot(ArchiveFormat::Zip, makeFile(makeRawZip(entries)), limits);
}

bool isReadWell(StorageItem const& file)
{
    try {
        read(file);
        return true;
    } catch (ArchiveException const&) {
        return false;
    } catch (ByteStreamFailure const&) {
        return false;
    }
}

TEST(ZipHostile, ASizeInTheArchiveThatIsALieDoesNotExcuseTheRatio)
{
    ArchiveLimits const limits{.ratio = 500, .bytesOfAnyRatio = 1'000'000};
    StorageItem const root = openRaw(
        {{.name = "a", .content = std::string(2'000'000, '\0'), .method = 8, .sizeInArchive = 4'000'000}}, limits);
    EXPECT_EQ(reasonOf([&] { StorageItem(root, u"a").openReadOnlyStream(); }), Reason::RatioTooHigh);
}

TEST(ZipHostile, WithARatioOfNothingOnlySmallContentIsLetThrough)
{
    ArchiveLimits const limits{.ratio = 0, .bytesOfAnyRatio = 10};
    StorageItem const root =
        openRaw({{.name = "small", .content = "0123456789"}, {.name = "large", .content = "0123456789a"}}, limits);
    EXPECT_EQ(read(root, u"small"), "0123456789");
    EXPECT_EQ(reasonOf([&] { StorageItem(root, u"large").openReadOnlyStream(); }), Reason::RatioTooHigh);
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

/// A way to be wrong for which libzip refuses an archive as a whole.
struct Wrong
{
    char const* what;
    RawZip zip;
};

std::vector<Wrong> wrongs()
{
    RawEntry const ok{.name = "ok", .content = "content", .method = 8};
    return {
        {"a control character in a name flagged as UTF-8",
         {.entries = {{.name = "a\x1B[31m", .flags = flags::utf8}, ok}}},
        {"a name flagged as UTF-8 that is none", {.entries = {{.name = "a\xFF\xFE", .flags = flags::utf8}, ok}}},
        {"a method that says encrypted", {.entries = {{.name = "a", .content = "x", .method = 99}, ok}}},
        {"a size without its field", {.entries = {{.name = "a", .content = "x", .size = 0xFFFFFFFF}, ok}}},
        {"fewer entries than counted", {.entries = {ok}, .count = 5}},
        {"more entries than counted", {.entries = {{.name = "a"}, ok}, .count = 1}},
    };
}

TEST(ZipHostile, WhatIsWrongWithOneEntryLeavesTheOthers)
{
    for (Wrong const& wrong : wrongs()) {
        SCOPED_TRACE(wrong.what);
        StorageItem const root = openRoot(ArchiveFormat::Zip, makeFile(bytesOf(wrong.zip)));
        EXPECT_EQ(read(root, u"ok"), "content");
    }
}

TEST(ZipHostile, AnArchiveWithAWrongEntryIsNotChanged)
{
    StorageItem const file = makeFile(makeRawZip({{.name = "a\xFF", .flags = flags::utf8}, {.name = "ok"}}));
    std::string const before = read(file);
    StorageItem const root = openRoot(ArchiveFormat::Zip, file);
    EXPECT_EQ(reasonOf([&] { StorageItem(root, u"new").createFile(); }), Reason::NotWritten);
    EXPECT_EQ(reasonOf([&] { StorageItem(root, u"ok").removeFile(); }), Reason::NotWritten);
    EXPECT_EQ(read(file), before);
}

TEST(ZipHostile, NothingIsMadeDeeperThanItIsShown)
{
    StorageItem const root = openRaw({{.name = "a/b/"}}, {.depth = 3});
    StorageItem(root, u"a/b/c").createFolder();
    StorageItem const deeper(root, u"a/b/c/d");
    EXPECT_THROW(deeper.createFolder(), Exception);
    EXPECT_FALSE(deeper.folderExists());
}

TEST(ZipHostile, OfAnArchiveWithAWrongEntryTheOthersAreCheckedToo)
{
    std::string const text = "text that nobody compresses";
    for (std::uint32_t const checksum : {0u, 1u}) {
        StorageItem const root = openRaw({{.name = "a\xFF", .flags = flags::utf8},
                                          {.name = "b", .content = text, .checksum = checksum + 1},
                                          {.name = "secret", .content = text, .flags = flags::encrypted},
                                          {.name = "unknown", .content = text, .method = 200},
                                          {.name = "ok", .content = text}});
        for (auto const* const name : {u"b", u"secret", u"unknown"})
            EXPECT_FALSE(isReadWell(StorageItem(root, name)));
        EXPECT_EQ(reasonOf([&] { StorageItem(root, u"secret").openReadOnlyStream(); }), Reason::Encrypted);
        EXPECT_EQ(read(root, u"ok"), text);
    }
}

TEST(ZipHostile, ADirectoryOfTooManyEntriesIsNotReadWhole)
{
    std::vector<RawEntry> entries;
    for (int i = 0; i != 20'000; ++i)
        entries.push_back({.name = "a file with a name of some length " + std::to_string(i)});
    RawZip zip{.entries = entries};
    StorageIRI const location(u"mem://archives/");
    for (bool const isWrong : {false, true}) {
        if (isWrong) // so that libarchive reads it
            zip.entries.front() = {.name = "\xFF", .flags = flags::utf8};
        auto const store = std::make_shared<ObservedStore>(location);
        StorageItem const file(store, StorageIRI(location, u"archive"));
        write(file, bytesOf(zip));
        StorageItem const root = openRoot(ArchiveFormat::Zip, file, {.entries = 1000});
        Reason const reason = reasonOf([&] { root.exists(); });
        EXPECT_EQ(reason, isWrong ? Reason::IndexTooLarge : Reason::TooManyEntries);
        EXPECT_LT(store->counts().bytes, 1'300'000); // of 1.7 MB
    }
}

TEST(ZipHostile, AnArchiveThatCannotBeReadIsReadAgainOnlyWhenItHasChanged)
{
    StorageIRI const location(u"mem://archives/");
    auto const store = std::make_shared<ObservedStore>(location);
    StorageItem const file(store, StorageIRI(location, u"archive"));
    write(file, std::string(100'000, 'x'));
    StorageItem const root = openRoot(ArchiveFormat::Zip, file);
    EXPECT_EQ(reasonOf([&] { root.exists(); }), Reason::NotAnArchive);
    int const opened = store->counts().opened;
    for (int i = 0; i != 3; ++i) {
        EXPECT_EQ(reasonOf([&] { root.exists(); }), Reason::NotAnArchive);
        EXPECT_EQ(reasonOf([&] { root.listAll(); }), Reason::NotAnArchive);
    }
    EXPECT_EQ(store->counts().opened, opened);
    write(file, makeRawZip({{.name = "a", .content = "content"}}));
    EXPECT_EQ(read(root, u"a"), "content");
}

TEST(ZipHostile, APathBeyondTheLimitIsOneNameInTheRoot)
{
    std::string const path = "a/b/c/d";
    StorageItem const root = openRaw({{.name = path, .content = "deep"},
                                      {.name = "a/b/c/e/"},
                                      {.name = "a/b/c"},
                                      {.name = "../../../.."},
                                      {.name = "ok", .content = "content"}},
                                     {.depth = 3});
    EXPECT_THAT(pathsBelow(root), ElementsAre(u"a%2Fb%2Fc%2Fd", u"a%2Fb%2Fc%2Fe/", u"a/", u"a/b/", u"a/b/c",
                                              u"..%2F..%2F..%2F..", u"ok"));
    EXPECT_EQ(read(root, u"a%2Fb%2Fc%2Fd"), "deep");
}

TEST(ZipHostile, AVeryDeepPathCostsNoMoreThanItsName)
{
    std::string path;
    for (int i = 0; i != 30'000; ++i)
        path += "d/";
    StorageItem const root = openRaw({{.name = path + "x", .content = "deep"}, {.name = "ok"}});
    EXPECT_EQ(pathsBelow(root).size(), 2u);
}

TEST(ZipHostile, NamesFromTheFieldOfUnicodeCountWhereTheyMatch)
{
    StorageItem const root =
        openRaw({{.name = "a", .content = "1", .extra = extraField(0x7075, unicodePath("a", "\xE4\xB8\xAD"))},
                 {.name = "b", .content = "2", .extra = extraField(0x7075, unicodePath("other", "\xE4\xB8\xAD"))},
                 {.name = "c", .content = "3", .extra = extraField(0x7075, unicodePath("c", "../x"))},
                 {.name = "d", .content = "4", .extra = extraField(0x7075, "\x01")}});
    EXPECT_EQ(read(root, u"中"), "1");
    EXPECT_EQ(read(root, u"b"), "2");
    EXPECT_EQ(read(root, u"%2E%2E/x"), "3");
    EXPECT_EQ(read(root, u"d"), "4");
}

TEST(ZipHostile, CharactersThatMeanSomethingElsewhereArePartsOfNames)
{
    StorageItem const root = openRaw({{.name = "..\\..\\x", .content = "1"},
                                      {.name = "C:\\y", .content = "2"},
                                      {.name = "b\nc", .content = "3"},
                                      {.name = "d\x1B[31m", .content = "4"},
                                      {.name = std::string("e\0f", 3), .content = "5"}});
    EXPECT_EQ(read(root, u"..\\..\\x"), "1");
    EXPECT_EQ(read(root, u"C:\\y"), "2");
    EXPECT_EQ(read(root, u"b\nc"), "3");
    EXPECT_EQ(read(root, u"d\x1B[31m"), "4");
    EXPECT_EQ(read(root, u"e f"), "5");
}

TEST(ZipHostile, EqualNamesAndFilesThatAreFoldersAreAllThere)
{
    StorageItem const root = openRaw({{.name = "a", .content = "first"},
                                      {.name = "a", .content = "second"},
                                      {.name = "b", .content = "file"},
                                      {.name = "b/c", .content = "inside"}});
    EXPECT_EQ(read(root, u"a"), "second");
    EXPECT_EQ(read(root, u"a~1"), "first");
    EXPECT_EQ(read(root, u"b~1"), "file");
    EXPECT_EQ(read(root, u"b/c"), "inside");
}

TEST(ZipHostile, CommentsThatLookLikeADirectoryAreComments)
{
    std::string const inner = makeRawZip({{.name = "evil"}});
    for (std::string const& comment :
         {std::string("PK\x05\x06 PK\x01\x02 PK\x03\x04"), inner, std::string("\xFF\xFE"), std::string(65'000, 'P')})
    {
        StorageItem const root =
            openRoot(ArchiveFormat::Zip, makeFile(bytesOf(RawZip{.entries = {{.name = "ok"}}, .comment = comment})));
        EXPECT_THAT(pathsBelow(root), ElementsAre(u"ok"));
    }
}

TEST(ZipHostile, AProgramInFrontIsPassedOverWhereOffsetsCountIt)
{
    RawZip zip{.entries = {{.name = "ok", .content = "content"}}, .prefix = std::string(5000, '#')};
    StorageItem const root = openRoot(ArchiveFormat::Zip, makeFile(bytesOf(zip)));
    EXPECT_EQ(read(root, u"ok"), "content");
    zip.prefixSize = 0;
    StorageItem const wrong = openRoot(ArchiveFormat::Zip, makeFile(bytesOf(zip)));
    EXPECT_EQ(reasonOf([&] { wrong.exists(); }), Reason::NotAnArchive);
}

TEST(ZipHostile, APartOfAnArchiveInSeveralIsNotSupported)
{
    StorageItem const root =
        openRoot(ArchiveFormat::Zip, makeFile(bytesOf(RawZip{.entries = {{.name = "ok"}}, .disk = 2})));
    EXPECT_EQ(reasonOf([&] { root.exists(); }), Reason::UnsupportedMethod);
}

TEST(ZipHostile, AMethodThatIsNotKnownIsToldWithTheEntry)
{
    StorageItem const root =
        openRaw({{.name = "a", .content = "x", .method = 200}, {.name = "ok", .content = "content"}});
    EXPECT_EQ(reasonOf([&] { StorageItem(root, u"a").openReadOnlyStream(); }), Reason::UnsupportedMethod);
    EXPECT_EQ(read(root, u"ok"), "content");
}

TEST(ZipHostile, AnOffsetOutsideSpoilsTheEntryAlone)
{
    StorageItem const root = openRaw({{.name = "a", .content = "x", .offset = 0x7FFFFFFF},
                                      {.name = "b", .content = "x", .offset = 1},
                                      {.name = "ok", .content = "content"}});
    EXPECT_FALSE(isReadWell(StorageItem(root, u"a")));
    EXPECT_FALSE(isReadWell(StorageItem(root, u"b")));
    EXPECT_EQ(read(root, u"ok"), "content");
}

TEST(ZipHostile, ATarThatIsStoredInOneIsCheckedBeforeItIsUsed)
{
    std::string const tar = makeArchive("ustar", "", {{.name = "file", .content = std::string(5000, 'x')}});
    std::string zip = makeRawZip({{.name = "in.tar", .content = tar}});
    auto const openInner = [&] {
        StorageItem const outer = openRoot(ArchiveFormat::Zip, makeFile(zip));
        return openRoot(ArchiveFormat::Tar, StorageItem(outer, u"in.tar"));
    };
    EXPECT_EQ(read(openInner(), u"file"), std::string(5000, 'x'));
    zip[zip.find("xxxx") + 2500] ^= 1;
    EXPECT_EQ(reasonOf([&] { openInner().exists(); }), Reason::Damaged);
}

} // namespace

} // namespace foundation::storage::archive
