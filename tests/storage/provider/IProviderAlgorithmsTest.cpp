// What a provider inherits that is composed of its own operations: the exact calls, and what comes of them.

#include <storage/provider/IProvider.hpp>

#include <storage/provider/Exception.hpp>
#include <storage/provider/detail/GenericTransactionalStream.hpp>
#include <storage/provider/detail/SafeByteStream.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/TestStreamFailure.hpp>
#include <tests/support/failingGetrandom.hpp>
#include <tests/support/failureOf.hpp>
#include <tests/support/printed.hpp>

#include <boost/uuid/entropy_error.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <functional>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

StorageIRI at(std::u16string const& text)
{
    return StorageIRI(text);
}

class CreateFolderRecursive : public testing::Test
{
protected:
    void folderExists(std::string const& text)
    {
        provider.when("doFolderExists(" + text + ")", [] { return true; });
    }

    // The calls that creating a folder leads to, after the first.
    CallLog callsFor(std::u16string const& text)
    {
        provider.createFolderRecursive(at(text));
        return CallLog(log.begin() + 1, log.end());
    }

    CallLog log;
    RecordingProvider provider{log};
};

TEST_F(CreateFolderRecursive, WithAParentCreatesTheFolderAlone)
{
    folderExists("s://h/a");
    EXPECT_EQ(callsFor(u"s://h/a/b"), (CallLog{"doFolderExists(s://h/a)", "doCreateFolder(s://h/a/b)"}));
}

TEST_F(CreateFolderRecursive, CreatesMissingAncestorsFromTheOutermost)
{
    folderExists("s://h/a");
    EXPECT_EQ(callsFor(u"s://h/a/b/c/d"),
              (CallLog{"doFolderExists(s://h/a/b/c)", "doFolderExists(s://h/a/b/c)", "doFolderExists(s://h/a/b)",
                       "doFolderExists(s://h/a)", "doCreateFolder(s://h/a/b)", "doCreateFolder(s://h/a/b/c)",
                       "doCreateFolder(s://h/a/b/c/d)"}));
}

TEST_F(CreateFolderRecursive, WalksUpToTheRoot)
{
    folderExists("s://h/");
    EXPECT_EQ(callsFor(u"s://h/a/b"),
              (CallLog{"doFolderExists(s://h/a)", "doFolderExists(s://h/a)", "doFolderExists(s://h/)",
                       "doCreateFolder(s://h/a)", "doCreateFolder(s://h/a/b)"}));
}

TEST_F(CreateFolderRecursive, ExistingFolderIsNotAskedForAndTheProviderDecides)
{
    folderExists("s://h/a");
    folderExists("s://h/a/b");
    provider.fail("doCreateFolder(s://h/a/b)", Exception(ErrorCode::ResourceAlreadyExists, at(u"s://h/a/b")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b")); }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"s://h/a/b")));
    EXPECT_EQ(log,
              (CallLog{"doCreateFolderRecursive(s://h/a/b)", "doFolderExists(s://h/a)", "doCreateFolder(s://h/a/b)"}));
}

TEST_F(CreateFolderRecursive, OfAnExistingRootIsRefused)
{
    folderExists("s://h/");
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/")); }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"s://h/")));
    EXPECT_EQ(log, (CallLog{"doCreateFolderRecursive(s://h/)", "doFolderExists(s://h/)"}));
}

TEST_F(CreateFolderRecursive, OfAMissingRootIsRefused)
{
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/")); }),
              failure(ErrorCode::ResourceNotFound, at(u"s://h/")));
    EXPECT_EQ(log, (CallLog{"doCreateFolderRecursive(s://h/)", "doFolderExists(s://h/)"}));
}

TEST_F(CreateFolderRecursive, WithoutAnyAncestorIsInvalidAndCreatesNothing)
{
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b")); }),
              failure(ErrorCode::InvalidLocation, at(u"s://h/a/b")));
    EXPECT_EQ(log, (CallLog{"doCreateFolderRecursive(s://h/a/b)", "doFolderExists(s://h/a)", "doFolderExists(s://h/a)",
                            "doFolderExists(s://h/)"}));
}

