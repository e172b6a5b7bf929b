#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/SystemCalls.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <array>
#include <boost/property_tree/ptree.hpp>
#include <filesystem>
#include <fstream>
#include <string>
#include <string_view>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using namespace std::string_view_literals;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

std::string const moved = "no failure";

struct stat statusOf(fs::path const& path)
{
    struct stat status = {};
    EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
    return status;
}

void setTimes(fs::path const& path)
{
    std::array<timespec, 2> const times{timespec{.tv_sec = 1'000'000'000, .tv_nsec = 123'456'789},
                                        timespec{.tv_sec = 1'100'000'000, .tv_nsec = 987'654'321}};
    ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), times.data(), AT_SYMLINK_NOFOLLOW), 0);
}

void expectTimes(fs::path const& path)
{
    struct stat const status = statusOf(path);
    EXPECT_EQ(status.st_atim.tv_sec, 1'000'000'000);
    EXPECT_EQ(status.st_atim.tv_nsec, 123'456'789);
    EXPECT_EQ(status.st_mtim.tv_sec, 1'100'000'000);
    EXPECT_EQ(status.st_mtim.tv_nsec, 987'654'321);
}

std::string attributeOf(fs::path const& path)
{
    std::array<char, 64> value;
    ssize_t const size = ::getxattr(path.c_str(), "user.colour", value.data(), value.size());
    return size == -1 ? "none" : std::string(value.data(), static_cast<std::size_t>(size));
}

std::size_t countIn(TemporaryFolder const& folder)
{
    return static_cast<std::size_t>(std::distance(fs::directory_iterator(folder.path()), fs::directory_iterator()));
}

/// A folder on each of two file systems.
class LocalProviderMovesAcrossFileSystems : public testing::Test
{
protected:
    void SetUp() override
    {
        if (statusOf(from.path()).st_dev == statusOf(to.path()).st_dev)
            GTEST_SKIP() << "the folder for temporary files and /dev/shm are on one file system";
    }

    std::string moveFile(std::u16string const& name, std::u16string const& target,
                         ReplacementPolicy policy = ReplacementPolicy::Preserve) const
    {
        return failureOf([&] { provider.moveFile(from.iri(name), to.iri(target), policy); });
    }

    std::string moveFolder(std::u16string const& name, std::u16string const& target,
                           ReplacementPolicy policy = ReplacementPolicy::Preserve) const
    {
        return failureOf([&] { provider.moveFolder(from.iri(name), to.iri(target), policy); });
    }

    TemporaryFolder const from;
    TemporaryFolder const to{"/dev/shm"};
    LocalProvider provider;
};

TEST_F(LocalProviderMovesAcrossFileSystems, TakeTheContentAndLeaveNothing)
{
    std::string const content(3'000'000, 'x');
    from.write("file", content + "end");
    EXPECT_EQ(moveFile(u"file", u"new"), moved);
    EXPECT_EQ(to.read("new"), content + "end");
    EXPECT_EQ(countIn(from), 0u);
    EXPECT_EQ(countIn(to), 1u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, TakeAnEmptyFile)
{
    from.write("file", "");
    EXPECT_EQ(moveFile(u"file", u"new"), moved);
    EXPECT_EQ(to.read("new"), "");
    EXPECT_EQ(countIn(from), 0u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, KeepPermissionsTimesAndAttributes)
{
    from.write("file", "content");
    ASSERT_EQ(::chmod((from / "file").c_str(), 06751), 0);
    if (::setxattr((from / "file").c_str(), "user.colour", "red", 3, 0) != 0)
        GTEST_SKIP() << "the folder for temporary files has no extended attributes";
    setTimes(from / "file");
    EXPECT_EQ(moveFile(u"file", u"new"), moved);
    EXPECT_EQ(statusOf(to / "new").st_mode & 07777u, 06751u);
    EXPECT_EQ(attributeOf(to / "new"), "red");
    expectTimes(to / "new");
}

TEST_F(LocalProviderMovesAcrossFileSystems, KeepTheOwnerWhereTheyMay)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only the superuser gives files away";
    from.write("file", "content");
    ASSERT_EQ(::chown((from / "file").c_str(), 12345, 54321), 0);
    EXPECT_EQ(moveFile(u"file", u"new"), moved);
    EXPECT_EQ(statusOf(to / "new").st_uid, 12345u);
    EXPECT_EQ(statusOf(to / "new").st_gid, 54321u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, DropSetUserIdWhereTheOwnerIsNotKept)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only the superuser gives files away";
    from.write("file", "content");
    ASSERT_EQ(::chown((from / "file").c_str(), 12345, 54321), 0);
    ASSERT_EQ(::chmod((from / "file").c_str(), 06755), 0);
    ReplacedSystemCalls replaced;
    replaced->fchownat = [](int, char const*, uid_t, gid_t, int) { return failWith(EPERM); };
    EXPECT_EQ(moveFile(u"file", u"new"), moved);
    EXPECT_EQ(statusOf(to / "new").st_mode & 07777u, 0755u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, ReplaceOnlyWhereThePolicySaysSo)
{
    from.write("file", "content");
    to.write("old", "old");
    ASSERT_EQ(::chmod((to / "old").c_str(), 0600), 0);
    ASSERT_EQ(::chmod((from / "file").c_str(), 0640), 0);
    auto const taken = failure(ErrorCode::ResourceAlreadyExists, to.iri(u"old"));
    EXPECT_EQ(moveFile(u"file", u"old", ReplacementPolicy::Preserve), taken);
    EXPECT_EQ(moveFile(u"file", u"old", ReplacementPolicy::NoClobber), taken);
    EXPECT_EQ(to.read("old"), "old");
    EXPECT_EQ(moveFile(u"file", u"old", ReplacementPolicy::Overwrite), moved);
    EXPECT_EQ(to.read("old"), "content");
    EXPECT_EQ(statusOf(to / "old").st_mode & 07777u, 0640u);
    EXPECT_EQ(countIn(from), 0u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, MoveLinksThemselves)
{
    from.write("file", "content");
    for (char const* const name : {"link", "other link"})
        fs::create_symlink("file", from / name);
    to.write("old", "old");
    setTimes(from / "link");
    EXPECT_EQ(moveFile(u"link", u"new"), moved);
    expectTimes(to / "new"); // before the link is read
    EXPECT_EQ(moveFile(u"other link", u"old", ReplacementPolicy::Clobber), moved);
    EXPECT_EQ(fs::read_symlink(to / "new"), "file");
    EXPECT_EQ(fs::read_symlink(to / "old"), "file");
    EXPECT_EQ(countIn(from), 1u);
    EXPECT_EQ(countIn(to), 2u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, RefuseWhatIsNeitherFileNorLink)
{
    ASSERT_EQ(::mkfifo((from / "pipe").c_str(), 0600), 0);
    EXPECT_EQ(moveFile(u"pipe", u"new"), failure(ErrorCode::UnsupportedOperation, from.iri(u"pipe")));
    EXPECT_TRUE(fs::exists(from / "pipe"));
    EXPECT_EQ(countIn(to), 0u);
}

fs::path changing;

void appendToChanging()
{
    std::ofstream(changing, std::ios::app) << "more";
}

TEST_F(LocalProviderMovesAcrossFileSystems, LeaveBothEndsWhenTheSourceChangesMeanwhile)
{
    changing = from.write("file", "content");
    to.write("old", "old");
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int file) {
        appendToChanging();
        return realSystemCalls.fsync(file);
    };
    auto const changed = failure(ErrorCode::ResourceInUse, from.iri(u"file"));
    EXPECT_EQ(moveFile(u"file", u"old", ReplacementPolicy::Overwrite), changed);
    EXPECT_EQ(from.read("file"), "contentmore");
    EXPECT_EQ(to.read("old"), "old");
    EXPECT_EQ(countIn(to), 1u);
}

fs::path newVersion;

/// Renames the new version onto what changes, once, when that is about to be renamed or removed by its name.
void replaceBefore(std::string_view name)
{
    if (name == changing.filename().native() && fs::exists(newVersion))
        fs::rename(newVersion, changing);
}

void replaceChangingBeforeItGoes(ReplacedSystemCalls& replaced)
{
    replaced->renameat2 = [](int fromFolder, char const* old, int toFolder, char const* name, unsigned flags) {
        if (fromFolder == toFolder)
            replaceBefore(old);
        return realSystemCalls.renameat2(fromFolder, old, toFolder, name, flags);
    };
    replaced->unlinkat = [](int folder, char const* path, int flags) {
        replaceBefore(path);
        return realSystemCalls.unlinkat(folder, path, flags);
    };
}

TEST_F(LocalProviderMovesAcrossFileSystems, KeepASourceThatIsReplacedRightBeforeItGoes)
{
    changing = from.write("file", "content");
    newVersion = from.write("new version", "new");
    ReplacedSystemCalls replaced;
    replaceChangingBeforeItGoes(replaced);
    EXPECT_EQ(moveFile(u"file", u"new"), failure(ErrorCode::ResourceInUse, from.iri(u"file")));
    EXPECT_EQ(from.read("file"), "new");
    EXPECT_EQ(to.read("new"), "content");
    EXPECT_EQ(countIn(from), 1u);
    EXPECT_EQ(countIn(to), 1u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, LeaveBothEndsWhenTheDiskHoldsSomethingElse)
{
    from.write("file", "content");
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int file) {
        char const wrong = 'X';
        EXPECT_EQ(::pwrite(file, &wrong, 1, 3), 1);
        return realSystemCalls.fsync(file);
    };
    EXPECT_EQ(moveFile(u"file", u"new"), failure(ErrorCode::IOError, to.iri(u"new")));
    EXPECT_EQ(from.read("file"), "content");
    EXPECT_EQ(countIn(to), 0u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, NameATargetThatCannotKeepTheAttributes)
{
    from.write("file", "content");
    if (::setxattr((from / "file").c_str(), "user.colour", "red", 3, 0) != 0)
        GTEST_SKIP() << "the folder for temporary files has no extended attributes";
    ReplacedSystemCalls replaced;
    replaced->fsetxattr = [](int, char const*, void const*, std::size_t, int) { return failWith(EOPNOTSUPP); };
    EXPECT_EQ(moveFile(u"file", u"new"), failure(ErrorCode::UnsupportedOperation, to.iri(u"new")));
    EXPECT_EQ(from.read("file"), "content");
    EXPECT_EQ(countIn(to), 0u);
}

TEST_F(LocalProviderMovesAcrossFileSystems, SyncWhateverTheSettingSays)
{
    boost::property_tree::ptree settings;
    settings.put("durability", "none");
    provider.configure(settings);
    from.write("file", "content");
    static int syncs;
    syncs = 0;
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int file) {
        ++syncs;
        return realSystemCalls.fsync(file);
    };
    replaced->unlinkat = [](int folder, char const* path, int flags) {
        EXPECT_GE(syncs, 2) << "content and folder";
        return realSystemCalls.unlinkat(folder, path, flags);
    };
    EXPECT_EQ(moveFile(u"file", u"new"), moved);
    EXPECT_FALSE(fs::exists(from / "file"));
}

/// Whether this opens a folder of a file system to read it.
bool readsFolderOf(dev_t device, int at, int flags)
{
    struct stat status = {};
    return (flags & O_DIRECTORY) != 0 && (flags & (O_PATH | O_TMPFILE)) == O_DIRECTORY && ::fstat(at, &status) == 0 &&
           status.st_dev == device;
}

TEST_F(LocalProviderMovesAcrossFileSystems, SyncTheFileSystemOfASourceWhoseFolderMayNotBeRead)
{
    from.write("file", "content");
    static dev_t device;
    static std::vector<dev_t> synced;
    device = statusOf(from.path()).st_dev;
    synced.clear();
    ReplacedSystemCalls replaced;
    replaced->openat = [](int at, char const* path, int flags, mode_t mode) {
        return readsFolderOf(device, at, flags) ? failWith(EACCES) : realSystemCalls.openat(at, path, flags, mode);
    };
    replaced->syncfs = [](int descriptor) {
        struct stat status = {};
        EXPECT_EQ(::fstat(descriptor, &status), 0);
        synced.push_back(status.st_dev);
        return realSystemCalls.syncfs(descriptor);
    };
    EXPECT_EQ(moveFile(u"file", u"new"), moved);
    EXPECT_EQ(synced, std::vector<dev_t>{device});
    EXPECT_EQ(countIn(from), 0u);
}

class LocalProviderFolderMovesAcrossFileSystems : public LocalProviderMovesAcrossFileSystems
{
protected:
    void SetUp() override
    {
        LocalProviderMovesAcrossFileSystems::SetUp();
        if (IsSkipped())
            return;
        fs::create_directories(from / "tree/a/b");
        from.write("tree/file", "1");
        from.write("tree/a/b/inner", "2");
        fs::create_symlink("../file", from / "tree/a/link");
        fs::create_hard_link(from / "tree/file", from / "tree/a/second name");
    }

    bool isSourceWhole() const
    {
        return from.read("tree/file") == "1" && from.read("tree/a/b/inner") == "2" &&
               fs::is_symlink(from / "tree/a/link") && from.read("tree/a/second name") == "1";
    }
};

TEST_F(LocalProviderFolderMovesAcrossFileSystems, TakeAllAndLeaveNothing)
{
    setTimes(from / "tree/a/b/inner");
    setTimes(from / "tree/a");
    ASSERT_EQ(::chmod((from / "tree/a/b").c_str(), 02750), 0);
    EXPECT_EQ(moveFolder(u"tree", u"new"), moved);
    EXPECT_EQ(countIn(from), 0u);
    EXPECT_EQ(countIn(to), 1u);
    EXPECT_EQ(to.read("new/file"), "1");
    EXPECT_EQ(to.read("new/a/b/inner"), "2");
    EXPECT_EQ(to.read("new/a/second name"), "1");
    EXPECT_EQ(fs::read_symlink(to / "new/a/link"), "../file");
    EXPECT_EQ(statusOf(to / "new/a/b").st_mode & 07777u, 02750u);
    EXPECT_EQ(statusOf(to / "new/a/b/inner").st_mtim.tv_nsec, 987'654'321);
    EXPECT_EQ(statusOf(to / "new/a").st_mtim.tv_nsec, 987'654'321);
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, TakeADeepTree)
{
    fs::path path = "tree";
    for (int i = 0; i < 200; ++i)
        path /= "deeper";
    fs::create_directories(from / path.native());
    from.write((path / "deepest").native(), "3");
    EXPECT_EQ(moveFolder(u"tree", u"tree"), moved);
    EXPECT_EQ(to.read((path / "deepest").native()), "3");
    EXPECT_EQ(countIn(from), 0u);
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, ReplaceNothing)
{
    fs::create_directory(to / "empty");
    for (auto const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::Overwrite})
        EXPECT_EQ(moveFolder(u"tree", u"empty", policy), failure(ErrorCode::ResourceAlreadyExists, to.iri(u"empty")));
    EXPECT_TRUE(isSourceWhole());
    EXPECT_TRUE(fs::is_empty(to / "empty"));
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, RefuseSpecialFilesBeforeAnythingIsCopied)
{
    ASSERT_EQ(::mkfifo((from / "tree/a/b/pipe").c_str(), 0600), 0);
    ReplacedSystemCalls replaced;
    replaced->mkdirat = [](int, char const*, mode_t) {
        ADD_FAILURE() << "a folder is made";
        return failWith(EIO);
    };
    EXPECT_EQ(moveFolder(u"tree", u"new"), failure(ErrorCode::UnsupportedOperation, from.iri(u"tree/a/b/pipe")));
    EXPECT_TRUE(isSourceWhole());
    EXPECT_EQ(countIn(to), 0u);
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, LeaveBothEndsWhenAFileChangesAfterItWasCopied)
{
    changing = from / "tree/file";
    ReplacedSystemCalls replaced;
    replaced->syncfs = [](int folder) {
        appendToChanging();
        return realSystemCalls.syncfs(folder);
    };
    std::string const result = moveFolder(u"tree", u"new");
    EXPECT_TRUE(result == failure(ErrorCode::ResourceInUse, from.iri(u"tree/file")) ||
                result == failure(ErrorCode::ResourceInUse, from.iri(u"tree/a/second name")))
        << result;
    EXPECT_EQ(from.read("tree/file"), "1more");
    EXPECT_EQ(from.read("tree/a/b/inner"), "2");
    EXPECT_EQ(countIn(to), 0u);
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, KeepWhatCameIntoTheSourceAtTheLastMoment)
{
    changing = from / "tree/a/late";
    ReplacedSystemCalls replaced;
    replaced->renameat2 = [](int fromFolder, char const* old, int toFolder, char const* name, unsigned flags) {
        int const result = realSystemCalls.renameat2(fromFolder, old, toFolder, name, flags);
        if (result == 0 && name == "new"sv)
            appendToChanging();
        return result;
    };
    EXPECT_EQ(moveFolder(u"tree", u"new"), failure(ErrorCode::ResourceInUse, from.iri(u"tree/a/late")));
    EXPECT_EQ(from.read("tree/a/late"), "more");
    EXPECT_EQ(to.read("new/a/b/inner"), "2");
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, KeepAnEmptyFolderThatCameIntoTheSourceAtTheLastMoment)
{
    changing = from / "tree/a/late";
    ReplacedSystemCalls replaced;
    replaced->renameat2 = [](int fromFolder, char const* old, int toFolder, char const* name, unsigned flags) {
        int const result = realSystemCalls.renameat2(fromFolder, old, toFolder, name, flags);
        if (result == 0 && name == "new"sv)
            fs::create_directory(changing);
        return result;
    };
    EXPECT_EQ(moveFolder(u"tree", u"new"), failure(ErrorCode::ResourceInUse, from.iri(u"tree/a/late")));
    EXPECT_TRUE(fs::is_directory(from / "tree/a/late"));
    EXPECT_FALSE(fs::exists(to / "new/a/late"));
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, KeepAnEntryThatIsReplacedRightBeforeItGoes)
{
    changing = from / "tree/a/b/inner";
    newVersion = from.write("new version", "new");
    ReplacedSystemCalls replaced;
    replaceChangingBeforeItGoes(replaced);
    EXPECT_EQ(moveFolder(u"tree", u"new"), failure(ErrorCode::ResourceInUse, from.iri(u"tree/a/b/inner")));
    EXPECT_EQ(from.read("tree/a/b/inner"), "new");
    EXPECT_EQ(to.read("new/a/b/inner"), "2");
    EXPECT_EQ(std::distance(fs::directory_iterator(from / "tree/a/b"), fs::directory_iterator()), 1);
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, KeepAnEmptyFolderThatIsPutInPlaceOfAnotherRightBeforeThatGoes)
{
    changing = from / "tree/a/b";
    newVersion = from / "new version";
    fs::create_directory(newVersion);
    ReplacedSystemCalls replaced;
    replaceChangingBeforeItGoes(replaced);
    EXPECT_EQ(moveFolder(u"tree", u"new"), failure(ErrorCode::ResourceInUse, from.iri(u"tree/a/b")));
    EXPECT_TRUE(fs::is_directory(from / "tree/a/b"));
    EXPECT_EQ(to.read("new/a/b/inner"), "2");
}

TEST_F(LocalProviderFolderMovesAcrossFileSystems, StayBeneathTheRoot)
{
    boost::property_tree::ptree settings;
    settings.put("root", from.path().native());
    provider.configure(settings);
    EXPECT_EQ(moveFolder(u"tree", u"new"), failure(ErrorCode::PermissionDenied, to.iri(u"new")));
    fs::create_directory_symlink(to.path(), from / "way out");
    EXPECT_EQ(failureOf([&] {
                  provider.moveFolder(from.iri(u"tree"), from.iri(u"way out/new"), ReplacementPolicy::Preserve);
              }),
              failure(ErrorCode::PermissionDenied, from.iri(u"way out/new")));
    EXPECT_TRUE(isSourceWhole());
    EXPECT_EQ(countIn(to), 0u);
}

} // namespace
} // namespace foundation::storage::local
