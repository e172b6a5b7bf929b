#include <storage/provider/StorageItem.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/storage/provider/copies.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/TestStreamFailure.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

TEST(StorageItemBufferedCopy, InterruptFunctionIsAskedAfterEachChunkAndNeverBeforeTheFirst)
{
    for (TransactionPolicy const policy : {TransactionPolicy::Atomic, TransactionPolicy::NonAtomic}) {
        CallLog log;
        auto const source = std::make_shared<RecordingProvider>(log);
        source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
            auto stream = std::make_unique<RecordingByteStream>(log, "source");
            stream->onRead = readsFrom("123456", 3);
            return stream;
        });
        auto const target = std::make_shared<RecordingProvider>(log);
        target->when("doOpenStream", [&]() -> std::unique_ptr<ByteStream> {
            return std::make_unique<RecordingByteStream>(log, "target");
        });
        auto const asked = [&log] {
            log.emplace_back("asked");
            return InterruptSignal::Continue;
        };
        StorageItem(source, StorageIRI(u"a://h/f"))
            .copyFile(StorageItem(target, StorageIRI(u"b://h/f")), {ReplacementPolicy::Overwrite, policy, asked});
        std::erase_if(log, [](auto const& call) { return call.starts_with("do"); });
        EXPECT_EQ(log,
                  (CallLog{"source.read(1048576)", "target.write(3)", "asked", "source.read(1048576)",
                           "target.write(3)", "asked", "source.read(1048576)", "target.close()", "source.close()"}));
    }
}

TEST(StorageItemBufferedCopy, AbortAtOnceLeavesTheFirstChunkInAPlainDestination)
{
    TwoStores stores(patterned(2 * chunk));
    EXPECT_EQ(stores.source.copyFile(stores.target, {ReplacementPolicy::Overwrite, TransactionPolicy::NonAtomic, stop}),
              TransactionStatus::Aborted);
    EXPECT_EQ(stores.second->content(stores.target.getLocation()), patterned(chunk));
}

TEST(StorageItemBufferedCopy, AbortAtOnceLeavesATransactionalDestinationUntouched)
{
    TwoStores stores(patterned(2 * chunk));
    stores.second->put(stores.target.getLocation(), "old");
    EXPECT_EQ(stores.source.copyFile(stores.target, {ReplacementPolicy::Overwrite, TransactionPolicy::Atomic, stop}),
              TransactionStatus::Aborted);
    EXPECT_EQ(stores.second->content(stores.target.getLocation()), "old");
    EXPECT_EQ(stores.second->files.size(), 1U);
}

TEST(StorageItemBufferedCopy, AnyAnswerButContinueAborts)
{
    TwoStores stores("text");
    auto const odd = [] { return static_cast<InterruptSignal>(7); };
    EXPECT_EQ(stores.source.copyFile(stores.target, {ReplacementPolicy::Overwrite, TransactionPolicy::NonAtomic, odd}),
              TransactionStatus::Aborted);
}

TEST(StorageItemBufferedCopy, AbortAtOnceOfAnEmptyFileIsAborted)
{
    for (TransactionPolicy const policy : {TransactionPolicy::Atomic, TransactionPolicy::NonAtomic}) {
        TwoStores stores("");
        EXPECT_EQ(stores.source.copyFile(stores.target, {ReplacementPolicy::Overwrite, policy, stop}),
                  TransactionStatus::Aborted);
        EXPECT_EQ(stores.second->files.count(stores.target.getLocation()),
                  policy == TransactionPolicy::NonAtomic ? 1U : 0U);
    }
}

TEST(StorageItemBufferedCopy, FailingInterruptFunctionAbortsATransactionalCopyAndPasses)
{
    TwoStores stores("text");
    auto const failing = []() -> InterruptSignal { throw std::domain_error("mine"); };
    EXPECT_THROW(
        stores.source.copyFile(stores.target, {ReplacementPolicy::Overwrite, TransactionPolicy::Atomic, failing}),
        std::domain_error);
    EXPECT_TRUE(stores.second->files.empty());
}

