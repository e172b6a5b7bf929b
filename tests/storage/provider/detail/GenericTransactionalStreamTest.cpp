#include <storage/provider/detail/GenericTransactionalStream.hpp>

#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/TestStreamFailure.hpp>
#include <tests/support/inThreads.hpp>
#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <ios>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>

namespace foundation::storage::provider::detail {
namespace {

using namespace tests::support;
using Stream = GenericTransactionalStream<ByteStream>;
using Finisher = std::function<void(StreamClosePolicy const&)>;

static_assert(std::is_base_of_v<TransactionalStream, Stream>);
static_assert(std::is_constructible_v<Stream, std::unique_ptr<ByteStream>, Finisher>);
static_assert(!std::is_copy_constructible_v<Stream> && !std::is_move_constructible_v<Stream>);

constexpr StreamClosePolicy commit = StreamClosePolicy::Commit;
constexpr StreamClosePolicy abort = StreamClosePolicy::Abort;

class GenericTransactionalStreams : public testing::Test
{
protected:
    GenericTransactionalStreams()
    {
        auto underlying = std::make_unique<RecordingByteStream>(log, "stream");
        underlying->onDestruction = [this] { log.emplace_back("destroyed"); };
        bytes = underlying.get();
        stream = std::make_unique<Stream>(std::move(underlying), finisher());
    }

    ~GenericTransactionalStreams() override
    {
        onFinish = [](StreamClosePolicy const&) {};
        stream.reset();
    }

    Finisher finisher()
    {
        return [this](StreamClosePolicy const& policy) {
            log.push_back("finish(" + printed(policy) + ")");
            onFinish(policy);
        };
    }

    CallLog log;
    RecordingByteStream* bytes = nullptr;
    Finisher onFinish = [](StreamClosePolicy const&) {};
    std::unique_ptr<TransactionalStream> stream;
};

TEST_F(GenericTransactionalStreams, TakesTheStreamOutOfTheCallersPointer)
{
    std::unique_ptr<ByteStream> given = std::make_unique<RecordingByteStream>();
    Stream const adopted(std::move(given), finisher());
    EXPECT_EQ(given, nullptr); // NOLINT(bugprone-use-after-move)
}

TEST_F(GenericTransactionalStreams, ByteStreamIsTheStreamAdoptedEachTime)
{
    EXPECT_EQ(stream->byteStream(), bytes);
    stream->close(commit);
    EXPECT_EQ(stream->byteStream(), bytes);
}

TEST_F(GenericTransactionalStreams, OpeningDoesNothing)
{
    EXPECT_TRUE(log.empty());
}

TEST_F(GenericTransactionalStreams, ReadsWritesAndSeeksGoToTheStreamBeforeAndAfterClosing)
{
    char buffer[4];
    CallLog const expected = {"stream.read(4)", "stream.write(3)", "stream.seek(2, beg)"};
    for (int round = 0; round < 2; ++round) {
        EXPECT_EQ(stream->read(buffer, 4), -1);
        EXPECT_EQ(stream->write("abc", 3), 3);
        EXPECT_EQ(stream->seek(2, std::ios_base::beg), 2);
        EXPECT_EQ(log, expected);
        stream->close(commit);
        log.clear();
    }
}

TEST_F(GenericTransactionalStreams, CloseClosesTheStreamAndThenFinishesWithThePolicy)
{
    stream->close(commit);
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Commit)"}));
}

TEST_F(GenericTransactionalStreams, CloseWithAbortFinishesWithAbort)
{
    stream->close(abort);
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Abort)"}));
}

TEST_F(GenericTransactionalStreams, SecondCloseDoesNothingWhateverThePolicies)
{
    for (StreamClosePolicy const first : {commit, abort}) {
        for (StreamClosePolicy const second : {commit, abort}) {
            CallLog calls;
            Stream closing(std::make_unique<RecordingByteStream>(calls, "s"),
                           [&calls](StreamClosePolicy const& policy) { calls.push_back(printed(policy)); });
            closing.close(first);
            closing.close(second);
            EXPECT_EQ(calls, (CallLog{"s.close()", printed(first)}));
        }
    }
}

