#include <storage/local/folderCopies.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <array>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <string>
#include <string_view>
#include <sys/stat.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using provider::ErrorCode;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

class FolderCopies : public testing::Test
{
protected:
    FolderCopies()
    {
        fs::create_directory(folder / "source");
        fs::create_directory(folder / "copy");
        fs::create_directory_symlink("source", folder / "link");
        fs::permissions(folder / "source", fs::perms(0510));
        std::array<timespec, 2> const times{timespec{.tv_sec = 0, .tv_nsec = UTIME_OMIT},
                                            timespec{.tv_sec = 1'100'000'000, .tv_nsec = 987'654'321}};
        EXPECT_EQ(::utimensat(AT_FDCWD, (folder / "source").c_str(), times.data(), 0), 0);
    }

    ~FolderCopies() override
    {
        for (char const* const name : {"source", "copy"})
            fs::permissions(folder / name, fs::perms(0700));
    }

    void finish(FolderCopyOptions const& options) const
    {
        finishFolderCopy(folder.iri(u"source"), folder.iri(u"copy"), options);
    }

    struct stat status() const
    {
        struct stat status = {};
        EXPECT_EQ(::stat((folder / "copy").c_str(), &status), 0);
        return status;
    }

    unsigned mode() const { return status().st_mode & 07777U; }
    bool hasTime() const { return status().st_mtim.tv_sec == 1'100'000'000 && status().st_mtim.tv_nsec == 987'654'321; }

    TemporaryFolder const folder;
};

TEST_F(FolderCopies, ShowNothingThatTheSourceDoesNotShowWhileTheyAreFilled)
{
    fs::permissions(folder / "copy", fs::perms(0755));
    prepareFolderCopy(folder.iri(u"source"), folder.iri(u"copy"));
    EXPECT_EQ(mode(), 0710U);
}

TEST_F(FolderCopies, GetNoPermissionsThatTheUmaskTookFromThem)
{
    fs::permissions(folder / "copy", fs::perms(0700));
    prepareFolderCopy(folder.iri(u"source"), folder.iri(u"copy"));
    EXPECT_EQ(mode(), 0700U);
    finish({.keepsPermissions = true});
    EXPECT_EQ(mode(), 0500U);
}

TEST_F(FolderCopies, KeepOfTheirSourceWhatIsAskedFor)
{
    fs::permissions(folder / "copy", fs::perms(0755));
    finish({});
    EXPECT_EQ(mode(), 0755U);
    EXPECT_FALSE(hasTime());
    finish({.keepsMetadata = true});
    EXPECT_EQ(mode(), 0755U);
    EXPECT_TRUE(hasTime());
    finish({.keepsPermissions = true});
    EXPECT_EQ(mode(), 0510U);
}

TEST_F(FolderCopies, AreNotMadeThroughLinks)
{
    auto const prepare = [&](std::u16string const& from, std::u16string const& to) {
        return failureOf([&] { prepareFolderCopy(folder.iri(from), folder.iri(to)); });
    };
    EXPECT_EQ(prepare(u"link", u"copy"), failure(ErrorCode::ResourceNotFound, folder.iri(u"link")));
    EXPECT_EQ(prepare(u"source", u"link"), failure(ErrorCode::ResourceNotFound, folder.iri(u"link")));
}

TEST_F(FolderCopies, FailWhereTheTargetKeepsNoAttributesAndAreLeftAsTheyAre)
{
    ReplacedSystemCalls replaced;
    replaced->flistxattr = [](int, char* list, std::size_t) -> ssize_t {
        constexpr std::string_view names("user.a\0", 7);
        names.copy(list, names.size());
        return static_cast<ssize_t>(names.size());
    };
    replaced->fgetxattr = [](int, char const*, void*, std::size_t) -> ssize_t { return 0; };
    replaced->fsetxattr = [](int, char const*, void const*, std::size_t, int) { return failWith(EOPNOTSUPP); };
    fs::permissions(folder / "copy", fs::perms(0755));
    FolderCopyOptions const everything{.keepsPermissions = true, .keepsMetadata = true};
    EXPECT_EQ(failureOf([&] { finish(everything); }), failure(ErrorCode::UnsupportedOperation, folder.iri(u"copy")));
    EXPECT_EQ(mode(), 0755U);
    EXPECT_FALSE(hasTime());
}

} // namespace
} // namespace foundation::storage::local
