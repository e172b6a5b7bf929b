#include <storage/provider/detail/SafeByteStream.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/TestStreamFailure.hpp>

#include <gtest/gtest.h>

#include <ios>
#include <memory>
#include <string>
#include <type_traits>

namespace foundation::storage::provider::detail {
namespace {

using namespace tests::support;

static_assert(std::is_base_of_v<ByteStream, SafeByteStream>);
static_assert(std::is_constructible_v<SafeByteStream, std::unique_ptr<ByteStream>, bool, bool>);
static_assert(!std::is_copy_constructible_v<SafeByteStream> && !std::is_move_constructible_v<SafeByteStream>);

class SafeByteStreams : public testing::Test
{
protected:
    SafeByteStream guarded(bool readable, bool writable)
    {
        auto inner = std::make_unique<RecordingByteStream>(log, "inner");
        inner->onRead = readsFrom("content");
        inner->onWrite = writesTo(written, 3);
        inner->onSeek = [](long offset, std::ios_base::seekdir) { return offset + 1000; };
        inner->onDestruction = [this] { log.emplace_back("destroyed"); };
        innerStream = inner.get();
        return SafeByteStream(std::move(inner), readable, writable);
    }

    CallLog log;
    std::string written;
    RecordingByteStream* innerStream = nullptr;
    char buffer[16] = {};
};

TEST_F(SafeByteStreams, ReadsArePassedOnWhenReadable)
{
    SafeByteStream stream = guarded(true, false);
    EXPECT_EQ(stream.read(buffer, 4), 4);
    EXPECT_EQ(std::string(buffer), "cont");
    EXPECT_EQ(stream.read(buffer, 16), 3);
    EXPECT_EQ(stream.read(buffer, 16), -1);
    EXPECT_EQ(log, (CallLog{"inner.read(4)", "inner.read(16)", "inner.read(16)"}));
}

TEST_F(SafeByteStreams, ReadsAnswerTheEndWithoutAskingWhenNotReadable)
{
    SafeByteStream stream = guarded(false, true);
    EXPECT_EQ(stream.read(buffer, 4), -1);
    EXPECT_EQ(stream.read(buffer, 0), -1);
    EXPECT_EQ(std::string(buffer), "");
    EXPECT_TRUE(log.empty());
}

TEST_F(SafeByteStreams, WritesArePassedOnWhenWritable)
{
    for (bool const readable : {false, true}) {
        SafeByteStream stream = guarded(readable, true);
        log.clear();
        EXPECT_EQ(stream.write("abcdef", 6), 3);
        EXPECT_EQ(log, CallLog{"inner.write(6)"});
    }
    EXPECT_EQ(written, "abcabc");
}

TEST_F(SafeByteStreams, WritesThrowWithoutAskingWhenNotWritableWhateverTheCount)
{
    SafeByteStream stream = guarded(true, false);
    for (long const count : {1L, 0L, -1L})
        EXPECT_THROW(stream.write("abc", count), ByteStreamWriteFailure) << count;
    EXPECT_TRUE(log.empty());
}

TEST_F(SafeByteStreams, RefusedWriteLeavesTheStreamUsable)
{
    SafeByteStream stream = guarded(true, false);
    EXPECT_THROW(stream.write("abc", 3), ByteStreamWriteFailure);
    EXPECT_EQ(stream.seek(1, std::ios_base::beg), 1001);
    EXPECT_EQ(stream.read(buffer, 7), 7);
}

TEST_F(SafeByteStreams, SeeksArePassedOnInEveryAccessMode)
{
    for (bool const readable : {false, true}) {
        for (bool const writable : {false, true}) {
            SafeByteStream stream = guarded(readable, writable);
            log.clear();
            EXPECT_EQ(stream.seek(-7, std::ios_base::cur), 993);
            EXPECT_EQ(log, CallLog{"inner.seek(-7, cur)"});
        }
    }
}

TEST_F(SafeByteStreams, CloseIsPassedOnInEveryAccessModeAndEachTime)
{
    for (bool const open : {false, true}) {
        SafeByteStream stream = guarded(open, open);
        log.clear();
        stream.close();
        stream.close();
        EXPECT_EQ(log, (CallLog{"inner.close()", "inner.close()"}));
    }
}

TEST_F(SafeByteStreams, FailuresOfTheStreamPassUnchanged)
{
    SafeByteStream stream = guarded(true, true);
    innerStream->onRead = throwing(TestStreamFailure(ErrorCode::PermissionDenied));
    innerStream->onWrite = throwing(TestStreamFailure(ErrorCode::NoSpaceLeft));
    innerStream->onSeek = throwing(1);
    innerStream->onClose = throwing(std::string("close"));
    EXPECT_THROW(stream.read(buffer, 1), TestStreamFailure);
    EXPECT_THROW(stream.write("", 0), TestStreamFailure);
    EXPECT_THROW(stream.seek(0, std::ios_base::beg), int);
    EXPECT_THROW(stream.close(), std::string);
}

TEST_F(SafeByteStreams, OwnsTheStreamAndDoesNotCloseItByItself)
{
    {
        SafeByteStream const stream = guarded(true, true);
    }
    EXPECT_EQ(log, CallLog{"destroyed"});
}

} // namespace
} // namespace foundation::storage::provider::detail