TEST(StorageItemBufferedCopy, AbortClosesBothEnds)
{
    for (TransactionPolicy const policy : {TransactionPolicy::Atomic, TransactionPolicy::NonAtomic}) {
        CallLog log;
        auto const source = std::make_shared<RecordingProvider>(log);
        source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
            auto stream = std::make_unique<RecordingByteStream>(log, "source");
            stream->onRead = readsFrom("text");
            return stream;
        });
        auto const target = std::make_shared<RecordingProvider>(log);
        target->when("doOpenStream", [&]() -> std::unique_ptr<ByteStream> {
            return std::make_unique<RecordingByteStream>(log, "target");
        });
        StorageItem(source, StorageIRI(u"a://h/f"))
            .copyFile(StorageItem(target, StorageIRI(u"b://h/f")), {ReplacementPolicy::Overwrite, policy, stop});
        std::erase_if(log, [](auto const& call) { return call.starts_with("do"); });
        EXPECT_EQ(log, (CallLog{"source.read(1048576)", "target.write(4)", "target.close()", "source.close()"}));
    }
}

TEST(StorageItemBufferedCopy, FailureToRemoveTheScratchFileOfAnAbortedCopyPasses)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    StorageIRI const location(u"b://h/f");
    target->fail("doRemoveFile", Exception(ErrorCode::PermissionDenied, location));
    TwoStores stores("text");
    StorageItem const destination(target, location);
    CopyFileOptions const options{ReplacementPolicy::Overwrite, TransactionPolicy::Atomic, stop};
    EXPECT_EQ(codeOfFailureAt(destination, [&] { stores.source.copyFile(destination, options); }),
              ErrorCode::PermissionDenied);
}

struct CountingFunction
{
    int calls = 0;
    InterruptSignal operator()()
    {
        ++calls;
        return InterruptSignal::Continue;
    }
};

TEST(StorageItemBufferedCopy, InterruptFunctionOfTheCallerIsAskedAndNoCopyOfIt)
{
    for (TransactionPolicy const policy : {TransactionPolicy::Atomic, TransactionPolicy::NonAtomic}) {
        TwoStores stores(patterned(2 * chunk));
        CopyFileOptions const options{ReplacementPolicy::Overwrite, policy, CountingFunction()};
        stores.source.copyFile(stores.target, options);
        auto const* const function = options.interruptFunction.target<CountingFunction>();
        ASSERT_NE(function, nullptr);
        EXPECT_EQ(function->calls, 2);
    }
}

TEST(StorageItemBufferedCopy, InterruptFunctionThatBecomesEmptyIsReported)
{
    for (TransactionPolicy const policy : {TransactionPolicy::Atomic, TransactionPolicy::NonAtomic}) {
        CallLog log;
        CopyFileOptions options{ReplacementPolicy::Overwrite, policy, goOn};
        auto const source = std::make_shared<RecordingProvider>(log);
        source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
            options.interruptFunction = nullptr;
            return std::make_unique<RecordingByteStream>();
        });
        TwoStores stores("");
        EXPECT_THROW(StorageItem(source, StorageIRI(u"a://h/f")).copyFile(stores.target, options),
                     std::bad_function_call);
        EXPECT_EQ(stores.second->files.empty(), policy == TransactionPolicy::Atomic);
    }
}

TEST(StorageItemBufferedCopy, FailureToCloseAPlainDestinationIsSwallowed)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    target->when("doOpenStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>(log, "target");
        stream->onClose = [] { throw std::domain_error("not only stream failures"); };
        return stream;
    });
    TwoStores stores("text");
    EXPECT_EQ(stores.source.copyFile(StorageItem(target, StorageIRI(u"b://h/f")), ReplacementPolicy::Overwrite),
              TransactionStatus::Completed);
    EXPECT_EQ(log.back(), "target.close()");
}

TEST(StorageItemBufferedCopy, FailedCommitPassesAndRemovesTheScratchFile)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    StorageIRI const location(u"b://h/f");
    target->fail("doMoveFile", Exception(ErrorCode::PermissionDenied, location));
    TwoStores stores("text");
    StorageItem const destination(target, location);
    EXPECT_EQ(
        codeOfFailureAt(
            destination,
            [&] {
                stores.source.copyFile(destination, {ReplacementPolicy::Overwrite, TransactionPolicy::Atomic, {}});
            }),
        ErrorCode::PermissionDenied);
    EXPECT_TRUE(log.back().starts_with("doRemoveFile(b://h/"));
}

