#include <storage/archive/ArchiveProvider.hpp>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/inThreads.hpp>

#include <gtest/gtest.h>

#include <filesystem>
#include <iterator>
#include <memory>
#include <optional>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;

namespace {

constexpr int threads = 32;

std::string contentOf(int number)
{
    return numbers(5000 + 200 * static_cast<std::size_t>(number)).substr(static_cast<std::size_t>(number));
}

std::u16string nameOf(int number)
{
    return u"file" + std::u16string(1, static_cast<char16_t>(u'A' + number));
}

std::string archiveOf(Kind const& kind)
{
    std::vector<Member> members;
    for (int i = 0; i != threads; ++i)
        members.push_back({.name = std::string("file") + static_cast<char>('A' + i), .content = contentOf(i)});
    return makeArchive(kind.writer, kind.compression, members);
}

long openDescriptors()
{
    auto const all = std::filesystem::directory_iterator("/proc/self/fd");
    return std::distance(begin(all), end(all));
}

TEST(ArchiveConcurrency, ThreadsReadEntriesOfOneArchiveAtOnceAndTheLastUserClosesIt)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        TemporaryFolder const folder;
        folder.write("archive", archiveOf(kind));
        long const before = openDescriptors();
        std::optional<StorageItem> root =
            openRoot(kind.format, StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"archive")));
        inThreads(threads, [&](int number) {
            for (int i = 0; i != 8; ++i) {
                int const wanted = (number + i * 5) % threads;
                EXPECT_EQ(read(*root, nameOf(wanted)), contentOf(wanted));
            }
        });
        EXPECT_GT(openDescriptors(), before);
        root.reset();
        EXPECT_EQ(openDescriptors(), before);
    }
}

TEST(ArchiveConcurrency, ThreadsReadAnArchiveThatIsSpooled)
{
    Kind const kind = kindsOfArchives().at(1);
    std::string const outer = makeArchive("pax", "gzip", {{.name = "inner", .content = archiveOf(kind)}});
    StorageItem const inner(openRoot(ArchiveFormat::Tar, makeFile(outer)), u"inner");
    StorageItem const root = openRoot(kind.format, inner, {.spoolMemory = 1000});
    inThreads(threads, [&](int number) { EXPECT_EQ(read(root, nameOf(number)), contentOf(number)); });
}

} // namespace

} // namespace foundation::storage::archive