TEST_F(CreateFolderRecursive, OfALocationThatHasNoParentAfterAllIsInvalid)
{
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h")); }),
              failure(ErrorCode::InvalidLocation, at(u"s://h")));
    EXPECT_EQ(log, CallLog{"doCreateFolderRecursive(s://h)"});
}

TEST_F(CreateFolderRecursive, LogicErrorDuringTheWalkIsInvalid)
{
    provider.fail("doFolderExists(s://h/a)", std::out_of_range("confused"));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b/c")); }),
              failure(ErrorCode::InvalidLocation, at(u"s://h/a/b/c")));
}

TEST_F(CreateFolderRecursive, OtherFailuresOfTheWalkPassUnchanged)
{
    provider.fail("doFolderExists(s://h/a)", Exception(ErrorCode::PermissionDenied, at(u"s://h/a")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b/c")); }),
              failure(ErrorCode::PermissionDenied, at(u"s://h/a")));
    provider.fail("doFolderExists(s://h/a)", std::runtime_error("offline"));
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b/c")), std::runtime_error);
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b")), std::runtime_error);
}

TEST_F(CreateFolderRecursive, FailureForAnAncestorKeepsItsCodeAndNamesTheFolderAskedFor)
{
    folderExists("s://h/a");
    provider.fail("doCreateFolder(s://h/a/b/c)", Exception(ErrorCode::NoSpaceLeft, at(u"s://h/a/b/c")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b/c/d")); }),
              failure(ErrorCode::NoSpaceLeft, at(u"s://h/a/b/c/d")));
    EXPECT_EQ(log.back(), "doCreateFolder(s://h/a/b/c)") << "nothing is undone, and nothing more is created";
}

TEST_F(CreateFolderRecursive, FailureInTheOneLevelCasePassesUnchanged)
{
    folderExists("s://h/a");
    provider.fail("doCreateFolder", Exception(ErrorCode::NoSpaceLeft, at(u"s://elsewhere/")));
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"s://h/a/b")); }),
              failure(ErrorCode::NoSpaceLeft, at(u"s://elsewhere/")));
}

TEST_F(CreateFolderRecursive, OtherExceptionsOfCreationPassUnchanged)
{
    folderExists("s://h/a");
    provider.fail("doCreateFolder(s://h/a/b)", std::logic_error("confused"));
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b/c")), std::logic_error);
    provider.fail("doCreateFolder(s://h/a/b)", 42);
    EXPECT_THROW(provider.createFolderRecursive(at(u"s://h/a/b/c")), int);
}

