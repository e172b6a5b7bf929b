#include <storage/provider/ByteStream.hpp>

#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <ios>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using std::ios_base;

static_assert(std::is_abstract_v<ByteStream>);
static_assert(std::has_virtual_destructor_v<ByteStream>);
static_assert(!std::is_copy_constructible_v<ByteStream> && !std::is_copy_assignable_v<ByteStream>);
static_assert(!std::is_copy_constructible_v<RecordingByteStream> && !std::is_move_constructible_v<RecordingByteStream>);
static_assert(!std::is_copy_assignable_v<RecordingByteStream> && !std::is_move_assignable_v<RecordingByteStream>);
static_assert(std::is_base_of_v<boost::noncopyable, ByteStream>);
static_assert(!std::is_convertible_v<ByteStream*, boost::noncopyable*>);
static_assert(sizeof(ByteStream) == sizeof(void*));
static_assert(std::is_same_v<decltype(&ByteStream::read), long (ByteStream::*)(char*, long)>);
static_assert(std::is_same_v<decltype(&ByteStream::write), long (ByteStream::*)(char const*, long)>);
static_assert(std::is_same_v<decltype(&ByteStream::seek), long (ByteStream::*)(long, ios_base::seekdir)>);
static_assert(std::is_same_v<decltype(&ByteStream::close), void (ByteStream::*)()>);

struct Opened : ByteStream
{
    using ByteStream::doClose;
    using ByteStream::doRead;
    using ByteStream::doSeek;
    using ByteStream::doWrite;
};

static_assert(std::is_same_v<decltype(&Opened::doRead), long (ByteStream::*)(char*, long)>);
static_assert(std::is_same_v<decltype(&Opened::doWrite), long (ByteStream::*)(char const*, long)>);
static_assert(std::is_same_v<decltype(&Opened::doSeek), long (ByteStream::*)(long, ios_base::seekdir)>);
static_assert(std::is_same_v<decltype(&Opened::doClose), void (ByteStream::*)()>);

TEST(ByteStream, VirtualFunctionsStandAfterTheDestructorInOrder)
{
    EXPECT_EQ(slotOf(&Opened::doRead), 2u);
    EXPECT_EQ(slotOf(&Opened::doWrite), 3u);
    EXPECT_EQ(slotOf(&Opened::doSeek), 4u);
    EXPECT_EQ(slotOf(&Opened::doClose), 5u);
}

TEST(ByteStream, PublicOperationsAreNotVirtual)
{
    EXPECT_FALSE(isVirtual(&ByteStream::read));
    EXPECT_FALSE(isVirtual(&ByteStream::write));
    EXPECT_FALSE(isVirtual(&ByteStream::seek));
    EXPECT_FALSE(isVirtual(&ByteStream::close));
}

TEST(ByteStream, EachOperationReachesItsSlotWithItsArguments)
{
    CallLog log;
    RecordingByteStream recording(log, "stream");
    ByteStream& stream = recording;
    char buffer[8] = {};

    recording.onRead = [&buffer](char* given, long) { return given == buffer ? 3L : -99L; };
    EXPECT_EQ(stream.read(buffer, 8), 3);
    recording.onWrite = [&buffer](char const* given, long) { return given == buffer ? 4L : -99L; };
    EXPECT_EQ(stream.write(buffer, 7), 4);
    recording.onSeek = [](long, ios_base::seekdir) { return 1L << 40; };
    EXPECT_EQ(stream.seek(-5, ios_base::end), 1L << 40);
    stream.close();

    EXPECT_EQ(log, (CallLog{"stream.read(8)", "stream.write(7)", "stream.seek(-5, end)", "stream.close()"}));
}

TEST(ByteStream, FailuresPassUnchanged)
{
    RecordingByteStream stream;
    stream.onRead = throwing(std::runtime_error("read"));
    stream.onClose = throwing(std::logic_error("close"));
    EXPECT_THROW(stream.read(nullptr, 0), std::runtime_error);
    EXPECT_THROW(stream.close(), std::logic_error);
}

TEST(ByteStream, IsDestroyedThroughItsBase)
{
    int destroyed = 0;
    auto recording = std::make_unique<RecordingByteStream>();
    recording->onDestruction = [&destroyed] { ++destroyed; };
    std::unique_ptr<ByteStream> stream = std::move(recording);
    stream.reset();
    EXPECT_EQ(destroyed, 1);
}

} // namespace
} // namespace foundation::storage::provider
