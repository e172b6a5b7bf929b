#include <storage/provider/ByteStreamDevice.hpp>

#include <storage/provider/detail/GenericTransactionalStream.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/StringByteStream.hpp>
#include <tests/support/printed.hpp>

#include <boost/iostreams/concepts.hpp>
#include <boost/iostreams/copy.hpp>
#include <boost/iostreams/stream.hpp>

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

template <class Device, class Stream>
constexpr bool isDeviceOver =
    std::is_same_v<typename Device::char_type, char>&&
        std::is_convertible_v<typename Device::category, boost::iostreams::seekable_device_tag>&&
            std::is_convertible_v<typename Device::category, boost::iostreams::closable_tag>&& std::is_base_of_v<
                GenericByteStreamDevice<Stream>, Device>&& std::is_constructible_v<Device, std::unique_ptr<Stream>&> &&
    !std::is_constructible_v<Device, std::unique_ptr<Stream>> &&
    !std::is_convertible_v<std::unique_ptr<Stream>&, Device> && std::is_copy_constructible_v<Device> &&
    std::is_copy_assignable_v<Device>;

static_assert(isDeviceOver<ByteStreamDevice, ByteStream>);
static_assert(isDeviceOver<TransactionalStreamDevice, TransactionalStream>);

template <class Device, class Stream, class Base = GenericByteStreamDevice<Stream>>
constexpr bool forwardsAsConst = std::is_same_v<decltype(&Device::read), long (Base::*)(char*, long) const>&&
    std::is_same_v<decltype(&Device::write), long (Base::*)(char const*, long) const>&&
        std::is_same_v<decltype(&Device::seek), long (Base::*)(long, ios_base::seekdir) const>;

static_assert(forwardsAsConst<ByteStreamDevice, ByteStream>);
static_assert(forwardsAsConst<TransactionalStreamDevice, TransactionalStream>);
static_assert(isDeclared<static_cast<void (TransactionalStreamDevice::*)(StreamClosePolicy const&) const>(
                  &TransactionalStreamDevice::close)>);
static_assert(std::is_same_v<decltype(std::declval<TransactionalStreamDevice const&>().close()), void> &&
              std::is_same_v<decltype(std::declval<ByteStreamDevice const&>().close()), void>);

// A recording stream, and the pointer that a device takes it out of.
struct Recorded
{
    explicit Recorded(CallLog& log)
    {
        auto recording = std::make_unique<RecordingByteStream>(log, "stream");
        stream = recording.get();
        pointer = std::move(recording);
    }

    RecordingByteStream* stream;
    std::unique_ptr<ByteStream> pointer;
};

std::unique_ptr<ByteStream> streamOver(std::shared_ptr<std::string> content)
{
    return std::make_unique<StringByteStream>(std::move(content));
}

std::unique_ptr<TransactionalStream> transactionOver(std::unique_ptr<ByteStream> stream, CallLog& log)
{
    return std::make_unique<detail::GenericTransactionalStream<ByteStream>>(
        std::move(stream), [&log](StreamClosePolicy const& policy) { log.push_back(printed(policy)); });
}

std::unique_ptr<TransactionalStream> transactionOver(std::shared_ptr<std::string> content, CallLog& log)
{
    return transactionOver(streamOver(std::move(content)), log);
}

TEST(ByteStreamDevice, TakesTheStreamOutOfThePointer)
{
    CallLog log;
    Recorded recorded(log);
    ByteStreamDevice const device(recorded.pointer);
    EXPECT_EQ(recorded.pointer, nullptr);
}

TEST(ByteStreamDevice, EachOperationReachesThatOfTheStream)
{
    CallLog log;
    Recorded recorded(log);
    recorded.stream->onRead = readsFrom("abc");
    recorded.stream->onWrite = [](char const*, long) { return 2L; };
    recorded.stream->onSeek = [](long, ios_base::seekdir) { return 1L << 40; };
    ByteStreamDevice const device(recorded.pointer);
    char buffer[8] = {};

    EXPECT_EQ(device.read(buffer, 8), 3);
    EXPECT_STREQ(buffer, "abc");
    EXPECT_EQ(device.write("xyz", 3), 2);
    EXPECT_EQ(device.seek(-1, ios_base::end), 1L << 40);
    device.close();
    EXPECT_EQ(log, (CallLog{"stream.read(8)", "stream.write(3)", "stream.seek(-1, end)", "stream.close()"}));
}

