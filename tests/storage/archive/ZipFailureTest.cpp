#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/storage/archive/FlakyStore.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/rawZips.hpp>

#include <gmock/gmock.h>

#include <array>
#include <random>

namespace foundation::storage::archive {

using namespace provider;

namespace {

/// Stored and deflated.
constexpr std::array<std::uint16_t, 2> methods{0, 8};

StorageItem openRaw(std::vector<RawEntry> const& entries, ArchiveLimits const& limits = {})
{
    return openRoot(ArchiveFormat::Zip, makeFile(makeRawZip(entries)), limits);
}

/// What a read answers: bytes, "end", or the code of its failure.
std::string outcomeOf(ByteStream& stream, std::size_t count)
{
    try {
        std::string bytes(count, '\0');
        long const read = stream.read(bytes.data(), static_cast<long>(count));
        return read == -1 ? "end" : bytes.substr(0, static_cast<std::size_t>(read));
    } catch (ByteStreamFailure const& failure) {
        return failure.getErrorCode() == ErrorCode::IOError ? "IOError" : "another failure";
    }
}

ErrorCode codeOfReading(ByteStream& stream, std::size_t count = 1)
{
    try {
        std::string bytes(count, '\0');
        stream.read(bytes.data(), static_cast<long>(count));
    } catch (ByteStreamFailure const& failure) {
        return failure.getErrorCode();
    }
    return ErrorCode::Unknown;
}

/// Bytes that cannot be compressed.
std::string noise(std::size_t size)
{
    std::mt19937 random(7);
    std::string bytes(size, '\0');
    for (char& byte : bytes)
        byte = static_cast<char>(random());
    return bytes;
}

struct FlakyZip
{
    std::shared_ptr<FlakyStore> store;
    StorageItem root;
};

FlakyZip openFlaky(std::vector<RawEntry> const& entries)
{
    StorageIRI const location(u"mem://archives/");
    auto const store = std::make_shared<FlakyStore>(location);
    StorageItem const file(store, StorageIRI(location, u"archive"));
    write(file, makeRawZip(entries));
    StorageItem const root = openRoot(ArchiveFormat::Zip, file);
    root.exists();
    return {store, root};
}

TEST(ZipFailure, MoreThanSaidIsRefusedHoweverOftenAndMuchIsAskedFor)
{
    std::string const text = "0123456789abcdefghij";
    for (std::uint16_t const method : methods) {
        StorageItem const root = openRaw({{.name = "a", .content = text, .method = method, .size = 7}});
        for (std::size_t const count : {1u, 3u, 7u, 20u}) {
            auto const stream = StorageItem(root, u"a").openReadOnlyStream();
            EXPECT_EQ(outcomeOf(*stream, 20), "IOError");
            EXPECT_EQ(outcomeOf(*stream, count), "IOError");
            EXPECT_EQ(outcomeOf(*stream, 20), "IOError");
        }
    }
}

TEST(ZipFailure, GoingBackAfterAFailureReadsFromTheBeginning)
{
    std::string const text = "0123456789abcdefghij";
    for (std::uint16_t const method : methods) {
        StorageItem const root = openRaw({{.name = "a", .content = text, .method = method, .size = 7}});
        auto const stream = StorageItem(root, u"a").openReadOnlyStream();
        EXPECT_EQ(outcomeOf(*stream, 20), "IOError");
        stream->seek(0, std::ios_base::beg);
        EXPECT_EQ(outcomeOf(*stream, 3), "012");
        EXPECT_EQ(outcomeOf(*stream, 2), "34");
        EXPECT_EQ(outcomeOf(*stream, 9), "IOError");
        stream->seek(2, std::ios_base::beg);
        EXPECT_EQ(outcomeOf(*stream, 3), "234");
    }
}

TEST(ZipFailure, ContentWhereNoneShouldBeIsNeverTheEnd)
{
    for (std::uint16_t const method : methods) {
        StorageItem const root = openRaw({{.name = "a", .content = "text", .method = method, .size = 0}});
        auto const stream = StorageItem(root, u"a").openReadOnlyStream();
        for (int i = 0; i != 3; ++i)
            EXPECT_EQ(outcomeOf(*stream, 4), "IOError");
        stream->seek(0, std::ios_base::beg);
        EXPECT_EQ(outcomeOf(*stream, 4), "IOError");
    }
}

TEST(ZipFailure, OfTheStoreKeepsItsCodeAndIsOverWhenTheStreamIsMoved)
{
    for (std::uint16_t const method : methods) {
        std::string const content = noise(600'000);
        auto const [store, root] = openFlaky({{.name = "a", .content = content, .method = method}});
        auto const stream = StorageItem(root, u"a").openReadOnlyStream();
        EXPECT_EQ(outcomeOf(*stream, 10), content.substr(0, 10));
        store->failWith(ErrorCode::PermissionDenied);
        stream->seek(300'000, std::ios_base::beg);
        EXPECT_EQ(codeOfReading(*stream), ErrorCode::PermissionDenied);
        EXPECT_EQ(codeOfReading(*stream), ErrorCode::PermissionDenied);
        stream->seek(200'000, std::ios_base::beg);
        EXPECT_EQ(codeOfReading(*stream), ErrorCode::PermissionDenied);
        store->recover();
        EXPECT_EQ(codeOfReading(*stream), ErrorCode::PermissionDenied);
        stream->seek(200'000, std::ios_base::beg);
        EXPECT_EQ(outcomeOf(*stream, 10), content.substr(200'000, 10));
        stream->seek(5, std::ios_base::beg);
        EXPECT_EQ(outcomeOf(*stream, 10), content.substr(5, 10));
    }
}

TEST(ZipFailure, OfTheStoreWhileBeginningAnewIsNoCrash)
{
    auto const [store, root] = openFlaky({{.name = "before", .content = noise(300'000)},
                                          {.name = "a", .content = noise(300'000), .method = 8},
                                          {.name = "behind", .content = noise(300'000)}});
    auto const stream = StorageItem(root, u"a").openReadOnlyStream();
    EXPECT_EQ(outcomeOf(*stream, 200'000).size(), 200'000u);
    store->failWith(ErrorCode::ResourceInUse);
    for (long const position : {10L, 0L, 5L}) {
        stream->seek(position, std::ios_base::beg);
        for (std::size_t const count : {1u, 100u})
            EXPECT_EQ(codeOfReading(*stream, count), ErrorCode::ResourceInUse);
    }
}

TEST(ZipFailure, OfTheStoreLeavesOtherStreamsToTheirOwn)
{
    std::string const content = noise(300'000);
    auto const [store, root] =
        openFlaky({{.name = "a", .content = content}, {.name = "b", .content = content, .method = 8}});
    std::vector<std::unique_ptr<ByteStream>> streams;
    for (int i = 0; i != 20; ++i) // more than there are handles
        streams.push_back(StorageItem(root, i % 2 == 0 ? u"a" : u"b").openReadOnlyStream());
    store->failWith(ErrorCode::IOError);
    EXPECT_EQ(codeOfReading(*streams[0], 200'000), ErrorCode::IOError);
    store->recover();
    for (auto const& stream : streams) {
        stream->seek(100'000, std::ios_base::beg);
        EXPECT_EQ(outcomeOf(*stream, 10), content.substr(100'000, 10));
    }
}

} // namespace

} // namespace foundation::storage::archive
