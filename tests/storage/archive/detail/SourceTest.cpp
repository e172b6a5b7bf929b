#include <storage/archive/detail/Source.hpp>

#include <storage/archive/detail/BufferedReader.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Spool.hpp>
#include <tests/storage/archive/ObservedStore.hpp>
#include <tests/storage/archive/containers.hpp>

#include <gtest/gtest.h>

#include <string>

namespace foundation::storage::archive::detail {
namespace {

using namespace provider;
using Reason = ArchiveException::Reason;

std::string numbers(std::size_t size)
{
    std::string text;
    while (text.size() < size)
        text += std::to_string(text.size()) + ' ';
    text.resize(size);
    return text;
}

std::string readAt(Source const& source, std::uint64_t offset, std::size_t count)
{
    std::string bytes(count, '\0');
    bytes.resize(source.readAt(offset, bytes.data(), count));
    return bytes;
}

void expectServes(Source const& source, std::string const& content)
{
    EXPECT_EQ(source.size(), content.size());
    EXPECT_EQ(readAt(source, 0, content.size() + 10), content);
    EXPECT_EQ(readAt(source, 5, 7), content.substr(5, 7));
    EXPECT_EQ(readAt(source, content.size() - 3, 7), content.substr(content.size() - 3));
    EXPECT_EQ(readAt(source, content.size(), 7), "");
    EXPECT_EQ(readAt(source, content.size() + 9, 7), "");
}

template <typename Action>
Reason reasonOf(Action const& action)
{
    try {
        action();
    } catch (Fault const& fault) {
        return fault.reason;
    }
    throw std::logic_error("no fault");
}

TEST(Source, ReadsAFileAtAnyPlace)
{
    std::string const content = numbers(100'000);
    expectServes(*openSource(makeFile(content), {}), content);
}

/// A store whose streams answer that they have no place to go to.
class StoreWithoutPlaces final : public memory::MemoryProvider
{
public:
    using MemoryProvider::MemoryProvider;

protected:
    std::unique_ptr<ByteStream> doOpenReadOnlyStream(StorageIRI const& iri) const override
    {
        return std::make_unique<Stream>(MemoryProvider::doOpenReadOnlyStream(iri));
    }

private:
    class Stream final : public ByteStream
    {
    public:
        explicit Stream(std::unique_ptr<ByteStream> stream) : stream_(std::move(stream)) {}

    protected:
        long doRead(char* buffer, long count) override { return stream_->read(buffer, count); }
        long doWrite(char const* data, long count) override { return stream_->write(data, count); }
        long doSeek(long /*offset*/, std::ios_base::seekdir /*direction*/) override { return -1; }
        void doClose() override { stream_->close(); }

    private:
        std::unique_ptr<ByteStream> stream_;
    };
};

TEST(Source, CopiesAFileWhoseStreamsCannotBeMovedHoweverTheySayIt)
{
    std::string const content = numbers(100'000);
    StorageIRI const root(u"mem://archives/");
    std::vector<std::shared_ptr<IProvider>> const stores{
        std::make_shared<StoreWithoutPlaces>(root),
        std::make_shared<ObservedStore>(root, ObservedStore::Seeking::Impossible)};
    for (auto const& store : stores) {
        StorageItem const file(store, StorageIRI(root, u"file"));
        write(file, content);
        auto const source = openSource(file, {});
        EXPECT_NE(dynamic_cast<Spool const*>(source.get()), nullptr);
        expectServes(*source, content);
    }
}

TEST(Spool, KeepsWhatFitsInMemory)
{
    std::string const content = numbers(1000);
    auto const stream = makeFile(content).openReadOnlyStream();
    Spool const spool(*stream, {.spoolMemory = 1000});
    EXPECT_TRUE(spool.isInMemory());
    expectServes(spool, content);
}

TEST(Spool, KeepsMoreInAFile)
{
    std::string const content = numbers(1'000'000);
    auto const stream = makeFile(content).openReadOnlyStream();
    Spool const spool(*stream, {.spoolMemory = 300'000});
    EXPECT_FALSE(spool.isInMemory());
    expectServes(spool, content);
}

TEST(Spool, RefusesMoreThanAllowed)
{
    auto const stream = makeFile(numbers(1001)).openReadOnlyStream();
    EXPECT_EQ(reasonOf([&] { Spool(*stream, {.spoolBytes = 1000}); }), Reason::SpoolTooLarge);
}

TEST(BufferedReader, ReadsOnAndElsewhereInPiecesOfAnySize)
{
    std::string const content = numbers(500'000);
    BufferedReader reader(openSource(makeFile(content), {}));
    for (std::size_t const start : {0u, 499'999u, 8191u, 8192u, 250'000u, 7u}) {
        reader.seek(start);
        for (std::size_t const count : {1u, 10u, 9000u, 200'000u}) {
            std::size_t const at = static_cast<std::size_t>(reader.position());
            std::string bytes(count, '\0');
            bytes.resize(reader.read(bytes.data(), count));
            EXPECT_EQ(bytes, content.substr(std::min(at, content.size()), count));
        }
    }
}

} // namespace
} // namespace foundation::storage::archive::detail
