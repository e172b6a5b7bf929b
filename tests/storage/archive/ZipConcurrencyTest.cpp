#include <storage/archive/ArchiveProvider.hpp>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/inThreads.hpp>

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <optional>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;

namespace {

constexpr int threads = 32;

std::string contentOf(int number)
{
    std::string content;
    while (content.size() < 20'000)
        content += std::to_string(number) + ':' + std::to_string(content.size()) + ' ';
    return content;
}

std::u16string nameOf(int number)
{
    return u"file" + std::u16string(1, static_cast<char16_t>(u'A' + number));
}

std::string zipOfAll()
{
    std::vector<ZipMember> members;
    for (int i = 0; i != threads; ++i)
        members.push_back({.name = std::string("file") + static_cast<char>('A' + i),
                           .content = contentOf(i),
                           .isStored = i % 2 == 1});
    return makeZip(members);
}

long openDescriptors()
{
    auto const all = std::filesystem::directory_iterator("/proc/self/fd");
    return std::distance(begin(all), end(all));
}

TEST(ZipConcurrency, ThreadsReadEntriesOfOneArchiveAtOnce)
{
    StorageItem const root = openRoot(ArchiveFormat::Zip, makeFile(zipOfAll()));
    inThreads(threads, [&](int number) {
        for (int i = 0; i != threads; ++i) {
            int const wanted = (number + i) % threads;
            EXPECT_EQ(read(root, nameOf(wanted)), contentOf(wanted));
        }
    });
}

TEST(ZipConcurrency, ManyStreamsAreOpenInOneThread)
{
    StorageItem const root = openRoot(ArchiveFormat::Zip, makeFile(zipOfAll()));
    std::vector<std::unique_ptr<ByteStream>> streams;
    for (int i = 0; i != threads; ++i)
        streams.push_back(StorageItem(root, nameOf(i)).openReadOnlyStream());
    for (std::size_t at = 0; at != 20'000; at += 1000) {
        for (int i = 0; i != threads; ++i) {
            std::string bytes(1000, '\0');
            EXPECT_EQ(streams[static_cast<std::size_t>(i)]->read(bytes.data(), 1000), 1000);
            EXPECT_EQ(bytes, contentOf(i).substr(at, 1000));
        }
    }
}

TEST(ZipConcurrency, TheLastUserClosesTheArchive)
{
    TemporaryFolder const folder;
    folder.write("a.zip", zipOfAll());
    long const before = openDescriptors();
    std::optional<StorageItem> root =
        openRoot(ArchiveFormat::Zip, StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"a.zip")));
    inThreads(threads, [&](int number) { EXPECT_EQ(read(*root, nameOf(number)), contentOf(number)); });
    EXPECT_GT(openDescriptors(), before);
    root.reset();
    EXPECT_EQ(openDescriptors(), before);
}

} // namespace

} // namespace foundation::storage::archive
