// Writing all-or-nothing, as a provider inherits it: the exact calls, and what comes of them.

#include <storage/provider/IProvider.hpp>

#include <storage/provider/Exception.hpp>
#include <storage/provider/detail/SafeByteStream.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/TestStreamFailure.hpp>
#include <tests/support/failingGetrandom.hpp>
#include <tests/support/failureOf.hpp>
#include <tests/support/inThreads.hpp>
#include <tests/support/printed.hpp>

#include <boost/uuid/entropy_error.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <mutex>
#include <set>
#include <stdexcept>
#include <string>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using fl::filesystem::upath;

StorageIRI at(std::u16string const& text)
{
    return StorageIRI(text);
}

constexpr ByteStreamOpenOptions writeOnly{};
constexpr ByteStreamOpenOptions readWrite{ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate,
                                          ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite};

class OpenTransactionalStream : public testing::Test
{
protected:
    // The scratch location that the last opening chose.
    StorageIRI scratch() const
    {
        std::string const before = "doOpenTransactionalStreamAtScratchLocation(s://h/d/t.txt, ";
        if (log.size() < 2 || !log[1].starts_with(before))
            throw std::logic_error("No scratch location was chosen.");
        std::string const text = log[1].substr(before.size(), log[1].find(',', before.size()) - before.size());
        return StorageIRI(std::u16string(text.begin(), text.end()));
    }

    StorageIRI const target = at(u"s://h/d/t.txt");
    CallLog log;
    RecordingProvider provider{log};
};

TEST_F(OpenTransactionalStream, OpensAScratchFileBesideTheTargetWithTheSameOptions)
{
    for (ByteStreamOpenOptions const& options : {writeOnly, readWrite}) {
        log.clear();
        auto const stream = provider.openTransactionalStream(target, options);
        std::string const tail = ", " + printed(options) + ")";
        std::string const name = printed(scratch());
        EXPECT_EQ(log, (CallLog{"doOpenTransactionalStream(s://h/d/t.txt" + tail,
                                "doOpenTransactionalStreamAtScratchLocation(s://h/d/t.txt, " + name + tail,
                                "doOpenStream(" + name + tail}));
    }
}

bool isScratchName(std::u16string const& name)
{
    std::string const form = "hhhhhhhh-hhhh-4hhh-vhhh-hhhhhhhhhhhh.tmp.bak"; // h: any digit, v: the variant of RFC 4122
    auto const fits = [](char16_t given, char wanted) {
        std::u16string const digits = wanted == 'h' ? u"0123456789abcdef" : u"89ab";
        return wanted == 'h' || wanted == 'v' ? digits.find(given) != std::string::npos : given == char16_t(wanted);
    };
    return std::equal(name.begin(), name.end(), form.begin(), form.end(), fits);
}

TEST_F(OpenTransactionalStream, ScratchNameIsARandomUuidAndItsEnding)
{
    std::set<std::u16string> names;
    for (int i = 0; i < 500; ++i) {
        log.clear();
        provider.openTransactionalStream(target, writeOnly);
        StorageIRI const location = scratch();
        EXPECT_EQ(location.getParent(), at(u"s://h/d"));
        names.insert(location.getName());
    }
    EXPECT_EQ(names.size(), 500u);
    for (std::u16string const& name : names)
        EXPECT_TRUE(isScratchName(name)) << testing::PrintToString(name);
}

// Keeps the scratch locations that it is asked to open, and opens none.
struct ScratchKeeper : MinimalProvider
{
    std::unique_ptr<TransactionalStream>
    doOpenTransactionalStreamAtScratchLocation(StorageIRI const&, StorageIRI const& scratch,
                                               ByteStreamOpenOptions const&) const override
    {
        std::lock_guard const lock(mutex);
        scratches.insert(scratch);
        return nullptr;
    }

    mutable std::mutex mutex;
    mutable std::set<StorageIRI> scratches;
};

TEST(ScratchLocation, StandsBesideTheTargetForEveryKindOfLocation)
{
    for (StorageIRI const& target : {at(u"s://h/t"), at(u"s://h/d%20e%2525/t?q#f"), at(u"zip:file:///x/y.zip!/t"),
                                     at(u"zip:file:///x/y.zip!/d%21/t"), StorageIRI(u"file", upath(u"/t")),
                                     StorageIRI(u"file", upath(u"/d %20/t"))})
    {
        ScratchKeeper const keeper;
        keeper.openTransactionalStream(target, writeOnly);
        ASSERT_EQ(keeper.scratches.size(), 1u);
        StorageIRI const& scratch = *keeper.scratches.begin();
        std::u16string const folder = target.getParent().getPath();
        EXPECT_TRUE(isScratchName(scratch.getName())) << scratch;
        EXPECT_EQ(scratch.getParent(), target.getParent());
        EXPECT_EQ(scratch.getPath(), (folder == u"/" ? folder : folder + u"/") + scratch.getName());
    }
}

