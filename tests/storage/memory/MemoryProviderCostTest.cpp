// What a store of many files costs, counted in the allocations of this program.

#include <storage/memory/MemoryProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/memory/MemoryStore.hpp>

#include <atomic>
#include <cstdlib>
#include <malloc.h>
#include <new>

namespace {

std::atomic<long> bytesInUse = 0;

} // namespace

// What the allocator hands out counts, not what was asked for: that is what the memory of the machine goes down by.
void* operator new(std::size_t size)
{
    void* const memory = std::malloc(size);
    if (memory == nullptr)
        throw std::bad_alloc();
    bytesInUse += static_cast<long>(malloc_usable_size(memory) + sizeof(void*));
    return memory;
}

void operator delete(void* memory) noexcept
{
    if (memory != nullptr)
        bytesInUse -= static_cast<long>(malloc_usable_size(memory) + sizeof(void*));
    std::free(memory);
}

void operator delete(void* memory, std::size_t) noexcept
{
    operator delete(memory);
}

namespace foundation::storage::memory {
namespace {

using namespace provider;

constexpr int fileCount = 100000;
constexpr std::size_t contentSize = 10;

/// Names of a length at which they take memory of their own.
std::u16string nameOf(int number)
{
    std::string const digits = std::to_string(fileCount + number);
    return u"small file " + std::u16string(digits.begin(), digits.end());
}

void fill(MemoryStore const& store)
{
    for (int number = 0; number < fileCount; ++number)
        store.write(u"/" + nameOf(number), std::string(contentSize, 'x'));
}

TEST(MemoryProviderCost, ASmallFileTakesLessThan400BytesBesideNameAndContent)
{
    MemoryStore const store;
    long const before = bytesInUse;
    fill(store);
    long const nameSize = static_cast<long>(nameOf(0).size() * sizeof(char16_t));
    long const perFile = (bytesInUse - before) / fileCount - static_cast<long>(contentSize) - nameSize;
    RecordProperty("BytesPerFile", std::to_string(perFile));
    EXPECT_LT(perFile, 400);
    EXPECT_GT(perFile, 100) << "not everything was counted";
}

TEST(MemoryProviderCost, AListingTakesTheSameMemoryHoweverManyEntriesThereAre)
{
    MemoryStore const store;
    fill(store);
    long const before = bytesInUse;
    long most = 0;
    int count = 0;
    auto const listing = store.listAll(at(u"/"));
    for (; listing->hasEntry(); listing->next(), ++count)
        most = std::max(most, bytesInUse - before);
    EXPECT_EQ(count, fileCount);
    EXPECT_LT(most, 2000);
}

TEST(MemoryProviderCost, ACopyTakesNoMemoryForItsContent)
{
    MemoryStore const store;
    store.write(u"/file", std::string(16 * 1048576, 'x'));
    long const before = bytesInUse;
    store.copyFile(at(u"/file"), at(u"/copy"), ReplacementPolicy::Preserve);
    store.copyFileAtomic(at(u"/file"), at(u"/atomic"), ReplacementPolicy::Preserve, {});
    EXPECT_LT(bytesInUse - before, 10000);
}

TEST(MemoryProviderCost, AGapTakesNoMemoryForItsContent)
{
    MemoryStore const store;
    auto const stream = store.openStream(at(u"/file"), rewrite);
    long const before = bytesInUse;
    stream->seek(1L << 30, std::ios_base::beg);
    writeAll(*stream, "x");
    EXPECT_EQ(store.getFileAttributes(at(u"/file")).getSize(), (1u << 30) + 1);
    EXPECT_LT(bytesInUse - before, 100000);
}

TEST(MemoryProviderCost, AllIsGivenBack)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    store.write(u"/folder/first", "content");
    store.removeFolderRecursively(at(u"/folder"));
    long const before = bytesInUse;
    store.createFolderRecursive(at(u"/folder/sub"));
    store.write(u"/folder/sub/file", std::string(2 * 1048576, 'x'));
    store.removeFolderRecursively(at(u"/folder"));
    EXPECT_EQ(bytesInUse, before);
}

} // namespace
} // namespace foundation::storage::memory
