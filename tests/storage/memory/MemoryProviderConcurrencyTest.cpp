#include <storage/memory/MemoryProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/memory/MemoryStore.hpp>

#include <atomic>
#include <barrier>
#include <set>
#include <thread>

namespace foundation::storage::memory {
namespace {

using namespace provider;
using events::Kind;

constexpr int threadCount = 16;
constexpr int rounds = 200;

std::u16string numbered(std::u16string const& name, int number)
{
    std::string const digits = std::to_string(number);
    return name + std::u16string(digits.begin(), digits.end());
}

/// Has all threads begin together.
template <typename Work>
void runInThreads(Work const& work)
{
    std::barrier start(threadCount);
    std::vector<std::thread> threads;
    for (int number = 0; number < threadCount; ++number)
        threads.emplace_back([&, number] {
            start.arrive_and_wait();
            work(number);
        });
    for (std::thread& thread : threads)
        thread.join();
}

TEST(MemoryProviderConcurrency, OneOfAllCreatesAFile)
{
    MemoryStore const store;
    for (int round = 0; round < rounds; ++round) {
        std::u16string const path = numbered(u"/file", round);
        std::atomic<int> created = 0;
        runInThreads([&](int) { created += failureOf([&] { store.createFile(at(path)); }) == "no failure"; });
        EXPECT_EQ(created, 1);
    }
}

TEST(MemoryProviderConcurrency, OneOfAllMovesAFile)
{
    MemoryStore const store;
    std::atomic<int> moved = 0;
    store.createFile(at(u"/file"));
    runInThreads([&](int number) {
        for (int round = 0; round < rounds; ++round)
            moved += failureOf([&] {
                         store.moveFile(at(numbered(u"/file", number)), at(u"/file"), ReplacementPolicy::Preserve);
                     }) == "no failure";
        for (int round = 0; round < rounds; ++round)
            moved -= failureOf([&] {
                         store.moveFile(at(u"/file"), at(numbered(u"/file", number)), ReplacementPolicy::Preserve);
                     }) == "no failure";
    });
    EXPECT_EQ(moved, -1 + (store.fileExists(at(u"/file")) ? 1 : 0));
    EXPECT_EQ(namesOf(*store.listAll(at(u"/"))).size(), 1u);
}

TEST(MemoryProviderConcurrency, EveryAppendIsWholeAndNoneIsLost)
{
    MemoryStore const store;
    runInThreads([&](int number) {
        auto const stream = store.openStream(at(u"/log"), append);
        std::string const line(99, static_cast<char>('a' + number));
        for (int round = 0; round < rounds; ++round)
            writeAll(*stream, line + "\n");
    });
    std::string const log = store.read(u"/log");
    EXPECT_EQ(log.size(), std::size_t{threadCount} * rounds * 100);
    for (std::size_t line = 0; line < log.size(); line += 100)
        ASSERT_EQ(log.substr(line, 100), std::string(99, log[line]) + "\n");
}

TEST(MemoryProviderConcurrency, ReadersSeeWholeWritesWhileOthersWrite)
{
    MemoryStore const store;
    constexpr std::size_t size = 700000;
    store.write(u"/file", std::string(size, 'x'));
    runInThreads([&](int number) {
        for (int round = 0; round < 20; ++round) {
            if (number % 2 == 0) {
                writeAll(*store.openStream(at(u"/file"), update), std::string(size, static_cast<char>('a' + number)));
                continue;
            }
            std::string const content = store.read(u"/file");
            ASSERT_EQ(content, std::string(size, content[0]));
        }
    });
}

TEST(MemoryProviderConcurrency, CommitsReplaceTheTargetAsAWhole)
{
    MemoryStore const store;
    store.write(u"/file", "x");
    runInThreads([&](int number) {
        for (int round = 0; round < rounds; ++round) {
            std::string const content(static_cast<std::size_t>(number) + 1, static_cast<char>('a' + number));
            auto const stream = store.openTransactionalStream(at(u"/file"), rewrite);
            stream->write(content.data(), static_cast<long>(content.size()));
            stream->close(StreamClosePolicy::Commit);
            std::string const seen = store.read(u"/file");
            ASSERT_EQ(seen, std::string(static_cast<std::size_t>(seen[0] - 'a') + 1, seen[0]));
        }
    });
    EXPECT_EQ(namesOf(*store.listAll(at(u"/"))), Names{u"file"});
}

TEST(MemoryProviderConcurrency, TheLimitHoldsAndNothingTakenIsForgotten)
{
    MemoryStore store;
    store.limit("1000");
    std::atomic<long> written = 0;
    runInThreads([&](int number) {
        auto const stream = store.openStream(at(numbered(u"/file", number)), append);
        for (int round = 0; round < rounds; ++round) {
            try {
                written += stream->write("1234567", 7);
            } catch (ByteStreamFailure const&) {
                continue;
            }
        }
    });
    EXPECT_EQ(written, 1000 / 7 * 7);
    for (int number = 0; number < threadCount; ++number)
        store.removeFile(at(numbered(u"/file", number)));
    store.write(u"/all", std::string(1000, 'x'));
}

TEST(MemoryProviderConcurrency, ListingsGiveWhatStaysWhileOthersChangeTheFolder)
{
    MemoryStore const store;
    std::set<std::u16string> staying;
    for (int number = 0; number < 50; ++number) {
        staying.insert(numbered(u"stays", number));
        store.createFolder(at(numbered(u"/stays", number)));
    }
    runInThreads([&](int number) {
        for (int round = 0; round < 50; ++round) {
            std::u16string const path = numbered(u"/stays25/goes", number);
            if (number % 2 == 0) {
                store.createFolderRecursive(at(path + u"/deep"));
                store.write(path + u"/deep/file", "content");
                store.removeFolderRecursively(at(path));
                continue;
            }
            std::set<std::u16string> seen;
            auto const listing = store.listAllRecursive(at(u"/"), u"stays*");
            for (FolderEntry const& entry : entries(*listing))
                EXPECT_TRUE(seen.insert(entry.getName()).second);
            EXPECT_EQ(seen, staying);
        }
    });
}

TEST(MemoryProviderConcurrency, AttributesAreReadAndSetAtOnce)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    auto const first = boost::posix_time::time_from_string("2001-01-01 00:00:00");
    runInThreads([&](int number) {
        for (int round = 0; round < rounds; ++round) {
            store.setLastModified(at(u"/file"), first + boost::posix_time::hours(number));
            store.setWritable(at(u"/file"), true);
            auto const attributes = store.getFileAttributes(at(u"/file"));
            EXPECT_TRUE(attributes.isWritable());
            EXPECT_LE(attributes.getLastModified(), first + boost::posix_time::hours(threadCount));
        }
    });
}

TEST(MemoryProviderConcurrency, EveryChangeIsToldWhileSubscriptionsComeAndGo)
{
    MemoryStore const store;
    std::atomic<int> told = 0;
    for (int number = 0; number < threadCount; ++number)
        store.createFolder(at(numbered(u"/folder", number)));
    runInThreads([&](int number) {
        std::u16string const folder = numbered(u"/folder", number);
        for (int round = 0; round < rounds; ++round) {
            store.publishFolderEventsFor(at(folder), [&](auto const&...) { ++told; }, {Kind::Created});
            store.createFile(at(numbered(folder + u"/file", round)));
            store.stopPublishingFolderEventsFor(at(folder));
        }
    });
    EXPECT_EQ(told, threadCount * rounds);
}

TEST(MemoryProviderConcurrency, CopiesAreWholeWhileTheSourceChanges)
{
    MemoryStore const store;
    store.write(u"/source", std::string(300000, 'x'));
    runInThreads([&](int number) {
        for (int round = 0; round < 20; ++round) {
            if (number == 0) {
                writeAll(*store.openStream(at(u"/source"), update),
                         std::string(300000, static_cast<char>('a' + round)));
                continue;
            }
            std::u16string const copy = numbered(u"/copy", number);
            if (number % 2 == 0)
                store.copyFile(at(u"/source"), at(copy), ReplacementPolicy::Overwrite);
            else
                store.copyFileAtomic(at(u"/source"), at(copy), ReplacementPolicy::Overwrite, {});
            std::string const content = store.read(copy);
            ASSERT_EQ(content, std::string(300000, content[0]));
        }
    });
}

} // namespace
} // namespace foundation::storage::memory
