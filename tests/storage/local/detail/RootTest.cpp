#include <storage/local/detail/Root.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/deepFolders.hpp>
#include <tests/support/failureOf.hpp>

#include <cerrno>
#include <climits>
#include <fcntl.h>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace foundation::storage::local::detail {
namespace {

namespace fs = std::filesystem;
using provider::ErrorCode;
using provider::StorageIRI;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::makeDeepFolders;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

std::string refusalOf(std::string const& path)
{
    try {
        Root const root(path);
        return "";
    } catch (std::invalid_argument const& error) {
        return error.what();
    }
}

/// Of the entry itself; 0 where nothing is.
mode_t modeOf(At const& at)
{
    struct stat status;
    return ::fstatat(at.folder, at.path, &status, AT_SYMLINK_NOFOLLOW) == 0 ? status.st_mode : 0;
}

/// The same questions to all of the file system and to a root, about the same files.
class RootTest : public testing::TestWithParam<bool>
{
protected:
    RootTest()
    {
        fs::create_directories(folder / "root/folder");
        folder.write("root/file", "content");
        fs::create_symlink("file", folder / "root/link");
        fs::create_directory_symlink("folder", folder / "root/to folder");
        if (GetParam())
            root = Root(folder / "root");
    }

    std::string path(std::string const& name) const { return folder / ("root/" + name); }

    TemporaryFolder folder;
    Root root;
};

TEST_P(RootTest, KnowsWhetherItIsConfined)
{
    EXPECT_EQ(root.isConfined(), GetParam());
}

TEST_P(RootTest, OpensFilesAndFolders)
{
    for (char const* const name :
         {"file", "link", "folder", "to folder", "folder/../file", "//folder//", ".", "./file"}) {
        FileDescriptor file;
        EXPECT_EQ(root.open(path(name), O_RDONLY, file), 0) << name;
        EXPECT_TRUE(file.isOpen());
        EXPECT_NE(::fcntl(file.get(), F_GETFD) & FD_CLOEXEC, 0);
    }
}

TEST_P(RootTest, SaysWhyItOpensNothing)
{
    FileDescriptor file;
    EXPECT_EQ(root.open(path("missing"), O_RDONLY, file), ENOENT);
    EXPECT_EQ(root.open(path("file/inner"), O_RDONLY, file), ENOTDIR);
    EXPECT_EQ(root.open(path("link"), O_RDONLY | O_NOFOLLOW, file), ELOOP);
    EXPECT_EQ(root.open(path(std::string(256, 'x')), O_RDONLY, file), ENAMETOOLONG);
    EXPECT_FALSE(file.isOpen());
}

TEST_P(RootTest, MakesFilesOfTheModeAskedFor)
{
    mode_t const mask = ::umask(0);
    FileDescriptor file;
    EXPECT_EQ(root.open(path("new"), O_WRONLY | O_CREAT | O_EXCL, file, 0640), 0);
    ::umask(mask);
    EXPECT_EQ(fs::status(path("new")).permissions(), fs::perms(0640));
    EXPECT_EQ(root.open(path("folder"), O_WRONLY | O_TMPFILE, file, 0600), 0);
}

TEST_P(RootTest, TellsLinksFromWhatTheyLeadTo)
{
    Status status;
    ASSERT_EQ(root.getStatus(path("link"), Links::Keep, status), 0);
    EXPECT_TRUE(isLink(status));
    ASSERT_EQ(root.getStatus(path("link"), Links::Follow, status), 0);
    EXPECT_EQ(status.stx_size, 7U);
    EXPECT_EQ(root.getStatus(path("missing"), Links::Follow, status), ENOENT);
    EXPECT_TRUE(root.leadsToFolder(path("to folder")));
    EXPECT_TRUE(root.leadsToFolder(path("")));
    EXPECT_FALSE(root.leadsToFolder(path("link")));
}

TEST_P(RootTest, ChecksAccess)
{
    fs::permissions(path("file"), fs::perms(0600));
    EXPECT_EQ(root.checkAccess(path("file"), R_OK | W_OK), 0);
    EXPECT_EQ(root.checkAccess(path("file"), X_OK), EACCES);
    EXPECT_EQ(root.checkAccess(path("missing"), W_OK), ENOENT);
}

TEST_P(RootTest, LocatesEntriesThemselves)
{
    for (char const* const name : {"link", "folder/../link", "to folder/../link"}) {
        Located entry;
        ASSERT_EQ(root.locate(path(name), entry), 0) << name;
        EXPECT_TRUE(S_ISLNK(modeOf(entry.at()))) << name;
    }
}

TEST_P(RootTest, LocatesFoldersByDots)
{
    for (char const* const name : {"folder/.", "folder/..", "."}) {
        Located entry;
        ASSERT_EQ(root.locate(path(name), entry), 0) << name;
        EXPECT_TRUE(S_ISDIR(modeOf(entry.at()))) << name;
    }
}

TEST_P(RootTest, OpensTheFolderOfAnEntry)
{
    for (char const* const name : {"file", "folder/../file", "to folder//../file", "/file"}) {
        FileDescriptor parent;
        std::string last;
        ASSERT_EQ(root.openParent(path(name), parent, last), 0) << name;
        EXPECT_EQ(last, "file");
        EXPECT_TRUE(S_ISREG(modeOf({parent.get(), last.c_str()}))) << name;
    }
}

TEST_P(RootTest, OpensNoFolderOfDots)
{
    FileDescriptor parent;
    std::string last;
    EXPECT_EQ(root.openParent(path("folder/."), parent, last), EINVAL);
    EXPECT_EQ(root.openParent(path("folder/.."), parent, last), EINVAL);
    EXPECT_EQ(root.openParent(path("missing/file"), parent, last), ENOENT);
    EXPECT_FALSE(parent.isOpen());
}

TEST_P(RootTest, GoesAlongPathsOfAnyLength)
{
    makeDeepFolders(folder / "root", 50, std::string(200, 'd'));
    std::string deep = path("");
    for (int i = 0; i < 50; ++i)
        deep += std::string(200, 'd') + "//";
    ASSERT_GT(deep.size(), static_cast<std::size_t>(2 * PATH_MAX));
    FileDescriptor file;
    EXPECT_EQ(root.open(deep + "file", O_RDONLY, file), 0);
    EXPECT_EQ(root.open(deep + "missing", O_RDONLY, file), ENOENT);
    Located entry;
    Status status;
    ASSERT_EQ(root.locate(deep + "file", entry), 0);
    EXPECT_TRUE(S_ISREG(modeOf(entry.at())));
    EXPECT_EQ(root.getStatus(deep + "file", Links::Follow, status), 0);
    EXPECT_EQ(root.checkAccess(deep + "file", W_OK), 0);
    std::string last;
    EXPECT_EQ(root.openParent(deep + "file", file, last), 0);
    EXPECT_TRUE(root.leadsToFolder(deep));
}

TEST_P(RootTest, RefusesANameThatIsLongerThanAnyPath)
{
    FileDescriptor file;
    EXPECT_EQ(root.open(path(std::string(2 * PATH_MAX, 'x')), O_RDONLY, file), ENAMETOOLONG);
    Located entry;
    EXPECT_EQ(root.locate(path(std::string(2 * PATH_MAX, 'x') + "/y"), entry), ENAMETOOLONG);
}

INSTANTIATE_TEST_SUITE_P(Everywhere, RootTest, testing::Values(false));
INSTANTIATE_TEST_SUITE_P(Confined, RootTest, testing::Values(true));

class ConfinedRoot : public testing::Test
{
protected:
    ConfinedRoot()
    {
        fs::create_directories(folder / "root/folder");
        fs::create_directory(folder / "rooted");
        folder.write("file", "");
    }

