// Copying a file within a store, as a provider inherits it: the exact calls, and what comes of them.

#include <storage/provider/IProvider.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/TestStreamFailure.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <ios>
#include <memory>
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
        EXPECT_EQ(log.back(), "target.close()") << failing.what << ": the store was asked for more";
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

TEST_F(CopyInStore, FailureOnTheWayLeavesAPartialTarget)
{
    struct Faulty : MinimalProvider
    {
        std::unique_ptr<ByteStream> doOpenReadOnlyStream(StorageIRI const&) const override
        {
            auto stream = std::make_unique<RecordingByteStream>();
            stream->onRead = [text = readsFrom("abc")](char* buffer, long count) mutable {
                long const taken = text(buffer, count);
                return taken == -1 ? throw TestStreamFailure(ErrorCode::IOError) : taken;
            };
            return stream;
        }
    };
    Faulty faulty;
    faulty.folders = {at(u"s://h/")};
    faulty.put(to, "what was there before");
    EXPECT_EQ(failureOf([&] { faulty.copyFile(from, to, ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::IOError, from));
    EXPECT_EQ(faulty.content(to), "abc");
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
