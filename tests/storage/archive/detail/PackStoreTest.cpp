#include <storage/archive/detail/PackStore.hpp>

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <sys/stat.h>

namespace foundation::storage::archive::detail {
namespace {

/// What open files without a name take of their file systems.
long spaceOfNamelessFiles()
{
    long bytes = 0;
    for (auto const& descriptor : std::filesystem::directory_iterator("/proc/self/fd")) {
        struct stat status = {};
        if (::fstat(std::stoi(descriptor.path().filename()), &status) == 0 && S_ISREG(status.st_mode) &&
            status.st_nlink == 0)
            bytes += status.st_blocks * 512;
    }
    return bytes;
}

TEST(PackStore, GivesTheSpaceOfSmallPiecesBack)
{
    PackStore store(0);
    std::string const bytes(100, 'x');
    PackStore::Piece const kept = store.keep(bytes.data(), bytes.size());
    long const before = spaceOfNamelessFiles();
    EXPECT_GT(before, 0);
    for (int piece = 0; piece != 1000; ++piece)
        store.drop(store.keep(bytes.data(), bytes.size()));
    EXPECT_LT(spaceOfNamelessFiles() - before, 50'000);
    std::string read(bytes.size(), '\0');
    store.read(kept, 0, read.data(), read.size());
    EXPECT_EQ(read, bytes);
    store.drop(kept);
}

} // namespace
} // namespace foundation::storage::archive::detail
