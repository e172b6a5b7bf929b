#include <storage/archive/ArchiveProvider.hpp>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/ObservedStore.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/support/Process.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <boost/any.hpp>

#include <gmock/gmock.h>

#include <filesystem>
#include <memory>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;
using Reason = ArchiveException::Reason;

namespace {

constexpr std::size_t count = 20;

std::string contentOf(std::size_t number)
{
    return numbers(5000 + 3000 * number).substr(number);
}

std::u16string nameOf(std::size_t number)
{
    return u"file" + std::u16string(1, static_cast<char16_t>(u'A' + number));
}

std::string archiveOf(Kind const& kind)
{
    std::vector<Member> members;
    for (std::size_t i = 0; i != count; ++i)
        members.push_back({.name = std::string("file") + static_cast<char>('A' + i), .content = contentOf(i)});
    return makeArchive(kind.writer, kind.compression, members);
}

struct Observed
{
    std::shared_ptr<ObservedStore> store;
    StorageItem file;
};

Observed observe(std::string const& content, ObservedStore::Seeking seeking = ObservedStore::Seeking::Possible)
{
    StorageIRI const root(u"mem://archives/");
    auto const store = std::make_shared<ObservedStore>(root, seeking);
    StorageItem const file(store, StorageIRI(root, u"archive"));
    write(file, content);
    return {store, file};
}

TEST(EveryFormat, IsReadInAnyOrder)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        StorageItem const root = openRoot(kind.format, makeFile(archiveOf(kind)));
        for (std::size_t i = 0; i != count; ++i) {
            std::size_t const wanted = i * 7 % count;
            EXPECT_EQ(read(root, nameOf(wanted)), contentOf(wanted));
        }
    }
}

TEST(EveryFormat, StreamsSeekInBothDirections)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        StorageItem const root = openRoot(kind.format, makeFile(archiveOf(kind)));
        std::string const content = contentOf(count - 1);
        auto const stream = StorageItem(root, nameOf(count - 1)).openReadOnlyStream();
        for (long const position : {40'000L, 10L, static_cast<long>(content.size()) - 10, 0L, 15'000L, 15'020L}) {
            EXPECT_EQ(stream->seek(position, std::ios_base::beg), position);
            std::string bytes(10, '\0');
            EXPECT_EQ(stream->read(bytes.data(), 10), 10);
            EXPECT_EQ(bytes, content.substr(static_cast<std::size_t>(position), 10));
        }
    }
}

TEST(EveryFormat, ManyStreamsAreOpenInOneThread)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        StorageItem const root = openRoot(kind.format, makeFile(archiveOf(kind)));
        std::vector<std::unique_ptr<ByteStream>> streams;
        for (std::size_t i = 0; i != count; ++i)
            streams.push_back(StorageItem(root, nameOf(i)).openReadOnlyStream());
        for (std::size_t at = 0; at != 4000; at += 1000) {
            for (std::size_t i = 0; i != count; ++i) {
                std::string bytes(1000, '\0');
                EXPECT_EQ(streams[i]->read(bytes.data(), 1000), 1000);
                EXPECT_EQ(bytes, contentOf(i).substr(at, 1000));
            }
        }
    }
}

TEST(EveryFormat, IndexIsReadOnce)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        Observed const observed = observe(archiveOf(kind));
        StorageItem const root = openRoot(kind.format, observed.file);
        EXPECT_EQ(observed.store->counts().opened, 0);
        EXPECT_EQ(pathsBelow(root).size(), count);
        long const read = observed.store->counts().bytes;
        EXPECT_GT(read, 0);
        EXPECT_EQ(pathsBelow(root).size(), count);
        EXPECT_TRUE(StorageItem(root, nameOf(5)).fileExists());
        EXPECT_EQ(StorageItem(root, nameOf(5)).getFileAttributes().getSize(), contentOf(5).size());
        EXPECT_EQ(observed.store->counts().bytes, read);
    }
}

TEST(EveryFormat, IsReadOnceFromAStoreThatCannotSeek)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        std::string const bytes = archiveOf(kind);
        Observed const observed = observe(bytes, ObservedStore::Seeking::Impossible);
        StorageItem const root = openRoot(kind.format, observed.file, {.spoolMemory = 10'000});
        for (std::size_t i = count; i-- > 0;)
            EXPECT_EQ(read(root, nameOf(i)), contentOf(i));
        EXPECT_EQ(observed.store->counts().opened, 1);
        EXPECT_EQ(observed.store->counts().bytes, static_cast<long>(bytes.size()));
    }
}