TEST(StorageItemBufferedCopy, FailureToCloseTheScratchStreamNamesTheSourceWithItsOwnCode)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    target->when("doOpenStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>(log, "scratch");
        stream->onClose = [] { throw TestStreamFailure(ErrorCode::NoSpaceLeft); };
        return stream;
    });
    TwoStores stores("text");
    StorageItem const destination(target, StorageIRI(u"b://h/f"));
    CopyFileOptions const options{ReplacementPolicy::Overwrite, TransactionPolicy::Atomic, {}};
    EXPECT_EQ(codeOfFailureAt(stores.source, [&] { stores.source.copyFile(destination, options); }),
              ErrorCode::NoSpaceLeft);
    EXPECT_EQ(std::count_if(log.begin(), log.end(), [](auto const& call) { return call.starts_with("doMoveFile"); }),
              0);
}

/// Two items of one provider, and what it was asked.
struct OneStore
{
    CallLog log;
    std::shared_ptr<RecordingProvider> provider = std::make_shared<RecordingProvider>(log);
    StorageItem source{provider, StorageIRI(u"s://h/from")};
    StorageItem target{provider, StorageIRI(u"s://h/to")};
    CallLog const questions{"doFileExists(s://h/to)", "doFolderExists(s://h/to)"};

    CallLog afterQuestions() const { return CallLog(log.begin() + 2, log.end()); }
};

TEST(StorageItemBufferedCopy, PlainCopyWithinAProviderIsTheProviders)
{
    OneStore store;
    store.provider->when("doCopyFile", [] {});
    EXPECT_EQ(store.source.copyFile(store.target, ReplacementPolicy::Overwrite), TransactionStatus::Completed);
    EXPECT_EQ(store.afterQuestions(), CallLog{"doCopyFile(s://h/from, s://h/to, ReplacementPolicy::Overwrite)"});
}

TEST(StorageItemBufferedCopy, AtomicCopyWithinAProviderThatCanIsTheProviders)
{
    for (bool const interruptible : {false, true}) {
        for (TransactionStatus const status : {TransactionStatus::Completed, TransactionStatus::Aborted}) {
            OneStore store;
            store.provider->when("doHasFeature(ExtendedFeature(5))", [] { return true; });
            store.provider->when("doCopyFileAtomic", [status] { return status; });
            CopyFileOptions const options{ReplacementPolicy::Clobber, TransactionPolicy::Atomic,
                                          interruptible ? goOn : std::function<InterruptSignal()>()};
            EXPECT_EQ(store.source.copyFile(store.target, options), status);
            EXPECT_EQ(store.afterQuestions(),
                      (CallLog{"doHasFeature(ExtendedFeature(5))",
                               std::string("doCopyFileAtomic(s://h/from, s://h/to, ReplacementPolicy::Clobber, ") +
                                   (interruptible ? "function)" : "no function)")}));
        }
    }
}

TEST(StorageItemBufferedCopy, AtomicCopyWithinAProviderThatCannotGoesThroughAScratchFile)
{
    for (bool const interruptible : {false, true}) {
        auto const provider = std::make_shared<MinimalProvider>();
        provider->folders.insert(StorageIRI(u"s://h/"));
        provider->put(StorageIRI(u"s://h/from"), "new");
        provider->put(StorageIRI(u"s://h/to"), "old");
        StorageItem const source(provider, StorageIRI(u"s://h/from"));
        std::string seen;
        auto const look = [&] {
            seen = provider->content(StorageIRI(u"s://h/to"));
            EXPECT_EQ(provider->files.size(), 3U);
            return InterruptSignal::Continue;
        };
        CopyFileOptions const options{ReplacementPolicy::Overwrite, TransactionPolicy::Atomic,
                                      interruptible ? look : std::function<InterruptSignal()>()};
        source.copyFile(StorageItem(provider, StorageIRI(u"s://h/to")), options);
        EXPECT_EQ(provider->content(StorageIRI(u"s://h/to")), "new");
        EXPECT_EQ(seen, interruptible ? "old" : "");
        EXPECT_EQ(provider->files.size(), 2U);
    }
}