TEST(ByteStreamDevice, CopiesShareOneStreamThatIsDestroyedWithTheLast)
{
    CallLog log;
    int destroyed = 0;
    Recorded recorded(log);
    recorded.stream->onDestruction = [&destroyed] { ++destroyed; };
    {
        auto first = std::make_unique<ByteStreamDevice>(recorded.pointer);
        ByteStreamDevice const second = *first;
        second.close();
        EXPECT_EQ(log, CallLog{"stream.close()"});
        first.reset();
        EXPECT_EQ(destroyed, 0);
    }
    EXPECT_EQ(destroyed, 1);
    EXPECT_EQ(log, CallLog{"stream.close()"}) << "destruction does not close";
}

TEST(ByteStreamDevice, CopiesWithBoost)
{
    auto const from = std::make_shared<std::string>(10000, 'x');
    auto const to = std::make_shared<std::string>();
    auto source = streamOver(from);
    auto target = streamOver(to);
    EXPECT_EQ(boost::iostreams::copy(ByteStreamDevice(source), ByteStreamDevice(target)), 10000);
    EXPECT_EQ(*to, *from);
}

TEST(ByteStreamDevice, CopyWithBoostClosesEachStreamOnce)
{
    CallLog log;
    auto sourceStream = std::make_unique<RecordingByteStream>(log, "source");
    auto targetStream = std::make_unique<RecordingByteStream>(log, "target");
    sourceStream->onRead = readsFrom("abc");
    std::unique_ptr<ByteStream> source = std::move(sourceStream);
    std::unique_ptr<ByteStream> target = std::move(targetStream);
    boost::iostreams::copy(ByteStreamDevice(source), ByteStreamDevice(target), 4096);
    EXPECT_EQ(log, (CallLog{"source.read(4096)", "target.write(3)", "source.read(4096)", "source.close()",
                            "target.close()"}));
}

TEST(ByteStreamDevice, BoostStreamReadsWritesAndSeeks)
{
    auto const content = std::make_shared<std::string>("hello world");
    auto bytes = streamOver(content);
    boost::iostreams::stream<ByteStreamDevice> stream{ByteStreamDevice(bytes)};
    std::string word;
    stream >> word;
    EXPECT_EQ(word, "hello");
    stream.seekg(6);
    EXPECT_EQ(stream.tellg(), std::streampos(6));
    stream >> word;
    EXPECT_EQ(word, "world");
    stream.clear();
    stream.seekp(0, ios_base::end);
    stream << " and more";
    stream.seekp(0, ios_base::beg);
    stream << "J";
    stream.close();
    EXPECT_EQ(*content, "Jello world and more");
}

TEST(ByteStreamDevice, BoostStreamClosesTheStreamOnce)
{
    CallLog log;
    Recorded recorded(log);
    {
        boost::iostreams::stream<ByteStreamDevice> stream{ByteStreamDevice(recorded.pointer)};
        stream << "abc";
        stream.close();
    }
    EXPECT_EQ(log, (CallLog{"stream.write(3)", "stream.close()"}));
}

TEST(TransactionalStreamDevice, TakesTheStreamOutOfThePointer)
{
    CallLog log;
    auto transaction = transactionOver(std::make_shared<std::string>(), log);
    TransactionalStreamDevice const device(transaction);
    EXPECT_EQ(transaction, nullptr);
}