TEST(EveryFormat, LiesInACompressedEntry)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        std::string const outer = makeArchive("pax", "gzip", {{.name = "inner", .content = archiveOf(kind)}});
        StorageItem const inner(openRoot(ArchiveFormat::Tar, makeFile(outer)), u"inner");
        StorageItem const root = openRoot(kind.format, inner);
        EXPECT_EQ(read(root, nameOf(3)), contentOf(3));
        EXPECT_EQ(read(root, nameOf(2)), contentOf(2));
    }
}

TEST(EveryFormat, LimitsHaveErrorsOfTheirOwn)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        std::string const bytes = archiveOf(kind);
        auto const reason = [&](ArchiveLimits const& limits) {
            return reasonOf(
                [&] { StorageItem(openRoot(kind.format, makeFile(bytes), limits), nameOf(9)).openReadOnlyStream(); });
        };
        EXPECT_EQ(reason({.entries = count - 1}), Reason::TooManyEntries);
        EXPECT_EQ(reason({.indexBytes = 1000}), Reason::IndexTooLarge);
        EXPECT_EQ(reason({.entryBytes = 31'000}), Reason::EntryTooLarge);
        EXPECT_EQ(reasonOf([&] {
                      StorageItem const file = observe(bytes, ObservedStore::Seeking::Impossible).file;
                      openRoot(kind.format, file, {.spoolBytes = 1000}).listAll();
                  }),
                  Reason::SpoolTooLarge);
    }
}

TEST(EveryFormat, ThatIsCompressedIsNotUnpackedBeyondTheRatio)
{
    for (Kind const& kind : kindsOfArchives()) {
        bool const isCompressed = *kind.compression != '\0' || kind.format == ArchiveFormat::SevenZip;
        SCOPED_TRACE(kind.name);
        std::string const bytes =
            makeArchive(kind.writer, kind.compression, {{.name = "zeros", .content = std::string(3'000'000, '\0')}});
        auto const open = [&] {
            StorageItem const root =
                openRoot(kind.format, makeFile(bytes), {.ratio = 100, .bytesOfAnyRatio = 1'000'000});
            StorageItem(root, u"zeros").openReadOnlyStream();
        };
        if (isCompressed)
            EXPECT_EQ(reasonOf(open), Reason::RatioTooHigh);
        else
            EXPECT_NO_THROW(open());
    }
}

TEST(UncompressedTar, ReadsNothingOfOtherEntriesToOpenOne)
{
    Kind const tar = kindsOfArchives().front();
    Observed const observed = observe(archiveOf(tar));
    StorageItem const root = openRoot(tar.format, observed.file);
    EXPECT_TRUE(StorageItem(root, nameOf(0)).fileExists());
    long const before = observed.store->counts().bytes;
    EXPECT_EQ(read(root, nameOf(count - 1)), contentOf(count - 1));
    EXPECT_EQ(observed.store->counts().bytes - before, static_cast<long>(contentOf(count - 1).size()));
}

TEST(Image, HoldsCompressedFilesAmongOthers)
{
    TemporaryFolder const folder;
    std::filesystem::create_directory(folder / "tree");
    folder.write("tree/large", numbers(100'000));
    folder.write("tree/small", "small");
    std::vector<std::string> const pack{"/usr/bin/env",  "xorriso",  "-outdev", "image", "-map", "tree", "/",
                                        "-set_filter_r", "--zisofs", "/",       "--"};
    ASSERT_EQ(runProgram(pack, {.workingFolder = folder.path()}).status, 0);
    StorageItem const image(std::make_shared<local::LocalProvider>(), folder.iri(u"image"));
    StorageItem const root = openRoot(ArchiveFormat::Iso, image);
    auto const accessOf = [&](std::u16string const& name) {
        boost::any const access = StorageItem(root, name).getExtendedAttributes().getAttribute("archive.access");
        return boost::any_cast<std::string>(access);
    };
    EXPECT_EQ(accessOf(u"large"), "sequential");
    EXPECT_EQ(accessOf(u"small"), "random");
    EXPECT_EQ(read(root, u"large"), numbers(100'000));
    EXPECT_EQ(read(root, u"small"), "small");
}

TEST(UncompressedTar, IsIndexedWithoutReadingContent)
{
    std::vector<Member> members;
    for (char const* const name : {"a", "b", "c", "d"})
        members.push_back({.name = name, .content = std::string(2'000'000, 'x')});
    Observed const observed = observe(makeArchive("pax", "", members));
    EXPECT_EQ(pathsBelow(openRoot(ArchiveFormat::Tar, observed.file)).size(), 4U);
    EXPECT_LT(observed.store->counts().bytes, 1'000'000);
}

} // namespace

} // namespace foundation::storage::archive
