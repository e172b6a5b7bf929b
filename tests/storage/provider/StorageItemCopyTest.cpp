#include <storage/provider/StorageItem.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/TestStreamFailure.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

constexpr std::size_t chunk = 1048576;

InterruptSignal goOn()
{
    return InterruptSignal::Continue;
}

InterruptSignal stop()
{
    return InterruptSignal::Abort;
}

struct Mode
{
    char const* name;
    TransactionPolicy transaction;
    bool interruptible;
};

constexpr Mode modes[] = {
    {"TransactionalInterruptible", TransactionPolicy::Atomic, true},
    {"PlainInterruptible", TransactionPolicy::NonAtomic, true},
    {"Transactional", TransactionPolicy::Atomic, false},
    {"Plain", TransactionPolicy::NonAtomic, false},
};

CopyFileOptions optionsOf(Mode const& mode, ReplacementPolicy policy = ReplacementPolicy::Overwrite)
{
    return {policy, mode.transaction, mode.interruptible ? goOn : std::function<InterruptSignal()>()};
}

std::string patterned(std::size_t size)
{
    std::string text(size, '\0');
    for (std::size_t i = 0; i != size; ++i)
        text[i] = static_cast<char>('a' + i % 23);
    return text;
}

/// Two stores, and a file in the first that is to be copied to the second.
struct TwoStores
{
    explicit TwoStores(std::string content)
    {
        first->folders.insert(StorageIRI(u"a://h/"));
        second->folders.insert(StorageIRI(u"b://h/"));
        first->put(source.getLocation(), std::move(content));
    }

    std::shared_ptr<MinimalProvider> first = std::make_shared<MinimalProvider>();
    std::shared_ptr<MinimalProvider> second = std::make_shared<MinimalProvider>();
    StorageItem source{first, StorageIRI(u"a://h/source")};
    StorageItem target{second, StorageIRI(u"b://h/target")};
};

/// The code of the failure, which must name `location`.
template <typename Action>
ErrorCode codeOfFailureAt(StorageItem const& item, Action const& action)
{
    try {
        action();
    } catch (Exception const& error) {
        EXPECT_EQ(error.getStorageIRI(), item.getLocation());
        return error.getErrorCode();
    }
    ADD_FAILURE() << "no failure";
    return ErrorCode::Unknown;
}

class StorageItemCopy : public testing::TestWithParam<Mode>
{};

TEST_P(StorageItemCopy, CopiesBetweenProvidersWhateverTheSize)
{
    for (std::size_t const size : {std::size_t{0}, std::size_t{1}, chunk - 1, chunk, chunk + 1, 3 * chunk + 5}) {
        TwoStores stores(patterned(size));
        EXPECT_EQ(stores.source.copyFile(stores.target, optionsOf(GetParam())), TransactionStatus::Completed);
        EXPECT_EQ(stores.second->content(stores.target.getLocation()), patterned(size)) << size;
        EXPECT_EQ(stores.second->files.size(), 1U);
    }
}

TEST_P(StorageItemCopy, ReplacesAnExistingFileWhole)
{
    for (ReplacementPolicy const policy : {ReplacementPolicy::Overwrite, ReplacementPolicy::Clobber}) {
        for (std::string const content : {"", "new"}) {
            TwoStores stores(content);
            stores.second->put(stores.target.getLocation(), "old and longer");
            EXPECT_EQ(stores.source.copyFile(stores.target, optionsOf(GetParam(), policy)),
                      TransactionStatus::Completed);
            EXPECT_EQ(stores.second->content(stores.target.getLocation()), content);
        }
    }
}

TEST_P(StorageItemCopy, PreservingPolicyRefusesAnExistingFile)
{
    for (ReplacementPolicy const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber}) {
        TwoStores stores("new");
        stores.second->put(stores.target.getLocation(), "old");
        EXPECT_EQ(codeOfFailureAt(stores.target,
                                  [&] { stores.source.copyFile(stores.target, optionsOf(GetParam(), policy)); }),
                  ErrorCode::ResourceAlreadyExists);
        EXPECT_EQ(stores.second->content(stores.target.getLocation()), "old");
    }
}

