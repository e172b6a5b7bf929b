#include <storage/provider/TransactionalStream.hpp>

#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/printed.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <ios>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using std::ios_base;

static_assert(std::is_abstract_v<TransactionalStream>);
static_assert(std::has_virtual_destructor_v<TransactionalStream>);
static_assert(!std::is_base_of_v<ByteStream, TransactionalStream>);
static_assert(!std::is_copy_constructible_v<TransactionalStream> && !std::is_copy_assignable_v<TransactionalStream>);
static_assert(sizeof(TransactionalStream) == sizeof(void*));
static_assert(std::is_same_v<decltype(&TransactionalStream::read), long (TransactionalStream::*)(char*, long)>);
static_assert(std::is_same_v<decltype(&TransactionalStream::write), long (TransactionalStream::*)(char const*, long)>);
static_assert(std::is_same_v<decltype(&TransactionalStream::seek), //
                             long (TransactionalStream::*)(long, ios_base::seekdir)>);
static_assert(std::is_same_v<decltype(&TransactionalStream::byteStream), ByteStream* (TransactionalStream::*)()>);
static_assert(std::is_same_v<decltype(&TransactionalStream::close), //
                             void (TransactionalStream::*)(StreamClosePolicy const&)>);

struct Opened : TransactionalStream
{
    using TransactionalStream::doByteStream;
    using TransactionalStream::doClose;
    using TransactionalStream::doRead;
    using TransactionalStream::doSeek;
    using TransactionalStream::doWrite;
};

static_assert(std::is_same_v<decltype(&Opened::doRead), decltype(&TransactionalStream::read)>);
static_assert(std::is_same_v<decltype(&Opened::doWrite), decltype(&TransactionalStream::write)>);
static_assert(std::is_same_v<decltype(&Opened::doSeek), decltype(&TransactionalStream::seek)>);
static_assert(std::is_same_v<decltype(&Opened::doClose), decltype(&TransactionalStream::close)>);
static_assert(std::is_same_v<decltype(&Opened::doByteStream), decltype(&TransactionalStream::byteStream)>);

// Overrides the pure operations alone.
class OverByteStream : public TransactionalStream
{
public:
    OverByteStream(ByteStream& stream, CallLog& log) : stream_(stream), log_(log) {}

protected:
    void doClose(StreamClosePolicy const& policy) override { log_.push_back("doClose(" + printed(policy) + ")"); }
    ByteStream* doByteStream() override
    {
        log_.emplace_back("doByteStream()");
        return &stream_;
    }

private:
    ByteStream& stream_;
    CallLog& log_;
};

TEST(TransactionalStream, VirtualFunctionsStandAfterTheDestructorInOrder)
{
    EXPECT_EQ(slotOf(&Opened::doRead), 2u);
    EXPECT_EQ(slotOf(&Opened::doWrite), 3u);
    EXPECT_EQ(slotOf(&Opened::doSeek), 4u);
    EXPECT_EQ(slotOf(&Opened::doClose), 5u);
    EXPECT_EQ(slotOf(&Opened::doByteStream), 6u);
}

TEST(TransactionalStream, PublicOperationsAreNotVirtual)
{
    EXPECT_FALSE(isVirtual(&TransactionalStream::read));
    EXPECT_FALSE(isVirtual(&TransactionalStream::write));
    EXPECT_FALSE(isVirtual(&TransactionalStream::seek));
    EXPECT_FALSE(isVirtual(&TransactionalStream::byteStream));
    EXPECT_FALSE(isVirtual(&TransactionalStream::close));
}

TEST(TransactionalStream, ReadsWritesAndSeeksGoToTheByteStreamByDefault)
{
    CallLog log;
    RecordingByteStream bytes(log, "stream");
    bytes.onRead = readsFrom("abc");
    bytes.onWrite = [](char const*, long) { return 2L; };
    bytes.onSeek = [](long, ios_base::seekdir) { return 1L << 40; };
    OverByteStream stream(bytes, log);
    char buffer[4] = {};

    EXPECT_EQ(stream.read(buffer, 4), 3);
    EXPECT_STREQ(buffer, "abc");
    EXPECT_EQ(stream.write("xyz", 3), 2);
    EXPECT_EQ(stream.seek(-1, ios_base::cur), 1L << 40);
    EXPECT_EQ(log, (CallLog{"doByteStream()", "stream.read(4)", "doByteStream()", "stream.write(3)", "doByteStream()",
                            "stream.seek(-1, cur)"}));
}

TEST(TransactionalStream, FailuresOfTheByteStreamPassUnchanged)
{
    CallLog log;
    RecordingByteStream bytes;
    bytes.onWrite = throwing(std::runtime_error("full"));
    OverByteStream stream(bytes, log);
    EXPECT_THROW(stream.write("x", 1), std::runtime_error);
}

TEST(TransactionalStream, CloseAndByteStreamReachTheirSlots)
{
    CallLog log;
    RecordingByteStream bytes;
    OverByteStream stream(bytes, log);
    EXPECT_EQ(stream.byteStream(), &bytes);
    stream.close(StreamClosePolicy::Commit);
    stream.close(StreamClosePolicy::Abort);
    EXPECT_EQ(log,
              (CallLog{"doByteStream()", "doClose(StreamClosePolicy::Commit)", "doClose(StreamClosePolicy::Abort)"}));
}

TEST(TransactionalStream, OverriddenOperationsAreReached)
{
    struct Overriding : OverByteStream
    {
        using OverByteStream::OverByteStream;
        long doRead(char*, long count) override { return count + 1; }
        long doWrite(char const*, long count) override { return count + 2; }
        long doSeek(long offset, ios_base::seekdir) override { return offset + 3; }
    };
    CallLog log;
    RecordingByteStream bytes;
    Overriding stream(bytes, log);
    EXPECT_EQ(stream.read(nullptr, 10), 11);
    EXPECT_EQ(stream.write(nullptr, 10), 12);
    EXPECT_EQ(stream.seek(10, ios_base::beg), 13);
    EXPECT_TRUE(log.empty());
}

TEST(TransactionalStream, DroppingDoesNotCloseByItself)
{
    CallLog log;
    RecordingByteStream bytes;
    {
        OverByteStream const stream(bytes, log);
    }
    EXPECT_TRUE(log.empty());
}

} // namespace
} // namespace foundation::storage::provider