TEST(ScratchLocationConcurrency, ThreadsThatWriteToOneTargetHaveTheirOwn)
{
    ScratchKeeper const keeper;
    StorageIRI const target(u"s://h/d/t.txt");
    inThreads(8, [&](int) {
        for (int i = 0; i < 50; ++i)
            keeper.openTransactionalStream(target, writeOnly);
    });
    EXPECT_EQ(keeper.scratches.size(), 8u * 50u);
}

TEST_F(OpenTransactionalStream, CommitClosesTheStreamAndMovesTheScratchFileOntoTheTarget)
{
    provider.when("doOpenStream",
                  [this]() -> std::unique_ptr<ByteStream> { return std::make_unique<RecordingByteStream>(log, "s"); });
    auto const stream = provider.openTransactionalStream(target, writeOnly);
    std::string const name = printed(scratch());
    log.clear();
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(log, (CallLog{"s.close()", "doMoveFile(" + name + ", s://h/d/t.txt, ReplacementPolicy::Overwrite)"}));
}

TEST_F(OpenTransactionalStream, AbortClosesTheStreamAndRemovesTheScratchFile)
{
    provider.when("doOpenStream",
                  [this]() -> std::unique_ptr<ByteStream> { return std::make_unique<RecordingByteStream>(log, "s"); });
    auto const stream = provider.openTransactionalStream(target, writeOnly);
    std::string const name = printed(scratch());
    log.clear();
    stream->close(StreamClosePolicy::Abort);
    EXPECT_EQ(log, (CallLog{"s.close()", "doRemoveFile(" + name + ")"}));
}

TEST_F(OpenTransactionalStream, DroppedStreamRemovesTheScratchFileAndSwallowsFailures)
{
    provider.fail("doRemoveFile", std::runtime_error("stuck"));
    auto stream = provider.openTransactionalStream(target, writeOnly);
    std::string const name = printed(scratch());
    log.clear();
    stream.reset();
    EXPECT_EQ(log, CallLog{"doRemoveFile(" + name + ")"});
}

TEST_F(OpenTransactionalStream, FailedCommitLeavesTheScratchFileAndCanBeTriedAgain)
{
    auto const stream = provider.openTransactionalStream(target, writeOnly);
    std::string const move = "doMoveFile(" + printed(scratch()) + ", s://h/d/t.txt, ReplacementPolicy::Overwrite)";
    log.clear();
    provider.fail("doMoveFile", Exception(ErrorCode::ResourceInUse, target));
    EXPECT_EQ(failureOf([&] { stream->close(StreamClosePolicy::Commit); }), failure(ErrorCode::ResourceInUse, target));
    EXPECT_EQ(log, CallLog{move});
    provider.when("doMoveFile", [] {});
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(log, (CallLog{move, move}));
}

TEST_F(OpenTransactionalStream, FailedCommitCanBeAborted)
{
    auto const stream = provider.openTransactionalStream(target, writeOnly);
    std::string const name = printed(scratch());
    provider.fail("doMoveFile", Exception(ErrorCode::ResourceInUse, target));
    EXPECT_THROW(stream->close(StreamClosePolicy::Commit), Exception);
    log.clear();
    stream->close(StreamClosePolicy::Abort);
    EXPECT_EQ(log, CallLog{"doRemoveFile(" + name + ")"});
}

TEST_F(OpenTransactionalStream, IsReadableWhenThatWasAskedForAndNotElse)
{
    for (ByteStreamOpenOptions const& options : {writeOnly, readWrite}) {
        provider.when("doOpenStream", []() -> std::unique_ptr<ByteStream> {
            auto stream = std::make_unique<RecordingByteStream>();
            stream->onRead = readsFrom("data");
            return stream;
        });
        auto const stream = provider.openTransactionalStream(target, options);
        char buffer[8];
        EXPECT_EQ(stream->read(buffer, 8), options.access == ByteStreamAccess::ReadWrite ? 4 : -1);
        EXPECT_EQ(stream->write("abc", 3), 3);
        EXPECT_NE(dynamic_cast<detail::SafeByteStream*>(stream->byteStream()), nullptr);
    }
}

TEST_F(OpenTransactionalStream, FailureToOpenTheScratchFilePassesUnchangedAndNothingIsCleanedUp)
{
    provider.fail("doOpenStream", Exception(ErrorCode::ResourceNotFound, at(u"s://h/d")));
    EXPECT_EQ(failureOf([&] { provider.openTransactionalStream(target, writeOnly); }),
              failure(ErrorCode::ResourceNotFound, at(u"s://h/d")));
    EXPECT_EQ(log.size(), 3u);
    provider.fail("doOpenStream", TestStreamFailure(ErrorCode::IOError));
    EXPECT_THROW(provider.openTransactionalStream(target, writeOnly), TestStreamFailure);
}