TEST_F(CreateFolderRecursive, FoldersCreatedBeforeAFailureStay)
{
    struct Short : MinimalProvider
    {
        void doCreateFolder(StorageIRI const& iri) const override
        {
            if (folders.size() == 3)
                throw Exception(ErrorCode::NoSpaceLeft, iri);
            MinimalProvider::doCreateFolder(iri);
        }
    };
    Short store;
    store.folders = {at(u"s://h/")};
    EXPECT_EQ(failureOf([&] { store.createFolderRecursive(at(u"s://h/a/b/c")); }),
              failure(ErrorCode::NoSpaceLeft, at(u"s://h/a/b/c")));
    EXPECT_EQ(store.folders, (std::set{at(u"s://h/"), at(u"s://h/a"), at(u"s://h/a/b")}));
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

bool isScratchName(std::string const& name)
{
    std::string const form = "hhhhhhhh-hhhh-4hhh-vhhh-hhhhhhhhhhhh.tmp.bak"; // h: any digit, v: the variant of RFC 4122
    auto const fits = [](char given, char wanted) {
        std::string const digits = wanted == 'h' ? "0123456789abcdef" : "89ab";
        return wanted == 'h' || wanted == 'v' ? digits.find(given) != std::string::npos : given == wanted;
    };
    return std::equal(name.begin(), name.end(), form.begin(), form.end(), fits);
}

TEST_F(OpenTransactionalStream, ScratchNameIsARandomUuidAndItsEnding)
{
    std::set<std::string> names;
    for (int i = 0; i < 500; ++i) {
        log.clear();
        provider.openTransactionalStream(target, writeOnly);
        StorageIRI const location = scratch();
        EXPECT_EQ(location.getParent(), at(u"s://h/d"));
        names.emplace(location.getName().begin(), location.getName().end());
    }
    EXPECT_EQ(names.size(), 500u);
    for (std::string const& name : names)
        EXPECT_TRUE(isScratchName(name)) << name;
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

TEST_F(OpenTransactionalStream, CanBeReadOnlyWhenAskedFor)
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

TEST_F(OpenTransactionalStream, AtALocationWithoutAParentFailsAsItsParentDoesAndTouchesNothing)
{
    EXPECT_THROW(provider.openTransactionalStream(at(u"s://h/"), writeOnly), std::logic_error);
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

char const* const openTarget = "doOpenStream(s://h/b, ByteStreamOpenOptions: {ByteStreamAccess::ReadWrite, "
                               "ByteStreamCreate::Create, ByteStreamTruncate::TruncateExisting, "
                               "ByteStreamAppend::Overwrite})";

class CopyFile : public testing::Test
{
protected:
    CopyFile()
    {
        provider.when("doOpenReadOnlyStream", [this] { return open("source", onSource); });
        provider.when("doOpenStream", [this] { return open("target", onTarget); });
    }

    std::unique_ptr<ByteStream> open(char const* name, std::function<void(RecordingByteStream&)> const& prepare)
    {
        auto stream = std::make_unique<RecordingByteStream>(log, name);
        stream->onDestruction = [this] { ++destroyed; };
        prepare(*stream);
        return stream;
    }

    void copy(ReplacementPolicy const& policy = ReplacementPolicy::Overwrite) { provider.copyFile(from, to, policy); }

    // What was asked of the streams.
    CallLog streamCalls() const
    {
        CallLog calls;
        for (std::string const& call : log) {
            if (call.starts_with("source.") || call.starts_with("target."))
                calls.push_back(call);
        }
        return calls;
    }

    StorageIRI const from = at(u"s://h/a");
    StorageIRI const to = at(u"s://h/b");
    CallLog log;
    int destroyed = 0;
    std::string written;
    std::function<void(RecordingByteStream&)> onSource = [](RecordingByteStream& stream) {
        stream.onRead = readsFrom("abc");
    };
    std::function<void(RecordingByteStream&)> onTarget = [this](RecordingByteStream& stream) {
        stream.onWrite = writesTo(written);
    };
    RecordingProvider provider{log};
};

TEST_F(CopyFile, AsksThenOpensThenCopiesThenClosesInThisOrder)
{
    copy();
    EXPECT_EQ(log, (CallLog{"doCopyFile(s://h/a, s://h/b, ReplacementPolicy::Overwrite)", "doFileExists(s://h/b)",
                            "doFolderExists(s://h/b)", "doOpenReadOnlyStream(s://h/a)", openTarget, "source.read(4096)",
                            "target.write(3)", "source.read(4096)", "source.close()", "target.close()"}));
    EXPECT_EQ(written, "abc");
    EXPECT_EQ(destroyed, 2);
}

TEST_F(CopyFile, ExistingFileIsKeptByPreserveAndNoClobber)
{
    provider.when("doFileExists(s://h/b)", [] { return true; });
    for (ReplacementPolicy const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber}) {
        log.clear();
        EXPECT_EQ(failureOf([&] { copy(policy); }), failure(ErrorCode::ResourceAlreadyExists, to));
        EXPECT_EQ(CallLog(log.begin() + 1, log.end()), CallLog{"doFileExists(s://h/b)"});
    }
}

TEST_F(CopyFile, ExistingFileIsReplacedByOverwriteAndClobber)
{
    provider.when("doFileExists(s://h/b)", [] { return true; });
    for (ReplacementPolicy const policy : {ReplacementPolicy::Overwrite, ReplacementPolicy::Clobber}) {
        written.clear();
        copy(policy);
        EXPECT_EQ(written, "abc");
    }
}

TEST_F(CopyFile, MissingTargetIsCopiedToUnderEveryPolicy)
{
    for (int policy = 0; policy < 4; ++policy) {
        written.clear();
        log.clear();
        copy(static_cast<ReplacementPolicy>(policy));
        EXPECT_EQ(written, "abc");
        EXPECT_EQ(log[1], "doFileExists(s://h/b)");
        EXPECT_EQ(log[2], "doFolderExists(s://h/b)");
    }
}

TEST_F(CopyFile, FolderIsNeverReplacedWhateverThePolicyAndWhateverElseIsThere)
{
    provider.when("doFolderExists(s://h/b)", [] { return true; });
    for (bool const fileToo : {false, true}) {
        provider.when("doFileExists(s://h/b)", [fileToo] { return fileToo; });
        for (int policy = 0; policy < 4; ++policy) {
            log.clear();
            EXPECT_EQ(failureOf([&] { copy(static_cast<ReplacementPolicy>(policy)); }),
                      failure(ErrorCode::ResourceAlreadyExists, to));
            for (std::string const& call : log)
                EXPECT_EQ(call.find("Stream"), std::string::npos) << call;
        }
    }
}

TEST_F(CopyFile, FailureOfAQuestionPassesUnchanged)
{
    provider.fail("doFolderExists", Exception(ErrorCode::PermissionDenied, to));
    EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::PermissionDenied, to));
    provider.fail("doFileExists", std::runtime_error("offline"));
    EXPECT_THROW(copy(), std::runtime_error);
}

