#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/FolderChain.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/ScopedMount.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/deepFolders.hpp>
#include <tests/support/failureOf.hpp>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <dirent.h>
#include <filesystem>
#include <fstream>
#include <string>
#include <string_view>
#include <sys/stat.h>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::makeDeepFolders;
using tests::support::ReplacedSystemCalls;
using tests::support::ScopedMount;
using tests::support::TemporaryFolder;

/// A tree of two folders, each with a file, and something beside it.
class LocalProviderRemoval : public testing::Test
{
protected:
    LocalProviderRemoval()
    {
        fs::create_directories(folder / "tree/inner");
        folder.write("tree/file", "");
        folder.write("tree/inner/file", "");
        fs::create_directory(folder / "beside");
        folder.write("beside/file", "content");
    }

    ~LocalProviderRemoval() override { EXPECT_EQ(folder.read("beside/file"), "content"); }

    std::string remove(std::u16string const& name = u"tree") const
    {
        return failureOf([&] { provider.removeFolderRecursively(folder.iri(name)); });
    }

    bool exists(std::string const& name) const { return fs::exists(fs::symlink_status(folder / name)); }

    TemporaryFolder folder;
    LocalProvider provider;
};

TEST_F(LocalProviderRemoval, IsAFeature)
{
    EXPECT_TRUE(provider.hasFeature(ExtendedFeature::RecursiveFolderRemoval));
}

TEST_F(LocalProviderRemoval, TakesEveryKindOfEntryAndEveryName)
{
    ::mkfifo((folder / "tree/pipe").c_str(), 0600);
    fs::create_symlink("nowhere", folder / "tree/broken");
    fs::create_symlink("../beside", folder / "tree/to folder");
    fs::create_symlink("../beside/file", folder / "tree/to file");
    fs::create_directory(folder / "tree/\xff\n");
    folder.write("tree/\xff\n/...", "");
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
}

TEST_F(LocalProviderRemoval, GoesAsDeepAsItGets)
{
    makeDeepFolders(folder / "tree", 5000);
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
}

fs::path moving;
fs::path place;

TEST_F(LocalProviderRemoval, DoesWithoutWhatIsMovedAwayMeanwhile)
{
    TemporaryFolder const elsewhere;
    makeDeepFolders(folder / "tree", 100, "deeper");
    moving = folder / "tree/deeper/deeper/deeper";
    place = elsewhere / "moved";
    ReplacedSystemCalls calls;
    calls->getdents64 = [](int descriptor, void* buffer, std::size_t size) {
        if (fs::read_symlink("/proc/self/fd/" + std::to_string(descriptor)).native().size() >
                moving.native().size() + 600 &&
            fs::exists(moving))
        {
            fs::rename(moving, place);
            fs::rename(place / "deeper", place.native() + " from within");
        }
        return realSystemCalls.getdents64(descriptor, buffer, size);
    };
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
    EXPECT_TRUE(fs::exists(place));
}

TEST_F(LocalProviderRemoval, DoesNotFollowALinkInThePlaceOfTheFolder)
{
    fs::create_directory_symlink("beside", folder / "link");
    EXPECT_EQ(remove(u"link"), failure(ErrorCode::InvalidLocation, folder.iri(u"link")));
    EXPECT_TRUE(exists("link"));
}

TEST_F(LocalProviderRemoval, FollowsLinksOnTheWayToTheFolder)
{
    fs::create_directory_symlink(".", folder / "link");
    EXPECT_EQ(remove(u"link/tree"), "no failure");
    EXPECT_FALSE(exists("tree"));
    EXPECT_TRUE(exists("link"));
}

TEST_F(LocalProviderRemoval, RefusesDots)
{
    for (auto const* const name : {u"tree/.", u"tree/inner/.."})
        EXPECT_EQ(remove(name), failure(ErrorCode::InvalidLocation, folder.iri(name)));
    EXPECT_TRUE(exists("tree/inner/file"));
}