TEST_P(StorageItemCopy, PreservingPolicyWritesAMissingFile)
{
    for (ReplacementPolicy const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber}) {
        TwoStores stores("new");
        stores.source.copyFile(stores.target, optionsOf(GetParam(), policy));
        EXPECT_EQ(stores.second->content(stores.target.getLocation()), "new");
    }
}

TEST_P(StorageItemCopy, ExistingFolderIsRefusedWhateverThePolicy)
{
    for (int policy = 0; policy != 4; ++policy) {
        TwoStores stores("new");
        stores.second->folders.insert(stores.target.getLocation());
        CopyFileOptions const options = optionsOf(GetParam(), static_cast<ReplacementPolicy>(policy));
        EXPECT_EQ(codeOfFailureAt(stores.target, [&] { stores.source.copyFile(stores.target, options); }),
                  ErrorCode::ResourceAlreadyExists);
    }
}

TEST_P(StorageItemCopy, RefusalOpensNoStream)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    auto const target = std::make_shared<RecordingProvider>(log);
    target->when("doFileExists", [] { return true; });
    EXPECT_THROW(
        StorageItem(source, StorageIRI(u"a://h/f"))
            .copyFile(StorageItem(target, StorageIRI(u"b://h/f")), optionsOf(GetParam(), ReplacementPolicy::Preserve)),
        Exception);
    EXPECT_EQ(log, CallLog{"doFileExists(b://h/f)"});
}

TEST_P(StorageItemCopy, SourceThatCannotBeReadLeavesTheTargetAlone)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    auto const target = std::make_shared<RecordingProvider>(log);
    source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>();
        stream->onRead = throwing(TestStreamFailure(ErrorCode::PermissionDenied));
        return stream;
    });
    StorageItem const item(source, StorageIRI(u"a://h/f"));
    EXPECT_EQ(codeOfFailureAt(
                  item, [&] { item.copyFile(StorageItem(target, StorageIRI(u"b://h/f")), optionsOf(GetParam())); }),
              ErrorCode::IOError);
    EXPECT_EQ(log, (CallLog{"doFileExists(b://h/f)", "doFolderExists(b://h/f)", "doOpenReadOnlyStream(a://h/f)"}));
}

TEST_P(StorageItemCopy, FailureToOpenTheSourceNamesItWithItsOwnCode)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    source->fail("doOpenReadOnlyStream", TestStreamFailure(ErrorCode::ResourceInUse));
    TwoStores stores("");
    StorageItem const item(source, StorageIRI(u"a://h/f"));
    EXPECT_EQ(codeOfFailureAt(item, [&] { item.copyFile(stores.target, optionsOf(GetParam())); }),
              ErrorCode::ResourceInUse);
}

TEST_P(StorageItemCopy, FailureToOpenTheTargetNamesTheSourceWithItsOwnCode)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    target->fail("doOpenStream", TestStreamFailure(ErrorCode::NoSpaceLeft));
    TwoStores stores("text");
    StorageItem const destination(target, StorageIRI(u"b://h/f"));
    EXPECT_EQ(codeOfFailureAt(stores.source, [&] { stores.source.copyFile(destination, optionsOf(GetParam())); }),
              ErrorCode::NoSpaceLeft);
}

TEST_P(StorageItemCopy, OtherExceptionsPassUnchanged)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    source->fail("doOpenReadOnlyStream", std::domain_error("mine"));
    TwoStores stores("");
    EXPECT_THROW(StorageItem(source, StorageIRI(u"a://h/f")).copyFile(stores.target, optionsOf(GetParam())),
                 std::domain_error);
}

TEST_P(StorageItemCopy, FailureToCloseTheSourceIsSwallowed)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>(log, "source");
        stream->onRead = readsFrom("text");
        stream->onClose = [] { throw TestStreamFailure(ErrorCode::IOError); };
        return stream;
    });
    TwoStores stores("");
    StorageItem const item(source, StorageIRI(u"a://h/f"));
    EXPECT_EQ(item.copyFile(stores.target, optionsOf(GetParam())), TransactionStatus::Completed);
    EXPECT_EQ(stores.second->content(stores.target.getLocation()), "text");
    EXPECT_EQ(std::count(log.begin(), log.end(), "source.close()"), 1);
}

