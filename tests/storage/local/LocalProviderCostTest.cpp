// What listings of large folders cost, counted in the allocations of this program.

#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/allocations.hpp>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <dirent.h>
#include <fstream>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

using namespace provider;
using tests::support::allocations;
using tests::support::livingBytes;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

constexpr std::size_t entryCount = 1'000'000;
constexpr std::size_t nameLength = 30;
constexpr std::size_t recordLength = 56; // a multiple of 8

std::size_t given;

/// As `getdents64` does for a folder of so many files, all of them of names that are not short.
ssize_t readFiles(int, void* buffer, std::size_t size)
{
    char* const records = static_cast<char*>(buffer);
    std::size_t end = 0;
    for (; given < entryCount && end + recordLength <= size; end += recordLength, ++given) {
        std::uint16_t const length = recordLength;
        std::memcpy(records + end + offsetof(dirent64, d_reclen), &length, sizeof length);
        records[end + offsetof(dirent64, d_type)] = DT_REG;
        std::snprintf(records + end + offsetof(dirent64, d_name), nameLength + 1, "%030zu", given);
    }
    return static_cast<ssize_t>(end);
}

class LocalProviderCost : public testing::Test
{
protected:
    LocalProviderCost()
    {
        given = 0;
        replaced->getdents64 = readFiles;
        replaced->statx = [](int, char const*, int, unsigned, struct statx* result) {
            *result = {};
            result->stx_mode = S_IFREG;
            return 0;
        };
    }

    /// The memory of this process, whoever allocated it.
    static std::ptrdiff_t residentBytes()
    {
        std::ptrdiff_t ignored = 0;
        std::ptrdiff_t pages = 0;
        std::ifstream("/proc/self/statm") >> ignored >> pages;
        return pages * ::sysconf(_SC_PAGESIZE);
    }

    /// By how many bytes the memory in use grew at most while the folder was listed.
    template <typename List>
    std::ptrdiff_t growthWhileWalking(List const& list)
    {
        std::ptrdiff_t const before = livingBytes();
        std::size_t const allocationsBefore = allocations();
        std::ptrdiff_t most = before;
        auto const listing = list();
        for (FolderEntry const& entry : entries(*listing)) {
            walked += entry.getName().size() == nameLength;
            most = std::max(most, livingBytes());
        }
        allocated = allocations() - allocationsBefore;
        return most - before;
    }

    TemporaryFolder folder;
    LocalProvider const provider;
    ReplacedSystemCalls replaced;
    std::size_t walked = 0;
    std::size_t allocated = 0;
};

constexpr std::ptrdiff_t buffer = 16 * 1024;
constexpr std::ptrdiff_t anEntry = 1024;

TEST_F(LocalProviderCost, OfNamesOnlyIsABufferAndAnEntryOfMemoryForAMillionFiles)
{
    std::ptrdiff_t const growth = growthWhileWalking([&] { return provider.listAllNamesOnly(folder.iri()); });
    EXPECT_EQ(walked, entryCount);
    EXPECT_GE(growth, buffer);
    EXPECT_LT(growth, buffer + 4 * anEntry);
}

TEST_F(LocalProviderCost, OfAttributesIsABufferAndAnEntryOfMemoryForAMillionFiles)
{
    std::ptrdiff_t const growth = growthWhileWalking([&] { return provider.listAll(folder.iri()); });
    EXPECT_EQ(walked, entryCount);
    EXPECT_GE(growth, buffer);
    EXPECT_LT(growth, buffer + 4 * anEntry);
}

TEST_F(LocalProviderCost, OfAPatternIsABufferAndAnEntryOfMemoryForAMillionFiles)
{
    std::ptrdiff_t const growth = growthWhileWalking([&] { return provider.listFiles(folder.iri(), u"0*999[!8]"); });
    EXPECT_EQ(walked, 900u);
    EXPECT_GE(growth, buffer);
    EXPECT_LT(growth, buffer + 8 * anEntry);
}

/// A sanitizer keeps memory that was given back.
#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)
TEST_F(LocalProviderCost, LeavesTheMemoryOfTheProcessWhereItWasForAMillionFiles)
{
    std::ptrdiff_t const before = residentBytes();
    std::ptrdiff_t most = 0;
    auto const listing = provider.listAll(folder.iri());
    for ([[maybe_unused]] FolderEntry const& entry : entries(*listing)) {
        if (++walked % 10'000 == 0)
            most = std::max(most, residentBytes());
    }
    EXPECT_EQ(walked, entryCount);
    EXPECT_GE(most, before / 2) << "it was measured";
    EXPECT_LT(most - before, 1 << 20);
}
#endif

TEST_F(LocalProviderCost, IsOneAllocationForANameAndThreeForItsAttributes)
{
    growthWhileWalking([&] { return provider.listAllNamesOnly(folder.iri()); });
    EXPECT_LT(allocated, entryCount + 100);
    given = 0;
    growthWhileWalking([&] { return provider.listAll(folder.iri()); });
    EXPECT_LT(allocated, 4 * entryCount + 100);
}

} // namespace
} // namespace foundation::storage::local