TEST(TransactionalStreamDevice, EachOperationReachesThatOfTheStream)
{
    CallLog log;
    Recorded recorded(log);
    recorded.stream->onRead = readsFrom("abc");
    auto transaction = transactionOver(std::move(recorded.pointer), log);
    TransactionalStreamDevice const device(transaction);
    char buffer[8] = {};

    EXPECT_EQ(device.read(buffer, 8), 3);
    EXPECT_EQ(device.write("xyz", 3), 3);
    EXPECT_EQ(device.seek(5, ios_base::beg), 5);
    EXPECT_EQ(log, (CallLog{"stream.read(8)", "stream.write(3)", "stream.seek(5, beg)"}));
}

TEST(TransactionalStreamDevice, PlainCloseCommits)
{
    CallLog log;
    auto transaction = transactionOver(std::make_shared<std::string>(), log);
    TransactionalStreamDevice(transaction).close();
    EXPECT_EQ(log, CallLog{"StreamClosePolicy::Commit"});
}

TEST(TransactionalStreamDevice, CloseTakesAPolicy)
{
    for (StreamClosePolicy const policy : {StreamClosePolicy::Commit, StreamClosePolicy::Abort}) {
        CallLog log;
        auto transaction = transactionOver(std::make_shared<std::string>(), log);
        TransactionalStreamDevice const device(transaction);
        device.close(policy);
        device.close();
        EXPECT_EQ(log, CallLog{printed(policy)});
    }
}

TEST(TransactionalStreamDevice, DestroyingAllCopiesUnclosedAborts)
{
    CallLog log;
    auto transaction = transactionOver(std::make_shared<std::string>(), log);
    {
        TransactionalStreamDevice const first(transaction);
        TransactionalStreamDevice const second = first; // NOLINT(performance-unnecessary-copy-initialization)
        EXPECT_TRUE(log.empty());
    }
    EXPECT_EQ(log, CallLog{"StreamClosePolicy::Abort"});
}

TEST(TransactionalStreamDevice, BoostStreamCommitsWhenItIsClosed)
{
    CallLog log;
    auto const content = std::make_shared<std::string>();
    auto transaction = transactionOver(content, log);
    boost::iostreams::stream<TransactionalStreamDevice> stream{TransactionalStreamDevice(transaction)};
    stream << "to be committed";
    stream.seekp(0);
    stream << "T";
    stream.close();
    EXPECT_EQ(*content, "To be committed");
    EXPECT_EQ(log, CallLog{"StreamClosePolicy::Commit"});
}

TEST(TransactionalStreamDevice, BoostStreamCommitsEvenWhenAnExceptionEndsIt)
{
    CallLog log;
    auto transaction = transactionOver(std::make_shared<std::string>(), log);
    try {
        boost::iostreams::stream<TransactionalStreamDevice> stream{TransactionalStreamDevice(transaction)};
        stream << "half of it";
        throw std::runtime_error("no more");
    } catch (std::runtime_error const&) {
        EXPECT_EQ(log, CallLog{"StreamClosePolicy::Commit"});
    }
}

TEST(TransactionalStreamDevice, BoostCopyCommitsEvenWhenAnExceptionEndsIt)
{
    CallLog log;
    auto failing = std::make_unique<RecordingByteStream>();
    failing->onRead = throwing(std::runtime_error("unreadable"));
    std::unique_ptr<ByteStream> source = std::move(failing);
    auto transaction = transactionOver(std::make_shared<std::string>(), log);
    EXPECT_THROW(boost::iostreams::copy(ByteStreamDevice(source), TransactionalStreamDevice(transaction)),
                 std::runtime_error);
    EXPECT_EQ(log, CallLog{"StreamClosePolicy::Commit"});
}

TEST(TransactionalStreamDevice, AbortedBeforehandStaysAborted)
{
    CallLog log;
    auto transaction = transactionOver(std::make_shared<std::string>(), log);
    TransactionalStreamDevice const device(transaction);
    boost::iostreams::stream<TransactionalStreamDevice> stream(device);
    stream << "unwanted";
    device.close(StreamClosePolicy::Abort);
    stream.close();
    EXPECT_EQ(log, CallLog{"StreamClosePolicy::Abort"});
}

} // namespace
} // namespace foundation::storage::provider