TEST_F(OpenTransactionalStream, AtALocationWithoutAParentFailsAsItsParentDoesBeforeAnythingElse)
{
    FailingGetrandom const failing({ENOSYS});
    EXPECT_THROW(provider.openTransactionalStream(at(u"s://h/"), writeOnly), std::logic_error);
    EXPECT_FALSE(failing.hasFailed()) << "a name was made";
    EXPECT_EQ(log.size(), 1u);
}

TEST_F(OpenTransactionalStream, OverriddenScratchPlaceIsUsed)
{
    struct Elsewhere : MinimalProvider
    {
        std::unique_ptr<TransactionalStream>
        doOpenTransactionalStreamAtScratchLocation(StorageIRI const& target, StorageIRI const& scratch,
                                                   ByteStreamOpenOptions const& options) const override
        {
            StorageIRI const hidden(StorageIRI(u"s://h/hidden"), scratch.getName());
            return MinimalProvider::doOpenTransactionalStreamAtScratchLocation(target, hidden, options);
        }
    };
    Elsewhere store;
    store.folders = {at(u"s://h/d"), at(u"s://h/hidden")};
    auto const stream = store.openTransactionalStream(target, writeOnly);
    ASSERT_EQ(store.files.size(), 1u);
    EXPECT_EQ(store.files.begin()->first.getParent(), at(u"s://h/hidden"));
    stream->write("abc", 3);
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(store.content(target), "abc");
    EXPECT_EQ(store.files.size(), 1u);
}

TEST_F(OpenTransactionalStream, WithoutRandomnessFailsBeforeAnyFileIsTouched)
{
    FailingGetrandom const failing({ENOSYS});
    try {
        provider.openTransactionalStream(target, writeOnly);
        FAIL() << "nothing was thrown";
    } catch (boost::uuids::entropy_error const& error) {
        EXPECT_STREQ(error.what(), "getrandom");
        EXPECT_EQ(error.errcode(), static_cast<boost::uint32_t>(ENOSYS));
    }
    EXPECT_EQ(log.size(), 1u);
}

TEST_F(OpenTransactionalStream, InterruptedRequestForRandomnessIsRepeated)
{
    FailingGetrandom const failing({EINTR, EINTR});
    EXPECT_NE(provider.openTransactionalStream(target, writeOnly), nullptr);
    EXPECT_TRUE(failing.hasFailed());
}

// The same over a real store.
class TransactionalWrite : public testing::Test
{
protected:
    TransactionalWrite() { store.folders = {target.getParent()}; }

    StorageIRI const target = at(u"s://h/d/t.txt");
    MinimalProvider store;
};

TEST_F(TransactionalWrite, CommitReplacesTheTargetWhateverTheOptions)
{
    for (ByteStreamOpenOptions const& options :
         {writeOnly, ByteStreamOpenOptions{{}, {}, {}, ByteStreamAppend::Append}}) {
        store.put(target, "old");
        auto const stream = store.openTransactionalStream(target, options);
        stream->write("new content", 11);
        EXPECT_EQ(store.content(target), "old");
        stream->close(StreamClosePolicy::Commit);
        EXPECT_EQ(store.content(target), "new content");
        EXPECT_EQ(store.files.size(), 1u);
    }
}

TEST_F(TransactionalWrite, AbortAndDropLeaveTheTargetAndNoScratchFile)
{
    store.put(target, "old");
    for (bool const drop : {false, true}) {
        auto stream = store.openTransactionalStream(target, writeOnly);
        stream->write("new", 3);
        EXPECT_EQ(store.files.size(), 2u);
        if (!drop)
            stream->close(StreamClosePolicy::Abort);
        stream.reset();
        EXPECT_EQ(store.content(target), "old");
        EXPECT_EQ(store.files.size(), 1u);
    }
}

TEST_F(TransactionalWrite, TwoAtOnceHaveTheirOwnScratchFilesAndTheLaterCommitWins)
{
    auto const first = store.openTransactionalStream(target, writeOnly);
    auto const second = store.openTransactionalStream(target, writeOnly);
    EXPECT_EQ(store.files.size(), 2u);
    second->write("second", 6);
    first->write("first", 5);
    second->close(StreamClosePolicy::Commit);
    EXPECT_EQ(store.content(target), "second");
    first->close(StreamClosePolicy::Commit);
    EXPECT_EQ(store.content(target), "first");
    EXPECT_EQ(store.files.size(), 1u);
}

TEST_F(TransactionalWrite, MissingFolderIsReportedByTheStore)
{
    store.folders.clear();
    EXPECT_THROW(store.openTransactionalStream(target, writeOnly), Exception);
    EXPECT_TRUE(store.files.empty());
}

} // namespace
} // namespace foundation::storage::provider
