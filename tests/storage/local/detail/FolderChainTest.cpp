#include <storage/local/detail/FolderChain.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/ScopedMount.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <iterator>
#include <set>
#include <string>
#include <utility>

namespace foundation::storage::local::detail {
namespace {

namespace fs = std::filesystem;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::ScopedMount;
using tests::support::TemporaryFolder;

FileDescriptor open(fs::path const& path)
{
    return FileDescriptor(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
}

std::ptrdiff_t openDescriptors()
{
    return std::distance(fs::directory_iterator("/proc/self/fd"), {});
}

std::string numbered(int number)
{
    return "folder " + std::to_string(number);
}

/// The next name of the innermost folder; empty at the end.
std::string readName(FolderChain& chain)
{
    FoundName found;
    EXPECT_EQ(chain.read(found), 0);
    return std::string(found.name);
}

std::multiset<std::string> readAll(FolderChain& chain)
{
    std::multiset<std::string> names;
    for (std::string name = readName(chain); !name.empty(); name = readName(chain))
        names.insert(name);
    return names;
}

/// More levels than are kept open: "folder 0" holds "folder 1", and so on.
class DeepFolderChain : public testing::Test
{
protected:
    static constexpr int depth = static_cast<int>(FolderChain::maximumOpen) + 10;

    DeepFolderChain()
    {
        fs::path path = folder.path();
        for (int i = 0; i < depth; ++i)
            fs::create_directory(path /= numbered(i));
    }

    /// The path of the folder of this number.
    fs::path pathOf(int number) const
    {
        fs::path path = folder.path();
        for (int i = 0; i <= number; ++i)
            path /= numbered(i);
        return path;
    }

    void enterAll()
    {
        for (int i = 0; i < depth; ++i)
            ASSERT_EQ(chain.enter(numbered(i).c_str(), Mounts::Enter), 0);
    }

    /// Goes back until the innermost folder is that of this number.
    void leaveDownTo(int number)
    {
        while (chain.name() != numbered(number))
            ASSERT_EQ(chain.leave(), 0);
    }

    TemporaryFolder folder;
    TemporaryFolder elsewhere;
    FolderChain chain{open(folder.path())};
};

TEST(FolderChain, KnowsItsWay)
{
    TemporaryFolder const folder;
    fs::create_directories(folder / "a/b");
    FolderChain chain(open(folder.path()));
    EXPECT_EQ(chain.depth(), 0U);
    EXPECT_EQ(chain.path(), "");
    EXPECT_EQ(chain.name(), "");
    ASSERT_EQ(chain.enter("a", Mounts::Enter), 0);
    ASSERT_EQ(chain.enter("b", Mounts::Refuse), 0);
    EXPECT_EQ(chain.depth(), 2U);
    EXPECT_EQ(chain.path(), "a/b");
    EXPECT_EQ(chain.name(), "b");
    ASSERT_EQ(chain.leave(), 0);
    EXPECT_EQ(chain.path(), "a");
}

TEST(FolderChain, EntersNothingButFolders)
{
    TemporaryFolder const folder;
    fs::create_directory(folder / "folder");
    fs::create_directory_symlink("folder", folder / "link");
    folder.write("file", "");
    FolderChain chain(open(folder.path()));
    for (Mounts const mounts : {Mounts::Enter, Mounts::Refuse}) {
        EXPECT_EQ(chain.enter("file", mounts), ENOTDIR);
        int const error = chain.enter("link", mounts);
        EXPECT_TRUE(error == ENOTDIR || error == ELOOP) << error;
        EXPECT_EQ(chain.enter("missing", mounts), ENOENT);
        EXPECT_EQ(chain.depth(), 0U);
    }
}

TEST(FolderChain, ReadsEachEntryOnceAroundItsWayDown)
{
    TemporaryFolder const folder;
    std::multiset<std::string> names;
    fs::create_directory(folder / "folder");
    for (int i = 0; i < 2000; ++i)
        folder.write(*names.insert("a file with a name that is not short at all " + std::to_string(i)), "");
    names.insert("folder");
    FolderChain chain(open(folder.path()));
    std::multiset<std::string> found;
    for (std::string name = readName(chain); !name.empty(); name = readName(chain)) {
        found.insert(name);
        ASSERT_EQ(chain.enter("folder", Mounts::Enter), 0);
        EXPECT_EQ(readName(chain), "");
        ASSERT_EQ(chain.leave(), 0);
    }
    EXPECT_EQ(found, names);
}

TEST(FolderChain, StartsAgainFromTheOutermostFolder)
{
    TemporaryFolder const folder;
    fs::create_directories(folder / "a/b");
    FolderChain chain(open(folder.path()));
    EXPECT_EQ(readName(chain), "a");
    ASSERT_EQ(chain.enter("a", Mounts::Enter), 0);
    ASSERT_EQ(chain.restart(), 0);
    EXPECT_EQ(readName(chain), "a");
    EXPECT_EQ(readName(chain), "");
}

TEST(FolderChain, FindsNothingInARemovedFolder)
{
    TemporaryFolder const folder;
    fs::create_directory(folder / "a");
    FolderChain chain(open(folder.path()));
    ASSERT_EQ(chain.enter("a", Mounts::Enter), 0);
    fs::remove(folder / "a");
    EXPECT_EQ(readName(chain), "");
    EXPECT_EQ(chain.leave(), 0);
}

TEST_F(DeepFolderChain, KeepsFewFoldersOpen)
{
    auto const before = openDescriptors();
    enterAll();
    EXPECT_LE(openDescriptors(), before + static_cast<std::ptrdiff_t>(FolderChain::maximumOpen));
    EXPECT_EQ(chain.depth(), static_cast<std::size_t>(depth));
}

TEST_F(DeepFolderChain, GoesOnReadingWhereItStood)
{
    for (char const* const name : {"a", "b", "c"})
        std::ofstream(pathOf(0) / name);
    ASSERT_EQ(chain.enter(numbered(0).c_str(), Mounts::Enter), 0);
    std::multiset<std::string> found{readName(chain), readName(chain)};
    for (int i = 1; i < depth; ++i)
        ASSERT_EQ(chain.enter(numbered(i).c_str(), Mounts::Enter), 0);
    leaveDownTo(0);
    found.merge(readAll(chain));
    EXPECT_EQ(found, (std::multiset<std::string>{"a", "b", "c", numbered(1)}));
}

TEST_F(DeepFolderChain, FindsItsWayBackFromAFolderThatWasMoved)
{
    enterAll();
    leaveDownTo(20);
    fs::rename(pathOf(5), elsewhere / "moved");
    fs::create_directories(pathOf(5));
    leaveDownTo(6);
    EXPECT_EQ(chain.leave(), 0) << "the folder above is where it was, seen from below";
    EXPECT_EQ(chain.leave(), 0) << "the folder above the moved one is found by its names";
    EXPECT_EQ(chain.name(), numbered(4));
    EXPECT_EQ(readAll(chain), std::multiset<std::string>{numbered(5)});
}

TEST_F(DeepFolderChain, LeavesWhatSomebodyHasMovedAway)
{
    enterAll();
    fs::rename(pathOf(3), elsewhere / "3");
    fs::rename(elsewhere / "3" / numbered(4), elsewhere / "4");
    leaveDownTo(4);
    EXPECT_EQ(chain.leave(), ESTALE);
    EXPECT_EQ(chain.name(), numbered(2));
    EXPECT_EQ(chain.lostPath(), "folder 0/folder 1/folder 2/folder 3");
    EXPECT_EQ(readName(chain), "");
    leaveDownTo(0);
    EXPECT_EQ(chain.leave(), 0);
    EXPECT_EQ(chain.depth(), 0U);
}

TEST_F(DeepFolderChain, NeverTakesAnotherFolderForItsOwn)
{
    enterAll();
    fs::rename(pathOf(1), elsewhere / "1");
    fs::create_directory(elsewhere / "other");
    fs::create_directory_symlink(elsewhere / "other", pathOf(1));
    fs::rename(elsewhere / "1" / numbered(2), elsewhere / "other" / numbered(2));
    leaveDownTo(2);
    EXPECT_EQ(chain.leave(), ESTALE);
    EXPECT_EQ(chain.name(), numbered(0));
}

TEST_F(DeepFolderChain, GetsAlongWithFewDescriptors)
{
    static int left;
    ReplacedSystemCalls calls;
    left = 4;
    calls->openat = [](int at, char const* path, int flags, mode_t mode) {
        if (left == 0)
            return failWith(EMFILE);
        --left;
        return realSystemCalls.openat(at, path, flags, mode);
    };
    calls->close = [](int descriptor) {
        ++left;
        return realSystemCalls.close(descriptor);
    };
    enterAll();
    for (int i = 0; i < depth; ++i)
        ASSERT_EQ(chain.leave(), 0);
}

class FolderChainMounts : public testing::Test
{
protected:
    FolderChainMounts() { fs::create_directories(folder / "a/b"); }

    static void enterWhereAllowed(FolderChain& chain)
    {
        EXPECT_EQ(chain.enter("a", Mounts::Refuse), EXDEV);
        EXPECT_EQ(chain.depth(), 0U);
        EXPECT_EQ(chain.enter("a", Mounts::Enter), 0);
    }

    TemporaryFolder folder;
};

TEST_F(FolderChainMounts, AreEnteredOnlyWhereWanted)
{
    ScopedMount const mount = ScopedMount::fileSystem(folder / "a");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    FolderChain chain(open(folder.path()));
    enterWhereAllowed(chain);
}

TEST_F(FolderChainMounts, AreToldFromFoldersOnTheSameFileSystem)
{
    ScopedMount const mount = ScopedMount::bind(folder / "a/b", folder / "a");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    FolderChain chain(open(folder.path()));
    enterWhereAllowed(chain);
}

TEST_F(FolderChainMounts, AreToldOnOldSystemsToo)
{
    ScopedMount const mount = ScopedMount::bind(folder / "a/b", folder / "a");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    ReplacedSystemCalls calls;
    calls->openat2 = [](int, char const*, open_how const*, std::size_t) { return failWith(ENOSYS); };
    FolderChain chain(open(folder.path()));
    enterWhereAllowed(chain);
}

TEST(FolderChain, RefusesMountsAloneOnOldSystems)
{
    TemporaryFolder const folder;
    fs::create_directory(folder / "a");
    ReplacedSystemCalls calls;
    calls->openat2 = [](int, char const*, open_how const*, std::size_t) { return failWith(ENOSYS); };
    FolderChain chain(open(folder.path()));
    EXPECT_EQ(chain.enter("a", Mounts::Refuse), 0);
}

} // namespace
} // namespace foundation::storage::local::detail
