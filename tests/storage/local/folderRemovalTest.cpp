#include <storage/local/folderRemoval.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <cerrno>
#include <filesystem>
#include <map>
#include <string>
#include <string_view>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using detail::realSystemCalls;
using provider::ErrorCode;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

class FolderRemoval : public testing::Test
{
protected:
    FolderRemoval()
    {
        fs::create_directories(folder / "tree/inner/deep");
        for (char const* const name : {"file", "inner/stays", "inner/deep/file", "inner/deep/stays \xff", "z"})
            folder.write(std::string("tree/") + name, "");
    }

    std::map<std::u16string, ErrorCode> staying(std::u16string const& name) const
    {
        std::map<std::u16string, ErrorCode> found;
        for (StayingEntry const& entry : removeFolderAsFarAsPossible(folder.iri(name)))
            EXPECT_TRUE(found.emplace(entry.path, entry.reason).second);
        return found;
    }

    TemporaryFolder folder;
};

TEST_F(FolderRemoval, NamesNothingWhenAllIsGone)
{
    EXPECT_TRUE(staying(u"tree").empty());
    EXPECT_FALSE(fs::exists(folder / "tree"));
}

TEST_F(FolderRemoval, NamesEachThatStaysAndRemovesTheRest)
{
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int at, char const* path, int flags) {
        return std::string_view(path).starts_with("stays") ? failWith(flags == 0 ? EPERM : EIO)
                                                           : realSystemCalls.unlinkat(at, path, flags);
    };
    EXPECT_EQ(staying(u"tree"),
              (std::map<std::u16string, ErrorCode>{{u"inner/stays", ErrorCode::PermissionDenied},
                                                   {u"inner/deep/stays \uEFFF", ErrorCode::PermissionDenied}}));
    EXPECT_EQ(std::distance(fs::recursive_directory_iterator(folder / "tree"), {}), 4);
}

TEST_F(FolderRemoval, NamesTheFolderItselfWithoutAPath)
{
    ReplacedSystemCalls calls;
    calls->unlinkat = [](int at, char const* path, int flags) {
        return std::string_view(path) == "tree" ? failWith(EACCES) : realSystemCalls.unlinkat(at, path, flags);
    };
    EXPECT_EQ(staying(u"tree"), (std::map<std::u16string, ErrorCode>{{u"", ErrorCode::PermissionDenied}}));
    EXPECT_TRUE(fs::is_empty(folder / "tree"));
}

TEST_F(FolderRemoval, FailsForWhatIsNoFolder)
{
    fs::create_directory_symlink("tree", folder / "link");
    EXPECT_EQ(failureOf([&] { staying(u"missing"); }), failure(ErrorCode::ResourceNotFound, folder.iri(u"missing")));
    EXPECT_EQ(failureOf([&] { staying(u"link"); }), failure(ErrorCode::InvalidLocation, folder.iri(u"link")));
    EXPECT_EQ(failureOf([&] { staying(u"tree/."); }), failure(ErrorCode::InvalidLocation, folder.iri(u"tree/.")));
    EXPECT_TRUE(fs::exists(folder / "tree/inner/deep/file"));
}

} // namespace
} // namespace foundation::storage::local