TEST_F(CopyFile, FailureToOpenTheSourcePassesUnchangedAndTheTargetIsNotOpened)
{
    provider.fail("doOpenReadOnlyStream", TestStreamFailure(ErrorCode::PermissionDenied));
    EXPECT_THROW(copy(), TestStreamFailure);
    EXPECT_EQ(log.back(), "doOpenReadOnlyStream(s://h/a)");
    provider.fail("doOpenReadOnlyStream", Exception(ErrorCode::ResourceNotFound, from));
    EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::ResourceNotFound, from));
}

TEST_F(CopyFile, FailureToOpenTheTargetPassesUnchangedAndTheSourceIsReleased)
{
    provider.fail("doOpenStream", TestStreamFailure(ErrorCode::NoSpaceLeft));
    EXPECT_THROW(copy(), TestStreamFailure);
    EXPECT_EQ(log.back(), openTarget);
    EXPECT_EQ(destroyed, 1);
    provider.fail("doOpenStream", Exception(ErrorCode::PermissionDenied, to));
    EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::PermissionDenied, to));
}

TEST_F(CopyFile, CopiesInChunksOf4096Bytes)
{
    std::string const content = std::string(4096, 'x') + std::string(4096, 'y') + "z";
    onSource = [&](RecordingByteStream& stream) { stream.onRead = readsFrom(content); };
    copy();
    EXPECT_EQ(streamCalls(), (CallLog{"source.read(4096)", "target.write(4096)", "source.read(4096)",
                                      "target.write(4096)", "source.read(4096)", "target.write(1)", "source.read(4096)",
                                      "source.close()", "target.close()"}));
    EXPECT_EQ(written, content);
}

TEST_F(CopyFile, ShortReadsAreWrittenAsTheyCome)
{
    onSource = [](RecordingByteStream& stream) { stream.onRead = readsFrom("abcde", 2); };
    copy();
    EXPECT_EQ(streamCalls(), (CallLog{"source.read(4096)", "target.write(2)", "source.read(4096)", "target.write(2)",
                                      "source.read(4096)", "target.write(1)", "source.read(4096)", "source.close()",
                                      "target.close()"}));
    EXPECT_EQ(written, "abcde");
}

