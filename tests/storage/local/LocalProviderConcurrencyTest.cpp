#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <algorithm>
#include <array>
#include <atomic>
#include <barrier>
#include <filesystem>
#include <functional>
#include <string>
#include <thread>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::TemporaryFolder;

constexpr int threadCount = 8;
constexpr int rounds = 50;

/// Runs a task with its number in each of several threads, all at once.
void inThreads(std::function<void(int)> const& task)
{
    std::barrier start(threadCount);
    std::vector<std::jthread> threads;
    for (int i = 0; i < threadCount; ++i)
        threads.emplace_back([&start, &task, i] {
            start.arrive_and_wait();
            task(i);
        });
}

std::u16string numbered(std::u16string const& name, int number)
{
    return name + static_cast<char16_t>(u'0' + number);
}

/// Expects that of several threads that do the same at once one succeeds, and the others hear of it.
void expectOneWinner(std::function<void(int)> const& task, std::string const& defeat)
{
    std::array<std::string, threadCount> outcomes;
    inThreads([&](int i) { outcomes.at(static_cast<std::size_t>(i)) = failureOf([&] { task(i); }); });
    EXPECT_EQ(std::count(outcomes.begin(), outcomes.end(), "no failure"), 1);
    EXPECT_EQ(std::count(outcomes.begin(), outcomes.end(), defeat), threadCount - 1);
}

TEST(LocalProviderConcurrency, OneOfManyCreatesAFile)
{
    TemporaryFolder const folder;
    LocalProvider const provider;
    StorageIRI const target = folder.iri(u"target");
    for (int round = 0; round < rounds; ++round) {
        expectOneWinner([&](int) { provider.createFile(target); }, failure(ErrorCode::ResourceAlreadyExists, target));
        provider.removeFile(target);
    }
}

TEST(LocalProviderConcurrency, OneOfManyRemovesAFile)
{
    TemporaryFolder const folder;
    LocalProvider const provider;
    StorageIRI const target = folder.iri(u"target");
    for (int round = 0; round < rounds; ++round) {
        provider.createFile(target);
        expectOneWinner([&](int) { provider.removeFile(target); }, failure(ErrorCode::ResourceNotFound, target));
    }
}

TEST(LocalProviderConcurrency, OneOfManyMovesToANameAndTheOthersKeepTheirFiles)
{
    TemporaryFolder const folder;
    LocalProvider const provider;
    StorageIRI const target = folder.iri(u"target");
    for (int round = 0; round < rounds; ++round) {
        for (int i = 0; i < threadCount; ++i)
            folder.write("source" + std::to_string(i), std::to_string(i));
        expectOneWinner(
            [&](int i) { provider.moveFile(folder.iri(numbered(u"source", i)), target, ReplacementPolicy::Preserve); },
            failure(ErrorCode::ResourceAlreadyExists, target));
        EXPECT_FALSE(fs::exists(folder / ("source" + folder.read("target"))));
        EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), threadCount);
        provider.removeFile(target);
    }
}

TEST(LocalProviderConcurrency, OneOfManyMovesAFileAway)
{
    TemporaryFolder const folder;
    LocalProvider const provider;
    StorageIRI const source = folder.iri(u"source");
    for (int round = 0; round < rounds; ++round) {
        folder.write("source", "content");
        TemporaryFolder const targets(folder.path());
        expectOneWinner(
            [&](int i) { provider.moveFile(source, targets.iri(numbered(u"target", i)), ReplacementPolicy::Preserve); },
            failure(ErrorCode::ResourceNotFound, source));
    }
}

TEST(LocalProviderConcurrency, ReadersSeeTheOldContentOrTheNewNeverAMixture)
{
    TemporaryFolder const folder;
    LocalProvider const provider;
    StorageIRI const target = folder.iri(u"target");
    constexpr long size = 10'000;
    folder.write("target", std::string(size, 'x'));
    std::atomic<int> mixtures = 0;
    inThreads([&](int number) {
        std::string content(size + 1, static_cast<char>('0' + number));
        for (int round = 0; round < rounds; ++round) {
            if (number % 2 == 0) {
                auto const stream = provider.openTransactionalStream(target, {});
                stream->write(content.data(), size / 2);
                stream->write(content.data(), size / 2);
                stream->close(StreamClosePolicy::Commit);
            } else {
                long const read = provider.openReadOnlyStream(target)->read(content.data(), size + 1);
                mixtures += read != size || content.find_first_not_of(content[0]) < size;
            }
        }
    });
    EXPECT_EQ(mixtures, 0);
    EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 1);
}

TEST(LocalProviderConcurrency, ListingsPassOverWhatOthersRemoveMeanwhile)
{
    TemporaryFolder const folder;
    LocalProvider const provider;
    folder.write("kept", "");
    std::atomic<int> kept = 0;
    inThreads([&](int number) {
        StorageIRI const fleeting = folder.iri(numbered(u"fleeting", number));
        for (int round = 0; round < rounds; ++round) {
            provider.createFile(fleeting);
            auto const listing = provider.listAll(folder.iri());
            for (FolderEntry const& entry : entries(*listing))
                kept += entry.getName() == u"kept";
            provider.removeFile(fleeting);
        }
    });
    EXPECT_EQ(kept, threadCount * rounds);
}

} // namespace
} // namespace foundation::storage::local
