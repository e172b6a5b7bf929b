#include <tools/storage/TreeRemover.hpp>

#include <gtest/gtest.h>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>

namespace foundation::storage::tool {
namespace {

namespace fs = std::filesystem;
using local::detail::realSystemCalls;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

std::string swapped;
std::string link;
bool hasFailed;

/// From the first failure on, a link takes the place of the folder as soon as anybody opens that by its path.
int openAfterASwap(int at, char const* path, int flags, mode_t mode)
{
    if (hasFailed && path == swapped)
        ::renameat2(AT_FDCWD, swapped.c_str(), AT_FDCWD, link.c_str(), RENAME_EXCHANGE);
    return realSystemCalls.openat(at, path, flags, mode);
}

int keepOneFile(int at, char const* path, int flags)
{
    if (std::string_view(path) != "stays")
        return realSystemCalls.unlinkat(at, path, flags);
    hasFailed = true;
    return failWith(EPERM);
}

TEST(TreeRemover, IsNotLedElsewhereByAFolderThatIsSwappedOnceSomethingStays)
{
    TemporaryFolder const folder;
    fs::create_directories(folder / "tree/swapped");
    fs::create_directory(folder / "outside");
    folder.write("tree/swapped/stays", "");
    folder.write("outside/file", "content");
    fs::create_directory_symlink(folder / "outside", folder / "link");
    swapped = folder / "tree/swapped";
    link = folder / "link";
    hasFailed = false;
    ReplacedSystemCalls calls;
    calls->openat = openAfterASwap;
    calls->unlinkat = keepOneFile;
    Session session("rm");
    auto const store = std::make_shared<local::LocalProvider>();
    TreeRemover(session).remove(Place(provider::StorageItem(store, folder.iri(u"tree")), "tree"));
    EXPECT_TRUE(hasFailed);
    EXPECT_EQ(session.status(), exitFailed);
    EXPECT_EQ(folder.read("outside/file"), "content");
}

} // namespace
} // namespace foundation::storage::tool