    StorageIRI at(std::u16string const& name) const { return folder.iri(name); }

    TemporaryFolder folder;
};

TEST_F(ConfinedRoot, IsAFolderByItsAbsolutePath)
{
    EXPECT_EQ(refusalOf("root"), "\"root\" cannot be a root: it is no absolute path");
    EXPECT_EQ(refusalOf(""), "\"\" cannot be a root: it is no absolute path");
    EXPECT_NE(refusalOf((folder / "root").native() + '\0'), "");
    EXPECT_EQ(refusalOf(folder / "missing"),
              '"' + (folder / "missing").native() + "\" cannot be a root: No such file or directory");
    EXPECT_EQ(refusalOf(folder / "file"), '"' + (folder / "file").native() + "\" cannot be a root: Not a directory");
    EXPECT_EQ(refusalOf((folder / "root").native() + "///"), "");
    EXPECT_EQ(refusalOf("/"), "");
}

TEST_F(ConfinedRoot, NeedsASystemThatCanConfine)
{
    ReplacedSystemCalls calls;
    calls->openat2 = [](int, char const*, open_how const*, std::size_t) { return failWith(ENOSYS); };
    EXPECT_EQ(refusalOf(folder / "root"),
              '"' + (folder / "root").native() + "\" cannot be a root: Function not implemented");
}

TEST_F(ConfinedRoot, HasItselfAndWhatLiesBeneath)
{
    Root const root(folder / "root");
    for (auto const* const name : {u"root", u"root/", u"root//x", u"root/.."})
        EXPECT_NO_THROW(static_cast<void>(root.pathOf(at(name)))) << at(name);
    for (auto const* const name : {u"rooted", u"rooted/x", u"roo", u"", u"./root"})
        EXPECT_EQ(failureOf([&] { static_cast<void>(root.pathOf(at(name))); }),
                  failure(ErrorCode::PermissionDenied, at(name)));
    EXPECT_NO_THROW(static_cast<void>(Root("/").pathOf(folder.iri())));
}

TEST_F(ConfinedRoot, HasNoFolderOfItsOwn)
{
    FileDescriptor parent;
    std::string last;
    EXPECT_EQ(Root(folder / "root").openParent(folder / "root", parent, last), EBUSY);
    EXPECT_EQ(Root().openParent("/", parent, last), EBUSY);
    EXPECT_EQ(Root("/").openParent("/", parent, last), EBUSY);
    EXPECT_EQ(Root("/").openParent(folder / "root", parent, last), 0);
    EXPECT_EQ(last, "root");
}

TEST_F(ConfinedRoot, GoesNowhereElse)
{
    Root const root(folder / "root");
    fs::create_directory_symlink(folder / "root/folder", folder / "root/absolute");
    fs::create_directory_symlink("..", folder / "root/up");
    fs::create_directory_symlink("/proc/self", folder / "root/magic");
    for (std::string const name : {"absolute", "absolute/x", "up", "up/file", "..", "folder/../../file", "magic/root"})
    {
        std::string const path = folder / "root" / name;
        FileDescriptor file;
        Status status;
        EXPECT_EQ(root.open(path, O_RDONLY, file), EACCES) << name;
        EXPECT_EQ(root.getStatus(path, Links::Follow, status), EACCES) << name;
        EXPECT_EQ(root.checkAccess(path, R_OK), EACCES) << name;
        EXPECT_FALSE(root.leadsToFolder(path)) << name;
    }
    Located entry;
    EXPECT_EQ(root.locate(folder / "root/up/file", entry), EACCES);
    EXPECT_EQ(root.locate(folder / "root/..", entry), EACCES);
}

TEST_F(ConfinedRoot, IsTheFolderThatWasFound)
{
    Root const root(folder / "root");
    fs::rename(folder / "root", folder / "moved");
    fs::create_directory(folder / "root");
    EXPECT_FALSE(fs::exists(folder / "root/folder"));
    EXPECT_TRUE(root.leadsToFolder(folder / "root/folder"));
}

int attempts;

TEST_F(ConfinedRoot, ResolvesAgainWhenFoldersAreRenamedMeanwhile)
{
    Root const root(folder / "root");
    attempts = 0;
    ReplacedSystemCalls calls;
    calls->openat2 = [](int at, char const* path, open_how const* how, std::size_t size) {
        return ++attempts < 10 ? failWith(EAGAIN) : realSystemCalls.openat2(at, path, how, size);
    };
    FileDescriptor file;
    EXPECT_EQ(root.open(folder / "root/folder", O_RDONLY, file), 0);
    EXPECT_EQ(attempts, 10);
}

TEST_F(ConfinedRoot, GivesUpWhenThatNeverEnds)
{
    Root const root(folder / "root");
    attempts = 0;
    ReplacedSystemCalls calls;
    calls->openat2 = [](int, char const*, open_how const*, std::size_t) {
        ++attempts;
        return failWith(EAGAIN);
    };
    FileDescriptor file;
    EXPECT_EQ(root.open(folder / "root/folder", O_RDONLY, file), EAGAIN);
    EXPECT_GT(attempts, 100);
}

TEST_F(ConfinedRoot, FollowsNoLinksToOtherFileSystems)
{
    Root const root(folder / "root");
    static bool allowsLinks;
    allowsLinks = true;
    ReplacedSystemCalls calls;
    calls->openat2 = [](int at, char const* path, open_how const* how, std::size_t size) {
        if ((how->resolve & RESOLVE_NO_XDEV) != 0)
            return failWith(EXDEV);
        allowsLinks = (how->resolve & RESOLVE_NO_SYMLINKS) == 0;
        return realSystemCalls.openat2(at, path, how, size);
    };
    FileDescriptor file;
    EXPECT_EQ(root.open(folder / "root/folder", O_RDONLY, file), 0);
    EXPECT_FALSE(allowsLinks);
    fs::create_directory_symlink("folder", folder / "root/link");
    EXPECT_EQ(root.open(folder / "root/link", O_RDONLY, file), EACCES);
}

} // namespace
} // namespace foundation::storage::local::detail
