#include <storage/local/detail/ScratchFile.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/storage/local/detail/ScratchFileFixture.hpp>
#include <tests/storage/local/namelessFiles.hpp>
#include <tests/support/failureOf.hpp>

#include <filesystem>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

// Scratch files that have no name before they are committed.

namespace foundation::storage::local::detail {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::hasNamelessFiles;
using tests::support::ReplacedSystemCalls;

class ScratchFileNamelessTest : public ScratchFileTest
{};

TEST_F(ScratchFileNamelessTest, HasNoNameWhereItReplacesNothingAndNeedNotSurvive)
{
    if (!hasNamelessFiles(folder.path()))
        GTEST_SKIP() << "the file system has no files without names";
    for (auto const policy : {preserve, overwrite}) {
        auto const scratch = begin(u"file", Durability::None);
        EXPECT_EQ(names(), Names{});
        scratch->commit(policy);
        EXPECT_EQ(folder.read("file"), "new");
        EXPECT_EQ(names(), Names{"file"});
        fs::remove(folder / "file");
    }
}

TEST_F(ScratchFileNamelessTest, HasANameWhereTheFileSystemHasNoFilesWithoutNames)
{
    ReplacedSystemCalls replaced;
    replaced->openat = [](int at, char const* path, int flags, mode_t mode) {
        return (flags & O_TMPFILE) == O_TMPFILE ? failWith(EOPNOTSUPP) : ::openat(at, path, flags, mode);
    };
    auto const scratch = begin(u"file", Durability::None);
    EXPECT_EQ(names().size(), 1u);
    scratch->commit(preserve);
    EXPECT_EQ(folder.read("file"), "new");
    EXPECT_EQ(names(), Names{"file"});
}

TEST_F(ScratchFileNamelessTest, WithoutANameReplacesWhatTurnsUpMeanwhileWhereItMay)
{
    fs::create_symlink("file", folder / "link");
    for (char16_t const* const name : {u"file", u"link"}) {
        auto const refused = begin(name, Durability::None);
        auto const replacing = begin(name, Durability::None);
        fs::permissions(folder.write("file", "old"), fs::perms(0600));
        EXPECT_EQ(failureOf([&] { refused->commit(preserve); }), failure(ErrorCode::ResourceAlreadyExists, at(name)));
        EXPECT_EQ(folder.read("file"), "old");
        replacing->commit(overwrite);
        EXPECT_EQ(names(), (Names{"file", "link"}));
        fs::remove(folder / "file");
    }
    EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(folder / "link")));
    EXPECT_EQ(folder.read("link"), "new");
    EXPECT_EQ(modeOf("link"), 0600u);
}

TEST_F(ScratchFileNamelessTest, WithoutANameReplacesNoFolderThatTurnsUpMeanwhile)
{
    for (auto const policy : {preserve, overwrite}) {
        auto const scratch = begin(u"folder", Durability::None);
        fs::create_directory(folder / "folder");
        EXPECT_EQ(failureOf([&] { scratch->commit(policy); }),
                  failure(ErrorCode::ResourceAlreadyExists, at(u"folder")));
        EXPECT_EQ(names(), Names{"folder"});
        fs::remove(folder / "folder");
    }
}

TEST_F(ScratchFileNamelessTest, IsNamedByWayOfProcByThoseWhoMayNotNameDescriptors)
{
    ReplacedSystemCalls replaced;
    replaced->linkat = [](int from, char const* name, int to, char const* newName, int flags) {
        return (flags & AT_EMPTY_PATH) != 0 ? failWith(ENOENT) : ::linkat(from, name, to, newName, flags);
    };
    begin(u"file", Durability::None)->commit(preserve);
    EXPECT_EQ(folder.read("file"), "new");
    EXPECT_EQ(failureOf([&] { begin(u"missing/file", Durability::None); }),
              failure(ErrorCode::ResourceNotFound, at(u"missing/file")));
}

TEST_F(ScratchFileNamelessTest, IsCopiedToOneWithANameWhereItCannotGetOne)
{
    mode_t const previous = ::umask(077);
    for (auto const policy : {preserve, overwrite}) {
        auto const scratch = begin(u"file", Durability::None);
        auto const late = begin(u"file", Durability::None);
        int const file = scratch->file().get();
        timespec const times[]{{.tv_sec = 1, .tv_nsec = 2}, {.tv_sec = 3, .tv_nsec = 4}};
        ASSERT_EQ(::futimens(file, times), 0);
        ASSERT_EQ(::fchmod(file, 0644), 0);
        bool const hasAttribute = ::fsetxattr(file, "user.a", "b", 1, 0) == 0;
        ReplacedSystemCalls replaced;
        replaced->linkat = [](int, char const*, int, char const*, int) { return failWith(EPERM); };
        scratch->commit(policy);
        EXPECT_EQ(folder.read("file"), "new");
        struct stat status
        {};
        ASSERT_EQ(::stat((folder / "file").c_str(), &status), 0);
        EXPECT_EQ(status.st_mode & 07777u, 0644u);
        EXPECT_EQ(status.st_mtim.tv_sec, 3);
        EXPECT_EQ(status.st_mtim.tv_nsec, 4);
        EXPECT_EQ(::getxattr((folder / "file").c_str(), "user.a", nullptr, 0), hasAttribute ? 1 : -1);
        EXPECT_EQ(failureOf([&] { late->commit(preserve); }), failure(ErrorCode::ResourceAlreadyExists, at(u"file")));
        late->discard();
        EXPECT_EQ(names(), Names{"file"});
        fs::remove(folder / "file");
    }
    ::umask(previous);
}

TEST_F(ScratchFileNamelessTest, CanBeCommittedAgainWhenThatCopyFailed)
{
    if (!hasNamelessFiles(folder.path()))
        GTEST_SKIP() << "the file system has no files without names";
    auto const scratch = begin(u"file", Durability::None);
    {
        ReplacedSystemCalls replaced;
        replaced->linkat = [](int, char const*, int, char const*, int) { return failWith(EPERM); };
        replaced->write = [](int, void const*, std::size_t) { return static_cast<ssize_t>(failWith(ENOSPC)); };
        EXPECT_EQ(failureOf([&] { scratch->commit(preserve); }), failure(ErrorCode::NoSpaceLeft, at(u"file")));
        EXPECT_EQ(names(), Names{});
    }
    scratch->commit(preserve);
    EXPECT_EQ(folder.read("file"), "new");
    EXPECT_EQ(names(), Names{"file"});
}

} // namespace
} // namespace foundation::storage::local::detail
