#include <storage/archive/ArchiveProvider.hpp>

#include <storage/local/LocalProvider.hpp>
#include <storage/provider/StreamClosePolicy.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/writing.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/inThreads.hpp>

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <optional>
#include <vector>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;

namespace {

constexpr int threads = 12;
constexpr int rounds = 10;

std::u16string nameOf(int thread, int round)
{
    return std::u16string(1, static_cast<char16_t>(u'A' + thread)) + static_cast<char16_t>(u'a' + round);
}

std::string contentOf(int thread, int round)
{
    return std::string(static_cast<std::size_t>(5'000 + 100 * thread), static_cast<char>('a' + round));
}

long openDescriptors()
{
    auto const all = std::filesystem::directory_iterator("/proc/self/fd");
    return std::distance(begin(all), end(all));
}

TEST(ZipWriteConcurrency, ThreadsWriteReadAndListWhileOthersFlush)
{
    OpenZip const zip(makeFile(makeZip({{.name = "always", .content = "always"}})));
    inThreads(threads, [&](int thread) {
        for (int round = 0; round != rounds; ++round) {
            StorageItem const file = zip.item(nameOf(thread, round));
            write(file, contentOf(thread, round));
            EXPECT_EQ(read(file), contentOf(thread, round));
            EXPECT_EQ(read(zip.item(u"always")), "always");
            EXPECT_GE(pathsBelow(zip.root()).size(), 2u);
            if (thread % 4 == 0)
                zip.provider->flush();
        }
    });
    zip.provider->flush();
    OpenZip const again(zip.container);
    EXPECT_EQ(pathsBelow(again.root()).size(), std::size_t{threads * rounds + 1});
    for (int thread = 0; thread != threads; ++thread) {
        for (int round = 0; round != rounds; ++round)
            EXPECT_EQ(read(again.item(nameOf(thread, round))), contentOf(thread, round));
    }
}

TEST(ZipWriteConcurrency, StreamsThatAreOpenDuringFlushesLoseNothing)
{
    OpenZip const zip(makeFile(makeZip({})));
    inThreads(threads, [&](int thread) {
        if (thread % 4 == 0) {
            for (int round = 0; round != rounds; ++round)
                zip.provider->flush();
            return;
        }
        auto const stream = zip.item(nameOf(thread, 0)).openStream({});
        for (int round = 0; round != rounds; ++round) {
            std::string const content = contentOf(thread, round);
            stream->write(content.data(), static_cast<long>(content.size()));
        }
        stream->close();
    });
    zip.provider->flush();
    OpenZip const again(zip.container);
    for (int thread = 0; thread != threads; ++thread) {
        if (thread % 4 == 0)
            continue;
        std::string expected;
        for (int round = 0; round != rounds; ++round)
            expected += contentOf(thread, round);
        EXPECT_EQ(read(again.item(nameOf(thread, 0))), expected);
    }
}

TEST(ZipWriteConcurrency, StreamsThatWereOpenedBeforeAFlushGoOnTogether)
{
    std::string const content(3'000'000, 'x');
    OpenZip const zip(makeFile(makeZip({{.name = "old", .content = content, .isStored = true}})));
    std::vector<std::unique_ptr<ByteStream>> streams;
    for (int thread = 0; thread != threads; ++thread)
        streams.push_back(zip.item(u"old").openReadOnlyStream());
    write(zip.item(u"new"), "new");
    zip.provider->flush();
    inThreads(threads, [&](int thread) {
        std::string bytes(content.size(), '\0');
        long done = 0;
        ByteStream& stream = *streams[static_cast<std::size_t>(thread)];
        for (long read; (read = stream.read(bytes.data() + done, static_cast<long>(bytes.size()) - done)) > 0;)
            done += read;
        EXPECT_EQ(bytes, content);
    });
}

TEST(ZipWriteConcurrency, TheLastUserGivesEveryDescriptorBack)
{
    TemporaryFolder const folder;
    long const before = openDescriptors();
    std::optional<OpenZip> zip(std::in_place,
                               StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"a.zip")),
                               ArchiveLimits{.spoolMemory = 100});
    inThreads(threads, [&](int thread) { write(zip->item(nameOf(thread, 0)), contentOf(thread, 0)); });
    EXPECT_GT(openDescriptors(), before);
    zip->provider->flush();
    inThreads(threads, [&](int thread) { EXPECT_EQ(read(zip->item(nameOf(thread, 0))), contentOf(thread, 0)); });
    zip.reset();
    EXPECT_EQ(openDescriptors(), before);
}

} // namespace

} // namespace foundation::storage::archive