TEST_F(LocalProviderRemoval, RefusesTheRoot)
{
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int, char const*, int) -> int { throw std::logic_error("something would be removed"); };
    for (auto const* const root : {u"file:///", u"file:////"})
        EXPECT_EQ(failureOf([&] { provider.removeFolderRecursively(StorageIRI(root)); }),
                  failure(ErrorCode::ResourceInUse, StorageIRI(root)));
}

TEST_F(LocalProviderRemoval, NamesTheFirstThatStaysAndRemovesTheRest)
{
    for (char const* const name : {"tree/a", "tree/stays", "tree/z", "tree/inner/z"})
        folder.write(name, "");
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int at, char const* path, int flags) {
        return std::string_view(path) == "stays" ? failWith(EPERM) : realSystemCalls.unlinkat(at, path, flags);
    };
    EXPECT_EQ(remove(), failure(ErrorCode::PermissionDenied, folder.iri(u"tree/stays")));
    EXPECT_EQ(std::distance(fs::recursive_directory_iterator(folder / "tree"), {}), 1);
}

TEST_F(LocalProviderRemoval, NamesAnInnermostEntryThatStays)
{
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int at, char const* path, int flags) {
        return flags == 0 ? failWith(EROFS) : realSystemCalls.unlinkat(at, path, flags);
    };
    fs::remove(folder / "tree/file");
    EXPECT_EQ(remove(), failure(ErrorCode::PermissionDenied, folder.iri(u"tree/inner/file")));
}

TEST_F(LocalProviderRemoval, NamesAFolderThatStaysThoughItIsEmpty)
{
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int at, char const* path, int flags) {
        return flags != 0 ? failWith(EACCES) : realSystemCalls.unlinkat(at, path, flags);
    };
    EXPECT_EQ(remove(), failure(ErrorCode::PermissionDenied, folder.iri(u"tree/inner")));
    EXPECT_FALSE(exists("tree/file"));
    EXPECT_FALSE(exists("tree/inner/file"));
}

class LocalProviderRemovalUnreadable : public LocalProviderRemoval
{
protected:
    LocalProviderRemovalUnreadable()
    {
        calls->openat2 = [](int at, char const* path, open_how const* how, std::size_t size) {
            return std::string_view(path) == "inner" ? failWith(EACCES) : realSystemCalls.openat2(at, path, how, size);
        };
    }

    ReplacedSystemCalls calls;
};

TEST_F(LocalProviderRemovalUnreadable, FoldersAreNamed)
{
    EXPECT_EQ(remove(), failure(ErrorCode::PermissionDenied, folder.iri(u"tree/inner")));
    EXPECT_TRUE(exists("tree/inner/file"));
    EXPECT_FALSE(exists("tree/file"));
}

TEST_F(LocalProviderRemovalUnreadable, FoldersGoWhenTheyAreEmpty)
{
    fs::remove(folder / "tree/inner/file");
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
    EXPECT_EQ(remove(u"tree"), failure(ErrorCode::ResourceNotFound, folder.iri(u"tree")));
}

TEST_F(LocalProviderRemoval, LeavesWhatIsMountedBelow)
{
    for (bool const ofItsOwn : {true, false}) {
        fs::create_directories(folder / "tree/inner");
        ScopedMount const mount = ofItsOwn ? ScopedMount::fileSystem(folder / "tree/inner")
                                           : ScopedMount::bind(folder / "beside", folder / "tree/inner");
        if (!mount)
            GTEST_SKIP() << "this user may not mount";
        folder.write("tree/inner/file", "content");
        EXPECT_EQ(remove(), failure(ErrorCode::ResourceInUse, folder.iri(u"tree/inner")));
        EXPECT_EQ(folder.read("tree/inner/file"), "content");
        EXPECT_FALSE(exists("tree/file"));
    }
}

TEST_F(LocalProviderRemoval, LeavesWhatIsMountedOnTheFolderItself)
{
    ScopedMount const mount = ScopedMount::bind(folder / "beside", folder / "tree");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    EXPECT_EQ(remove(), failure(ErrorCode::ResourceInUse, folder.iri(u"tree")));
}

