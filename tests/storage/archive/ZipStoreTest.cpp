#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/ArchiveProviderFactory.hpp>
#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/ObservedStore.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/rawZips.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <optional>
#include <random>

namespace foundation::storage::archive {

using namespace provider;
using tests::support::TemporaryFolder;

namespace {

/// Bytes that cannot be compressed.
std::string noise(std::size_t size)
{
    std::mt19937 random(7);
    std::string bytes(size, '\0');
    for (char& byte : bytes)
        byte = static_cast<char>(random());
    return bytes;
}

struct Observed
{
    std::shared_ptr<ObservedStore> store;
    StorageItem file;

    long bytes() const { return store->counts().bytes; }
    int opened() const { return store->counts().opened; }
};

Observed observe(std::string const& content, ObservedStore::Seeking seeking = ObservedStore::Seeking::Possible)
{
    StorageIRI const location(u"mem://archives/");
    auto const store = std::make_shared<ObservedStore>(location, seeking);
    StorageItem const file(store, StorageIRI(location, u"archive"));
    write(file, content);
    return {store, file};
}

std::string readAt(ByteStream& stream, long position, std::size_t count)
{
    stream.seek(position, std::ios_base::beg);
    std::string bytes(count, '\0');
    long const read = stream.read(bytes.data(), static_cast<long>(count));
    return bytes.substr(0, static_cast<std::size_t>(read));
}

std::ptrdiff_t openDescriptors()
{
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
}

/// The least that is read ahead where reading goes on.
constexpr long readAhead = 200'000;

TEST(ZipInAStore, IsIndexedOnce)
{
    Observed const zip = observe(makeRawZip({{.name = "a", .content = "1"}, {.name = "b", .content = noise(1000)}}));
    StorageItem const root = openRoot(ArchiveFormat::Zip, zip.file);
    root.exists();
    int const opened = zip.opened();
    long const bytes = zip.bytes();
    for (int i = 0; i != 10; ++i) {
        EXPECT_TRUE(StorageItem(root, u"a").fileExists());
        EXPECT_EQ(pathsBelow(root).size(), 2u);
    }
    EXPECT_EQ(zip.opened(), opened);
    EXPECT_EQ(zip.bytes(), bytes);
}

TEST(ZipInAStore, AnEntryIsOpenedWithoutReadingOthers)
{
    std::string const content = noise(100'000);
    std::vector<RawEntry> entries;
    for (int i = 0; i != 50; ++i)
        entries.push_back(
            {.name = "file" + std::to_string(i), .content = content, .method = static_cast<std::uint16_t>(i % 2 * 8)});
    Observed const zip = observe(makeRawZip(entries));
    StorageItem const root = openRoot(ArchiveFormat::Zip, zip.file);
    root.exists();
    for (auto const* const name : {u"file49", u"file48"}) {
        long const before = zip.bytes();
        EXPECT_EQ(read(root, name), content);
        EXPECT_LT(zip.bytes() - before, 100'000 + 2 * readAhead);
    }
}

TEST(ZipInAStore, StoredContentIsReadAtOnceWhereverItIs)
{
    std::string const content = noise(3'000'000);
    Observed const zip = observe(makeRawZip({{.name = "a", .content = content}}));
    auto const stream = StorageItem(openRoot(ArchiveFormat::Zip, zip.file), u"a").openReadOnlyStream();
    long const before = zip.bytes();
    for (long const position : {2'900'000L, 100L, 1'500'000L})
        EXPECT_EQ(readAt(*stream, position, 10), content.substr(static_cast<std::size_t>(position), 10));
    EXPECT_LT(zip.bytes() - before, 3 * readAhead);
}

TEST(ZipInAStore, DeflatedContentGoesBackByBeginningAgain)
{
    std::string const content = noise(3'000'000);
    Observed const zip = observe(makeRawZip({{.name = "a", .content = content, .method = 8}}));
    auto const stream = StorageItem(openRoot(ArchiveFormat::Zip, zip.file), u"a").openReadOnlyStream();
    EXPECT_EQ(readAt(*stream, 2'000'000, 10), content.substr(2'000'000, 10));
    long const before = zip.bytes();
    EXPECT_EQ(readAt(*stream, 2'500'000, 10), content.substr(2'500'000, 10));
    EXPECT_LT(zip.bytes() - before, 500'000 + readAhead);
    EXPECT_EQ(readAt(*stream, 1'000'000, 10), content.substr(1'000'000, 10));
    EXPECT_GE(zip.bytes() - before, 1'000'000);
}

TEST(ZipInAStore, ThatCannotSeekIsCopiedOnce)
{
    std::string const content = noise(100'000);
    std::string const bytes = makeRawZip({{.name = "a", .content = content}, {.name = "b", .content = content}});
    Observed const zip = observe(bytes, ObservedStore::Seeking::Impossible);
    StorageItem const root = openRoot(ArchiveFormat::Zip, zip.file);
    EXPECT_EQ(read(root, u"b"), content);
    EXPECT_EQ(read(root, u"a"), content);
    EXPECT_EQ(zip.opened(), 1);
    EXPECT_EQ(zip.bytes(), static_cast<long>(bytes.size()));
}

/// The folder for temporary files, which nobody else uses meanwhile.
class ZipSpool : public testing::Test
{
protected:
    ZipSpool() { ::setenv("TMPDIR", folder.path().c_str(), 1); }
    ~ZipSpool() override
    {
        if (before)
            ::setenv("TMPDIR", before->c_str(), 1);
        else
            ::unsetenv("TMPDIR");
    }

    bool isEmpty() const { return std::filesystem::is_empty(folder.path()); }

    std::optional<std::string> const before =
        std::getenv("TMPDIR") == nullptr ? std::nullopt : std::optional<std::string>(std::getenv("TMPDIR"));
    TemporaryFolder folder;
    ArchiveLimits const limits{.spoolMemory = 1000};
};

TEST_F(ZipSpool, LeavesNoNameAndNoDescriptor)
{
    std::string const content = noise(50'000);
    std::string const innermost = makeRawZip({{.name = "x", .content = content}});
    std::string const inner = makeRawZip({{.name = "in2.zip", .content = innermost, .method = 8}});
    StorageItem const file = makeFile(makeRawZip({{.name = "in.zip", .content = inner, .method = 8}}));
    std::ptrdiff_t const atFirst = openDescriptors();
    {
        StorageItem const outer = openRoot(ArchiveFormat::Zip, file, limits);
        StorageItem const middle = openRoot(ArchiveFormat::Zip, StorageItem(outer, u"in.zip"), limits);
        StorageItem const root = openRoot(ArchiveFormat::Zip, StorageItem(middle, u"in2.zip"), limits);
        EXPECT_EQ(read(root, u"x"), content);
        EXPECT_EQ(openDescriptors(), atFirst + 2);
        EXPECT_TRUE(isEmpty());
    }
    EXPECT_EQ(openDescriptors(), atFirst);
    EXPECT_TRUE(isEmpty());
}

TEST_F(ZipSpool, GoesWithTheShutdownOfItsProvider)
{
    std::string const inner = makeRawZip({{.name = "x", .content = noise(50'000)}});
    StorageItem const outer =
        openRoot(ArchiveFormat::Zip, makeFile(makeRawZip({{.name = "in.zip", .content = inner, .method = 8}})), limits);
    StorageItem const container(outer, u"in.zip");
    ArchiveProviderFactory const factory(ArchiveFormat::Zip, limits);
    StorageItem const file(factory.buildProvider(container), StorageIRI(u"zip", container.getLocation(), u"/x"));
    std::ptrdiff_t const atFirst = openDescriptors();
    for (int i = 0; i != 2; ++i) {
        EXPECT_EQ(read(file), noise(50'000));
        EXPECT_EQ(openDescriptors(), atFirst + 1);
        factory.shutdownProvider();
        EXPECT_EQ(openDescriptors(), atFirst);
    }
}

TEST(ZipShutdown, LeavesOpenStreamsAndReadsAnewWhatIsUsedAgain)
{
    TemporaryFolder const folder;
    std::string const content = noise(300'000);
    folder.write("a.zip", makeRawZip({{.name = "x", .content = content}}));
    StorageItem const container(std::make_shared<local::LocalProvider>(), folder.iri(u"a.zip"));
    ArchiveProviderFactory const factory(ArchiveFormat::Zip);
    std::ptrdiff_t const atFirst = openDescriptors();
    StorageItem const file(factory.buildProvider(container), StorageIRI(u"zip", container.getLocation(), u"/x"));
    auto stream = file.openReadOnlyStream();
    factory.shutdownProvider();
    EXPECT_EQ(readAt(*stream, 200'000, 10), content.substr(200'000, 10));
    stream.reset();
    EXPECT_EQ(openDescriptors(), atFirst);
    EXPECT_EQ(read(file), content);
    factory.shutdownProvider();
    EXPECT_EQ(openDescriptors(), atFirst);
}

} // namespace

} // namespace foundation::storage::archive