TEST(StorageItemBufferedCopy, InterruptiblePlainCopyWithinAProviderIsBuffered)
{
    OneStore store;
    store.source.copyFile(store.target, {ReplacementPolicy::Overwrite, TransactionPolicy::NonAtomic, goOn});
    CallLog const asked = store.afterQuestions();
    ASSERT_EQ(asked.size(), 2U);
    EXPECT_EQ(asked[0], "doOpenReadOnlyStream(s://h/from)");
    EXPECT_TRUE(asked[1].starts_with("doOpenStream(s://h/to, "));
}

TEST(StorageItemBufferedCopy, BufferStepsAnswerWhatWasMoved)
{
    TwoStores stores("text");
    std::unique_ptr<ByteStream> stream = stores.source.openReadOnlyStream();
    ByteStreamDevice const device(stream);
    std::vector<char> buffer(chunk);
    EXPECT_EQ(stores.source.copyToBuffer(device, buffer), 4);
    EXPECT_EQ(std::string(buffer.data(), 4), "text");
    EXPECT_EQ(stores.source.copyToBuffer(device, buffer), 0);

    std::unique_ptr<ByteStream> written = stores.target.openStream({});
    EXPECT_EQ(stores.source.copyFromBuffer(ByteStreamDevice(written), stores.target, buffer, 3), 3);
    EXPECT_EQ(stores.second->content(stores.target.getLocation()), "tex");

    std::unique_ptr<TransactionalStream> transactional = stores.target.openTransactionalStream({});
    TransactionalStreamDevice const target(transactional);
    EXPECT_EQ(stores.source.copyFromBuffer(target, stores.target, buffer, 2), 2);
    target.close();
    EXPECT_EQ(stores.second->content(stores.target.getLocation()), "te");
}

TEST(StorageItemBufferedCopy, StepReadsNoMoreThanTheBufferAndAMebibyte)
{
    CallLog log;
    TwoStores stores("");
    for (std::size_t const size : {std::size_t{0}, std::size_t{7}, 2 * chunk}) {
        std::unique_ptr<ByteStream> stream = std::make_unique<RecordingByteStream>(log, "source");
        std::vector<char> buffer(size);
        EXPECT_EQ(stores.source.copyToBuffer(ByteStreamDevice(stream), buffer), 0);
    }
    EXPECT_EQ(log, (CallLog{"source.read(0)", "source.read(7)", "source.read(1048576)"}));
}

TEST(StorageItemBufferedCopy, BufferedCopiesWantAnInterruptFunction)
{
    TwoStores stores("text");
    auto const device = [&] {
        std::unique_ptr<ByteStream> stream = stores.source.openReadOnlyStream();
        return ByteStreamDevice(stream);
    };
    EXPECT_THROW(stores.source.bufferedCopy(device(), stores.target, {}, {}), std::bad_function_call);
    EXPECT_THROW(stores.source.bufferedTransactionalCopy(device(), stores.target, {}, {}), std::bad_function_call);
}

template <class... Arguments>
using Copy = TransactionStatus (StorageItem::*)(Arguments...) const;
using Interrupt = std::function<InterruptSignal()>;
using BufferedCopy = Copy<ByteStreamDevice const&, StorageItem const&, ByteStreamOpenOptions const&, Interrupt const&>;
template <class Device>
using Write = long (StorageItem::*)(Device const&, StorageItem const&, std::vector<char> const&, long) const;

[[maybe_unused]] constexpr Copy<StorageItem const&, CopyFileOptions const&> copyWithOptions = &StorageItem::copyFile;
[[maybe_unused]] constexpr Copy<StorageItem const&, ReplacementPolicy const&> copyWithPolicy = &StorageItem::copyFile;
static_assert(std::is_same_v<decltype(&StorageItem::bufferedCopy), BufferedCopy>);
static_assert(std::is_same_v<decltype(&StorageItem::bufferedTransactionalCopy), BufferedCopy>);
static_assert(std::is_same_v<decltype(&StorageItem::copyToBuffer),
                             long (StorageItem::*)(ByteStreamDevice const&, std::vector<char>&) const>);
[[maybe_unused]] constexpr Write<ByteStreamDevice> write = &StorageItem::copyFromBuffer;
[[maybe_unused]] constexpr Write<TransactionalStreamDevice> writeScratch = &StorageItem::copyFromBuffer;

} // namespace
} // namespace foundation::storage::provider
