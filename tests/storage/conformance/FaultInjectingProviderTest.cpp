#include <storage/conformance/FaultInjectingProvider.hpp>

#include <storage/conformance/detail/content.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::conformance {
namespace {

using namespace provider;
using tests::support::MinimalProvider;

StorageIRI const folder(u"s://h/f");
StorageIRI const file(u"s://h/f/file");
StorageIRI const target(u"s://h/f/target");

/// A provider with faults over a store with one folder that holds one file.
struct Arrangement
{
    explicit Arrangement(FaultPlan const& plan)
        : store(std::make_shared<MinimalProvider>()), provider(std::make_shared<FaultInjectingProvider>(store, plan))
    {
        store->folders.insert(folder);
        store->put(file, "0123456789");
    }

    std::shared_ptr<MinimalProvider> store;
    std::shared_ptr<FaultInjectingProvider> provider;
};

template <typename Action>
void expectException(Action const& action, ErrorCode code, StorageIRI const& location)
{
    try {
        action();
        ADD_FAILURE() << "no failure";
    } catch (Exception const& error) {
        EXPECT_EQ(error.getErrorCode(), code);
        EXPECT_EQ(error.getStorageIRI(), location);
    }
}

template <typename Action>
void expectStreamFailure(Action const& action, ErrorCode code = ErrorCode::IOError)
{
    try {
        action();
        ADD_FAILURE() << "no failure";
    } catch (ByteStreamFailure const& error) {
        EXPECT_EQ(error.getErrorCode(), code);
    }
}

TEST(FaultInjectingProvider, DoesNothingWrongWithoutAPlan)
{
    Arrangement const arranged({});
    EXPECT_EQ(detail::readFile(StorageItem(arranged.provider, file)), "0123456789");
    detail::writeFile(StorageItem(arranged.provider, target), "content");
    EXPECT_EQ(arranged.store->content(target), "content");
    EXPECT_EQ(arranged.provider->faults(), 0u);
}

TEST(FaultInjectingProvider, ListsTheOperationsInOrder)
{
    Arrangement const arranged({});
    arranged.provider->fileExists(file);
    detail::writeFile(StorageItem(arranged.provider, target), "content");
    arranged.provider->listFiles(folder)->next();
    EXPECT_EQ(arranged.provider->operations(),
              (std::vector<std::string>{"fileExists", "openStream", "write", "close", "listFiles", "next"}));
}

TEST(FaultInjectingProvider, FailsTheNthOperationAlone)
{
    Arrangement const arranged({.failing = 2, .code = ErrorCode::ResourceInUse});
    EXPECT_TRUE(arranged.provider->fileExists(file));
    expectException([&] { arranged.provider->removeFile(file); }, ErrorCode::ResourceInUse, file);
    EXPECT_TRUE(arranged.store->fileExists(file));
    EXPECT_TRUE(arranged.provider->fileExists(file));
    EXPECT_EQ(arranged.provider->faults(), 1u);
}

TEST(FaultInjectingProvider, CountsOperationsOfOneNameAlone)
{
    Arrangement const arranged({.failing = 2, .counted = "fileExists"});
    EXPECT_TRUE(arranged.provider->fileExists(file));
    EXPECT_FALSE(arranged.provider->folderExists(file));
    expectException([&] { arranged.provider->fileExists(file); }, ErrorCode::IOError, file);
}

TEST(FaultInjectingProvider, StaysBrokenWhenToldTo)
{
    Arrangement const arranged({.failing = 2, .broken = true});
    EXPECT_TRUE(arranged.provider->fileExists(file));
    for (int time = 0; time < 3; ++time)
        expectException([&] { arranged.provider->fileExists(file); }, ErrorCode::IOError, file);
    EXPECT_EQ(arranged.provider->faults(), 3u);
}

TEST(FaultInjectingProvider, FailsStreamsByTheirOwnKindOfFailure)
{
    Arrangement const arranged({.failing = 3, .code = ErrorCode::NoSpaceLeft});
    auto const stream = arranged.provider->openStream(target, {});
    EXPECT_EQ(stream->write("ab", 2), 2);
    expectStreamFailure([&] { stream->write("cd", 2); }, ErrorCode::NoSpaceLeft);
    EXPECT_EQ(stream->write("ef", 2), 2);
    EXPECT_EQ(arranged.store->content(target), "abef");
}

TEST(FaultInjectingProvider, FailsListings)
{
    Arrangement const arranged({.failing = 1, .counted = "next"});
    auto const listing = arranged.provider->listAll(folder, u"*");
    expectException([&] { listing->next(); }, ErrorCode::IOError, folder);
}

TEST(FaultInjectingProvider, ReadsAndWritesInShortSteps)
{
    Arrangement const arranged({.longestRead = 3, .longestWrite = 4});
    char buffer[10];
    EXPECT_EQ(arranged.provider->openReadOnlyStream(file)->read(buffer, 10), 3);
    EXPECT_EQ(arranged.provider->openStream(target, {})->write(buffer, 10), 4);
    EXPECT_EQ(detail::readFile(StorageItem(arranged.provider, file)), "0123456789");
}

TEST(FaultInjectingProvider, FailsReadingAtTheByteOfThePlan)
{
    Arrangement const arranged({.readFailsAfter = 4});
    auto const stream = arranged.provider->openReadOnlyStream(file);
    char buffer[10];
    EXPECT_EQ(stream->read(buffer, 10), 4);
    expectStreamFailure([&] { stream->read(buffer, 10); });
}

TEST(FaultInjectingProvider, FailsWritingAtTheByteOfThePlan)
{
    Arrangement const arranged({.writeFailsAfter = 0});
    auto const stream = arranged.provider->openStream(target, {});
    expectStreamFailure([&] { stream->write("a", 1); });
    EXPECT_EQ(arranged.store->content(target), "");
}

TEST(FaultInjectingProvider, FailsToCloseWhatIsClosed)
{
    Arrangement const arranged({.closeFails = true});
    expectStreamFailure([&] { arranged.provider->openReadOnlyStream(file)->close(); });
    EXPECT_EQ(arranged.provider->faults(), 1u);
}

TEST(FaultInjectingProvider, LiesAboutSizes)
{
    Arrangement const arranged({.claimedSize = 1000});
    EXPECT_EQ(arranged.provider->getFileAttributes(file).getSize(), 1000u);
    EXPECT_EQ(arranged.provider->openReadOnlyStream(file)->seek(-1, std::ios_base::end), 999);
}

TEST(FaultInjectingProvider, DelaysEveryOperation)
{
    using namespace std::chrono_literals;
    Arrangement const arranged({.delay = 2ms});
    auto const start = std::chrono::steady_clock::now();
    arranged.provider->fileExists(file);
    arranged.provider->fileExists(file);
    EXPECT_GE(std::chrono::steady_clock::now() - start, 4ms);
}

TEST(FaultInjectingProvider, CommitsThroughTheWrappedProvider)
{
    Arrangement const arranged({});
    auto const stream = arranged.provider->openTransactionalStream(target, {});
    stream->write("content", 7);
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(arranged.store->content(target), "content");
    EXPECT_EQ(arranged.provider->operations(),
              (std::vector<std::string>{"openTransactionalStream", "write", "commit"}));
}

TEST(FaultInjectingProvider, FailsACommitBeforeItHappens)
{
    Arrangement const arranged({.failing = 1, .counted = "commit"});
    auto const stream = arranged.provider->openTransactionalStream(target, {});
    expectStreamFailure([&] { stream->close(StreamClosePolicy::Commit); });
    EXPECT_FALSE(arranged.store->fileExists(target));
    stream->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(arranged.store->fileExists(target));
}

TEST(FaultInjectingProvider, ComposesTransactionsOfItsOwnOperationsWhenToldTo)
{
    Arrangement const arranged({.composeTransactions = true});
    auto const stream = arranged.provider->openTransactionalStream(target, {});
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(arranged.provider->operations(), (std::vector<std::string>{"openStream", "close", "moveFile"}));
}

TEST(FaultInjectingProvider, AbortsADroppedTransaction)
{
    Arrangement const arranged({});
    arranged.provider->openTransactionalStream(target, {})->write("content", 7);
    EXPECT_EQ(arranged.store->files.size(), 1u);
}

} // namespace
} // namespace foundation::storage::conformance