TEST_F(GenericTransactionalStreams, DroppedStreamAborts)
{
    stream.reset();
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Abort)", "destroyed"}));
}

TEST_F(GenericTransactionalStreams, DroppingAClosedStreamDoesNothingMore)
{
    stream->close(commit);
    log.clear();
    stream.reset();
    EXPECT_EQ(log, CallLog{"destroyed"});
}

TEST_F(GenericTransactionalStreams, DroppedStreamSwallowsWhatTheFinisherThrows)
{
    onFinish = throwing(std::runtime_error("finisher"));
    EXPECT_NO_THROW(stream.reset());
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Abort)", "destroyed"}));
}

TEST_F(GenericTransactionalStreams, DroppedStreamSwallowsWhatClosingTheStreamThrows)
{
    bytes->onClose = throwing(42);
    EXPECT_NO_THROW(stream.reset());
    EXPECT_EQ(log, (CallLog{"stream.close()", "destroyed"}));
}

TEST_F(GenericTransactionalStreams, FailureToCloseTheStreamPassesUnchangedAndNothingIsFinished)
{
    bytes->onClose = throwing(TestStreamFailure(ErrorCode::NoSpaceLeft));
    try {
        stream->close(commit);
        FAIL() << "nothing was thrown";
    } catch (TestStreamFailure const& failure) {
        EXPECT_EQ(failure.getErrorCode(), ErrorCode::NoSpaceLeft);
    }
    EXPECT_EQ(log, CallLog{"stream.close()"});
}

TEST_F(GenericTransactionalStreams, AfterAFailedCloseOfTheStreamItCanBeClosedAgainWithEitherPolicy)
{
    for (StreamClosePolicy const second : {commit, abort}) {
        CallLog calls;
        auto underlying = std::make_unique<RecordingByteStream>(calls, "s");
        RecordingByteStream& inner = *underlying;
        Stream closing(std::move(underlying),
                       [&calls](StreamClosePolicy const& policy) { calls.push_back(printed(policy)); });
        inner.onClose = throwing(std::runtime_error("once"));
        EXPECT_THROW(closing.close(commit), std::runtime_error);
        inner.onClose = [] {};
        closing.close(second);
        closing.close(commit);
        EXPECT_EQ(calls, (CallLog{"s.close()", "s.close()", printed(second)}));
    }
}

TEST_F(GenericTransactionalStreams, FailureOfTheFinisherPassesUnchanged)
{
    onFinish = throwing(std::runtime_error("commit failed"));
    try {
        stream->close(commit);
        FAIL() << "nothing was thrown";
    } catch (std::runtime_error const& failure) {
        EXPECT_STREQ(failure.what(), "commit failed");
    }
}

TEST_F(GenericTransactionalStreams, AfterAFailedCommitItCanBeAborted)
{
    onFinish = throwing(std::runtime_error("commit failed"));
    EXPECT_THROW(stream->close(commit), std::runtime_error);
    onFinish = [](StreamClosePolicy const&) {};
    stream->close(abort);
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Commit)", "stream.close()",
                            "finish(StreamClosePolicy::Abort)"}));
}

TEST_F(GenericTransactionalStreams, AfterAFailedCommitItCanBeCommittedAgain)
{
    onFinish = throwing(std::runtime_error("commit failed"));
    EXPECT_THROW(stream->close(commit), std::runtime_error);
    EXPECT_THROW(stream->close(commit), std::runtime_error);
    onFinish = [](StreamClosePolicy const&) {};
    log.clear();
    stream->close(commit);
    stream->close(abort);
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Commit)"}));
}