TEST_F(CopyFile, ShortWritesAreResumed)
{
    onTarget = [this](RecordingByteStream& stream) { stream.onWrite = writesTo(written, 2); };
    onSource = [](RecordingByteStream& stream) { stream.onRead = readsFrom("abcde"); };
    copy();
    EXPECT_EQ(streamCalls(), (CallLog{"source.read(4096)", "target.write(5)", "target.write(3)", "target.write(1)",
                                      "source.read(4096)", "source.close()", "target.close()"}));
    EXPECT_EQ(written, "abcde");
}

TEST_F(CopyFile, WriteThatAnswersMinusOneAbandonsTheRestOfTheChunkAlone)
{
    onSource = [](RecordingByteStream& stream) { stream.onRead = readsFrom("abcdef", 3); };
    onTarget = [this](RecordingByteStream& stream) {
        stream.onWrite = [this, calls = 0](char const* data, long) mutable {
            if (++calls == 2)
                return -1L;
            written.append(data, 1);
            return 1L;
        };
    };
    copy();
    EXPECT_EQ(streamCalls(), (CallLog{"source.read(4096)", "target.write(3)", "target.write(2)", "source.read(4096)",
                                      "target.write(3)", "target.write(2)", "target.write(1)", "source.read(4096)",
                                      "source.close()", "target.close()"}));
    EXPECT_EQ(written, "adef");
}

TEST_F(CopyFile, EmptySourceGivesAnEmptyTarget)
{
    onSource = [](RecordingByteStream& stream) { stream.onRead = readsFrom(""); };
    copy();
    EXPECT_EQ(streamCalls(), (CallLog{"source.read(4096)", "source.close()", "target.close()"}));
}

TEST_F(CopyFile, StreamThatAnswersAnImpossibleCountFailsNamingTheSource)
{
    for (long const count : {0L, -2L, 4097L}) {
        log.clear();
        onSource = [count](RecordingByteStream& stream) { stream.onRead = [count](char*, long) { return count; }; };
        EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::IOError, from));
        EXPECT_EQ(streamCalls(), (CallLog{"source.read(4096)", "source.close()", "target.close()"})) << count;
    }
    onSource = [](RecordingByteStream& stream) { stream.onRead = readsFrom("abc"); };
    for (long const count : {0L, -2L, 4L}) {
        log.clear();
        onTarget = [count](RecordingByteStream& stream) {
            stream.onWrite = [count](char const*, long) { return count; };
        };
        EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::IOError, from));
        EXPECT_EQ(streamCalls(), (CallLog{"source.read(4096)", "target.write(3)", "source.close()", "target.close()"}))
            << count;
    }
}

struct Failing
{
    char const* what;
    std::function<void(RecordingByteStream& source, RecordingByteStream& target)> with;
    CallLog calls;
};

// What can fail in a copy of one chunk.
template <class Error>
std::vector<Failing> everyFailureOf(Error const& error)
{
    return {
        {"read",
         [=](auto& source, auto&) { source.onRead = throwing(error); },
         {"source.read(4096)", "source.close()", "target.close()"}},
        {"second read",
         [=](auto& source, auto&) {
             source.onRead = [=, calls = 0](char*, long) mutable {
                 if (++calls == 2)
                     throw error;
                 return 3L;
             };
         },
         {"source.read(4096)", "target.write(3)", "source.read(4096)", "source.close()", "target.close()"}},
        {"write",
         [=](auto&, auto& target) { target.onWrite = throwing(error); },
         {"source.read(4096)", "target.write(3)", "source.close()", "target.close()"}},
        {"close of the source",
         [=](auto& source, auto&) { source.onClose = throwing(error); },
         {"source.read(4096)", "target.write(3)", "source.read(4096)", "source.close()", "target.close()"}},
        {"close of the target",
         [=](auto&, auto& target) { target.onClose = throwing(error); },
         {"source.read(4096)", "target.write(3)", "source.read(4096)", "source.close()", "target.close()"}},
    };
}