TEST_F(LocalProviderRemoval, GetsAlongWithoutTypesOfEntries)
{
    ReplacedSystemCalls calls;
    calls->getdents64 = [](int descriptor, void* buffer, std::size_t size) {
        ssize_t const count = realSystemCalls.getdents64(descriptor, buffer, size);
        for (ssize_t i = 0; i < count;) {
            auto* const entry = reinterpret_cast<dirent64*>(static_cast<char*>(buffer) + i);
            entry->d_type = DT_UNKNOWN;
            i += entry->d_reclen;
        }
        return count;
    };
    fs::create_directory_symlink("../beside", folder / "tree/link");
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
}

TEST_F(LocalProviderRemoval, DoesNotMindWhatOthersRemove)
{
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int at, char const* path, int flags) {
        realSystemCalls.unlinkat(at, path, flags);
        return realSystemCalls.unlinkat(at, path, flags);
    };
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
}

TEST_F(LocalProviderRemoval, RemovesALinkThatTookThePlaceOfAFolder)
{
    static std::string outside;
    outside = (folder / "beside").native();
    ReplacedSystemCalls calls;
    calls->openat2 = [](int at, char const* path, open_how const* how, std::size_t size) {
        if (std::string_view(path) == "inner") {
            realSystemCalls.unlinkat(at, "inner/file", 0);
            realSystemCalls.unlinkat(at, "inner", AT_REMOVEDIR);
            realSystemCalls.symlinkat(outside.c_str(), at, "inner");
        }
        return realSystemCalls.openat2(at, path, how, size);
    };
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
}

TEST_F(LocalProviderRemoval, ReadsAgainWhatAListingLeftOut)
{
    for (int i = 0; i < 100; ++i)
        folder.write("tree/" + std::to_string(i), "");
    ReplacedSystemCalls calls;
    calls->getdents64 = [](int descriptor, void* buffer, std::size_t) {
        static bool isSecond = false;
        isSecond = !isSecond;
        return isSecond ? realSystemCalls.getdents64(descriptor, buffer, 512) : 0;
    };
    EXPECT_EQ(remove(), "no failure");
    EXPECT_FALSE(exists("tree"));
}

TEST_F(LocalProviderRemoval, GivesUpOnAFolderThatOthersKeepFilling)
{
    static int passes;
    passes = 0;
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int at, char const* path, int flags) {
        if (flags == 0)
            return realSystemCalls.unlinkat(at, path, flags);
        ++passes;
        std::string const added = std::string(path) + "/added";
        realSystemCalls.close(realSystemCalls.openat(at, added.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0666));
        return realSystemCalls.unlinkat(at, path, flags);
    };
    EXPECT_EQ(remove(), failure(ErrorCode::FolderNotEmpty, folder.iri(u"tree/inner")));
    EXPECT_GT(passes, 1);
    EXPECT_TRUE(exists("tree/inner/added"));
}

std::vector<ino64_t> removedInodes;

int noteRemoval(int at, char const* path, int flags)
{
    struct stat status;
    if (::fstatat(at, path, &status, AT_SYMLINK_NOFOLLOW) == 0 && flags == 0)
        removedInodes.push_back(status.st_ino);
    return realSystemCalls.unlinkat(at, path, flags);
}

TEST_F(LocalProviderRemoval, GoesInTheOrderOfTheDisk)
{
    for (int i = 0; i < 1000; ++i)
        folder.write("tree/inner/" + std::to_string(i * 7919 % 1000), "");
    fs::remove(folder / "tree/file");
    removedInodes.clear();
    ReplacedSystemCalls calls;
    calls->unlinkat = noteRemoval;
    EXPECT_EQ(remove(), "no failure");
    EXPECT_EQ(removedInodes.size(), 1001U);
    EXPECT_TRUE(std::is_sorted(removedInodes.begin(), removedInodes.end()));
}

TEST_F(LocalProviderRemoval, TakesNoMoreThanItsFolderWhenNamesBeginAlike)
{
    fs::create_directory(folder / "tree2");
    EXPECT_EQ(remove(), "no failure");
    EXPECT_TRUE(exists("tree2"));
}

} // namespace
} // namespace foundation::storage::local