TEST_F(GenericTransactionalStreams, DroppedAfterAFailedCommitItAborts)
{
    onFinish = throwing(std::runtime_error("commit failed"));
    EXPECT_THROW(stream->close(commit), std::runtime_error);
    onFinish = [](StreamClosePolicy const&) {};
    log.clear();
    stream.reset();
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Abort)", "destroyed"}));
}

TEST_F(GenericTransactionalStreams, EmptyFinisherThrowsAndLeavesTheStreamOpen)
{
    Stream unfinished(std::make_unique<RecordingByteStream>(log, "s"), Finisher());
    EXPECT_THROW(unfinished.close(commit), std::bad_function_call);
    EXPECT_THROW(unfinished.close(abort), std::bad_function_call);
    EXPECT_EQ(log, (CallLog{"s.close()", "s.close()"}));
}

TEST_F(GenericTransactionalStreams, CloseOutOfTheFinisherDoesNothing)
{
    onFinish = [this](StreamClosePolicy const&) { stream->close(abort); };
    stream->close(commit);
    EXPECT_EQ(log, (CallLog{"stream.close()", "finish(StreamClosePolicy::Commit)"}));
}

TEST_F(GenericTransactionalStreams, DroppingReleasesTheFinisherBeforeTheStream)
{
    CallLog calls;
    auto underlying = std::make_unique<RecordingByteStream>();
    underlying->onDestruction = [&calls] { calls.emplace_back("stream"); };
    std::shared_ptr<void> held(nullptr, [&calls](void*) { calls.emplace_back("finisher"); });
    auto holder =
        std::make_unique<Stream>(std::move(underlying), [held = std::move(held)](StreamClosePolicy const&) {});
    EXPECT_TRUE(calls.empty());
    holder.reset();
    EXPECT_EQ(calls, (CallLog{"finisher", "stream"}));
}

// Closes `stream` from many threads at once, with either policy.
void closeFromManyThreads(TransactionalStream& stream)
{
    inThreads(32, [&stream](int thread) { stream.close(thread % 2 == 0 ? commit : abort); });
}

TEST(GenericTransactionalStreamConcurrency, OneOfManyClosingThreadsRunsTheFinisher)
{
    for (int round = 0; round < 20; ++round) {
        std::atomic<int> closed = 0;
        std::atomic<int> finished = 0;
        auto underlying = std::make_unique<RecordingByteStream>();
        underlying->onClose = [&closed] { ++closed; };
        Stream stream(std::move(underlying), [&finished](StreamClosePolicy const&) { ++finished; });
        closeFromManyThreads(stream);
        EXPECT_EQ(closed, 1);
        EXPECT_EQ(finished, 1);
    }
}

TEST(GenericTransactionalStreamConcurrency, FailedCloseIsTriedAgainByOneThreadAtATime)
{
    int calls = 0; // not atomic: one thread at a time closes, and the next one sees what it did
    std::atomic<int> failures = 0;
    Stream stream(std::make_unique<RecordingByteStream>(), [&calls](StreamClosePolicy const&) {
        if (++calls <= 5)
            throw std::runtime_error("not now");
    });
    auto const closeUntilItAnswers = [&stream, &failures] {
        for (;;) {
            try {
                return stream.close(commit);
            } catch (std::runtime_error const&) {
                ++failures;
            }
        }
    };
    inThreads(32, [&closeUntilItAnswers](int) { closeUntilItAnswers(); });
    EXPECT_EQ(failures, 5);
    EXPECT_EQ(calls, 6);
}

TEST(GenericTransactionalStreamConcurrency, WhatOneThreadWroteIsSeenByTheThreadThatCloses)
{
    std::string written;
    std::string committed;
    auto underlying = std::make_unique<RecordingByteStream>();
    underlying->onWrite = writesTo(written);
    Stream stream(std::move(underlying), [&](StreamClosePolicy const&) { committed = written; });
    std::jthread([&stream] { stream.write("content", 7); }).join();
    closeFromManyThreads(stream);
    EXPECT_EQ(committed, "content");
}

} // namespace
} // namespace foundation::storage::provider::detail
