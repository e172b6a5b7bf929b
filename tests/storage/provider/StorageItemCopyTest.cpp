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
#include <utility>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

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

TEST_P(StorageItemCopy, OtherExceptionsOfTheStreamsPassUnchanged)
{
    for (bool const reading : {true, false}) {
        CallLog log;
        auto const provider = std::make_shared<RecordingProvider>(log);
        auto const open = [reading]() -> std::unique_ptr<ByteStream> {
            auto stream = std::make_unique<RecordingByteStream>();
            stream->onRead = readsFrom("text");
            if (reading)
                stream->onRead = throwing(std::domain_error("mine"));
            stream->onWrite = throwing(std::domain_error("mine"));
            return stream;
        };
        provider->when("doOpenReadOnlyStream", open);
        provider->when("doOpenStream", open);
        auto const other = std::make_shared<RecordingProvider>(log);
        other->when("doOpenStream", open);
        StorageItem const item(provider, StorageIRI(u"a://h/f"));
        EXPECT_THROW(item.copyFile(StorageItem(other, StorageIRI(u"b://h/f")), optionsOf(GetParam())),
                     std::domain_error);
    }
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

TEST_P(StorageItemCopy, SourceThatAnswersAnImpossibleCountIsBroken)
{
    for (long const count : {0L, -2L, static_cast<long>(chunk) + 1}) {
        CallLog log;
        auto const source = std::make_shared<RecordingProvider>(log);
        source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
            auto stream = std::make_unique<RecordingByteStream>();
            stream->onRead = [answer = count](char*, long) mutable { return std::exchange(answer, -1); };
            return stream;
        });
        TwoStores stores("");
        StorageItem const item(source, StorageIRI(u"a://h/f"));
        EXPECT_EQ(codeOfFailureAt(item, [&] { item.copyFile(stores.target, optionsOf(GetParam())); }),
                  ErrorCode::IOError)
            << count;
        EXPECT_TRUE(stores.second->files.empty());
    }
}

TEST_P(StorageItemCopy, FailureAfterTheFirstChunkLeavesATransactionalTargetAlone)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    source->when("doOpenReadOnlyStream", [&]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>();
        stream->onRead = [read = readsFrom("new", 2)](char* buffer, long count) mutable {
            long const taken = read(buffer, count);
            if (taken == 1)
                throw TestStreamFailure(ErrorCode::ResourceInUse);
            return taken;
        };
        return stream;
    });
    TwoStores stores("");
    stores.second->put(stores.target.getLocation(), "old");
    StorageItem const item(source, StorageIRI(u"a://h/f"));
    EXPECT_EQ(codeOfFailureAt(item, [&] { item.copyFile(stores.target, optionsOf(GetParam())); }), ErrorCode::IOError);
    bool const atomic = GetParam().transaction == TransactionPolicy::Atomic;
    EXPECT_EQ(stores.second->content(stores.target.getLocation()), atomic ? "old" : "ne");
    EXPECT_EQ(stores.second->files.size(), 1U);
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

TEST_P(StorageItemCopy, EmptySourceIsReadOnceAndWrittenOnce)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    source->when("doOpenReadOnlyStream",
                 [&]() -> std::unique_ptr<ByteStream> { return std::make_unique<RecordingByteStream>(log, "source"); });
    auto const target = std::make_shared<RecordingProvider>(log);
    target->when("doOpenStream",
                 [&]() -> std::unique_ptr<ByteStream> { return std::make_unique<RecordingByteStream>(log, "target"); });
    StorageItem(source, StorageIRI(u"a://h/f"))
        .copyFile(StorageItem(target, StorageIRI(u"b://h/f")), optionsOf(GetParam()));
    std::erase_if(log, [](auto const& call) { return call.starts_with("do"); });
    EXPECT_EQ(log, (CallLog{"source.read(1048576)", "target.write(0)", "target.close()", "source.close()"}));
}

TEST_P(StorageItemCopy, ModeIsThatOfTheOptionsBeforeAnybodyIsAsked)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    CopyFileOptions options = optionsOf(GetParam());
    target->when("doFileExists", [&options] {
        bool const atomic = options.transactionPolicy == TransactionPolicy::Atomic;
        options.transactionPolicy = atomic ? TransactionPolicy::NonAtomic : TransactionPolicy::Atomic;
        options.interruptFunction = stop;
        return false;
    });
    TwoStores stores("text");
    EXPECT_EQ(stores.source.copyFile(StorageItem(target, StorageIRI(u"b://h/f")), options),
              GetParam().interruptible ? TransactionStatus::Aborted : TransactionStatus::Completed);
    EXPECT_EQ(std::any_of(log.begin(), log.end(),
                          [](auto const& call) { return call.starts_with("doOpenTransactionalStream"); }),
              GetParam().transaction == TransactionPolicy::Atomic);
}

TEST_P(StorageItemCopy, BetweenProvidersTheirOwnCopiesAreNotAskedFor)
{
    CallLog log;
    auto const source = std::make_shared<RecordingProvider>(log);
    auto const target = std::make_shared<RecordingProvider>(log);
    for (auto const& provider : {source, target})
        provider->when("doHasFeature", [] { return true; });
    StorageItem(source, StorageIRI(u"a://h/f"))
        .copyFile(StorageItem(target, StorageIRI(u"b://h/f")), optionsOf(GetParam()));
    EXPECT_TRUE(std::none_of(log.begin(), log.end(), [](auto const& call) { return call.starts_with("doCopyFile"); }));
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

} // namespace
} // namespace foundation::storage::provider