class FailingCopy : public CopyFile
{
protected:
    // Lets a copy fail as `failing` says, and answers what was asked of the streams.
    template <class Check>
    void runWith(Failing const& failing, Check const& check)
    {
        log.clear();
        destroyed = 0;
        RecordingByteStream* source = nullptr;
        onSource = [&source](RecordingByteStream& stream) {
            stream.onRead = readsFrom("abc");
            source = &stream;
        };
        onTarget = [&](RecordingByteStream& target) { failing.with(*source, target); };
        check();
        EXPECT_EQ(streamCalls(), failing.calls) << failing.what;
        EXPECT_EQ(destroyed, 2) << failing.what;
    }
};

TEST_F(FailingCopy, StreamFailureBecomesAnExceptionThatNamesTheSourceWithItsCode)
{
    for (Failing const& failing : everyFailureOf(TestStreamFailure(ErrorCode::NoSpaceLeft)))
        runWith(failing, [&] { EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::NoSpaceLeft, from)); });
}

TEST_F(FailingCopy, OtherExceptionsPassUnchanged)
{
    for (Failing const& failing : everyFailureOf(Exception(ErrorCode::PermissionDenied, to)))
        runWith(failing, [&] { EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::PermissionDenied, to)); });
    for (Failing const& failing : everyFailureOf(std::ios_base::failure("plain")))
        runWith(failing, [&] { EXPECT_THROW(copy(), std::ios_base::failure) << failing.what; });
    for (Failing const& failing : everyFailureOf(42))
        runWith(failing, [&] { EXPECT_THROW(copy(), int) << failing.what; });
}

TEST_F(FailingCopy, FirstExceptionIsTheOnePassedOn)
{
    for (Failing failing : everyFailureOf(TestStreamFailure(ErrorCode::NoSpaceLeft))) {
        if (failing.what == std::string("close of the target"))
            continue; // nothing can fail after it
        failing.with = [first = failing.with](RecordingByteStream& source, RecordingByteStream& target) {
            source.onClose = throwing(std::runtime_error("second"));
            target.onClose = throwing(TestStreamFailure(ErrorCode::IOError));
            first(source, target);
        };
        runWith(failing, [&] { EXPECT_EQ(failureOf([&] { copy(); }), failure(ErrorCode::NoSpaceLeft, from)); });
    }
}

// The same over a real store.
class CopyInStore : public testing::Test
{
protected:
    CopyInStore() { store.folders = {at(u"s://h/")}; }

    StorageIRI const from = at(u"s://h/a");
    StorageIRI const to = at(u"s://h/b");
    MinimalProvider store;
};

TEST_F(CopyInStore, GivesTheSameContentForEverySize)
{
    for (std::size_t const size : {0u, 1u, 4095u, 4096u, 4097u, 100000u}) {
        std::string content;
        for (std::size_t i = 0; i < size; ++i)
            content.push_back(static_cast<char>(i * 7));
        store.put(from, content);
        store.put(to, "what was there before");
        store.copyFile(from, to, ReplacementPolicy::Overwrite);
        EXPECT_EQ(store.content(to), content) << size;
        EXPECT_EQ(store.content(from), content) << size;
    }
}

TEST_F(CopyInStore, OntoItselfEndsEmpty)
{
    store.put(from, "precious");
    store.copyFile(from, from, ReplacementPolicy::Overwrite);
    EXPECT_EQ(store.content(from), "");
}

TEST_F(CopyInStore, OntoAFolderWithClobberIsRefusedNamingTheTarget)
{
    store.put(from, "abc");
    store.folders.insert(to);
    EXPECT_EQ(failureOf([&] { store.copyFile(from, to, ReplacementPolicy::Clobber); }),
              failure(ErrorCode::ResourceAlreadyExists, to));
}

TEST_F(CopyInStore, MissingSourceIsReportedByTheStoreAndLeavesNoTarget)
{
    EXPECT_EQ(failureOf([&] { store.copyFile(from, to, ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::ResourceNotFound, from));
    EXPECT_TRUE(store.files.empty());
}

} // namespace
} // namespace foundation::storage::provider