TEST_P(StorageItemCopy, StreamThatAnswersZeroIsBroken)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>();
        stream->onRead = [](char*, long) { return 0L; };
        return stream;
    });
    TwoStores stores("");
    StorageItem const item(source, StorageIRI(u"a://h/f"));
    EXPECT_EQ(codeOfFailureAt(item, [&] { item.copyFile(stores.target, optionsOf(GetParam())); }), ErrorCode::IOError);
    EXPECT_TRUE(stores.second->files.empty());
}

struct WriteOutcome
{
    char const* name;
    std::function<long(char const*, long)> onWrite;
};

TEST_P(StorageItemCopy, WriteThatTakesLessThanAllFailsAndCommitsNothing)
{
    WriteOutcome const outcomes[] = {
        {"short", [](char const*, long count) { return count - 1; }},
        {"zero", [](char const*, long) { return 0L; }},
        {"minus one", [](char const*, long) { return -1L; }},
        {"failure", throwing(TestStreamFailure(ErrorCode::NoSpaceLeft))},
    };
    for (WriteOutcome const& outcome : outcomes) {
        SCOPED_TRACE(outcome.name);
        CallLog log;
        auto const target = std::make_shared<RecordingProvider>(log);
        target->when("doOpenStream", [&]() -> std::unique_ptr<ByteStream> {
            auto stream = std::make_unique<RecordingByteStream>();
            stream->onWrite = outcome.onWrite;
            return stream;
        });
        TwoStores stores("text");
        StorageItem const destination(target, StorageIRI(u"b://h/f"));
        EXPECT_EQ(codeOfFailureAt(destination, [&] { stores.source.copyFile(destination, optionsOf(GetParam())); }),
                  ErrorCode::IOError);
        bool const moved =
            std::any_of(log.begin(), log.end(), [](auto const& call) { return call.starts_with("doMove"); });
        bool const removed =
            std::any_of(log.begin(), log.end(), [](auto const& call) { return call.starts_with("doRemoveFile"); });
        EXPECT_FALSE(moved);
        EXPECT_EQ(removed, GetParam().transaction == TransactionPolicy::Atomic);
    }
}

TEST_P(StorageItemCopy, EachChunkIsOneReadAndOneWriteOfAMebibyte)
{
    CallLog log;
    auto const provider = std::make_shared<RecordingProvider>(log);
    provider->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>(log, "source");
        stream->onRead = readsFrom(patterned(chunk + 3));
        return stream;
    });
    auto const target = std::make_shared<RecordingProvider>(log);
    target->when("doOpenStream",
                 [&]() -> std::unique_ptr<ByteStream> { return std::make_unique<RecordingByteStream>(log, "target"); });
    StorageItem(provider, StorageIRI(u"a://h/f"))
        .copyFile(StorageItem(target, StorageIRI(u"b://h/f")), optionsOf(GetParam()));
    std::erase_if(log, [](auto const& call) { return call.starts_with("do"); });
    EXPECT_EQ(log, (CallLog{"source.read(1048576)", "target.write(1048576)", "source.read(1048576)", "target.write(3)",
                            "source.read(1048576)", "target.close()", "source.close()"}));
}

TEST_P(StorageItemCopy, OpensTheDestinationForReadingAndWritingFromTheStart)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    TwoStores stores("text");
    stores.source.copyFile(StorageItem(target, StorageIRI(u"b://h/f")), optionsOf(GetParam()));
    std::string const options = "ByteStreamOpenOptions: {ByteStreamAccess::ReadWrite, ByteStreamCreate::Create, "
                                "ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite}";
    std::string const opening =
        GetParam().transaction == TransactionPolicy::Atomic ? "doOpenTransactionalStream" : "doOpenStream";
    EXPECT_EQ(std::count(log.begin(), log.end(), opening + "(b://h/f, " + options + ")"), 1);
}

INSTANTIATE_TEST_SUITE_P(Modes, StorageItemCopy, testing::ValuesIn(modes),
                         [](auto const& tested) { return std::string(tested.param.name); });

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

TEST(StorageItemBufferedCopy, FailureToCloseAPlainDestinationIsSwallowed)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    target->when("doOpenStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>(log, "target");
        stream->onClose = [] { throw TestStreamFailure(ErrorCode::IOError); };
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

} // namespace
} // namespace foundation::storage::provider
