#include <storage/local/detail/FolderReader.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <map>
#include <string>
#include <sys/stat.h>

namespace foundation::storage::local::detail {
namespace {

namespace fs = std::filesystem;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

using Types = std::map<std::string, unsigned char>;

FolderReader open(fs::path const& path)
{
    return FolderReader(FileDescriptor(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)));
}

Types readAll(FolderReader& reader)
{
    Types types;
    FoundName found;
    while (reader.next(found) == 0 && !found.name.empty())
        types.emplace(found.name, found.type);
    return types;
}

class FolderReaderTest : public testing::Test
{
protected:
    TemporaryFolder folder;
};

TEST_F(FolderReaderTest, GivesNamesAndTypes)
{
    folder.write("file", "");
    folder.write("..more", "");
    fs::create_directory(folder / "folder");
    fs::create_symlink("file", folder / "link");
    ::mkfifo((folder / "pipe").c_str(), 0600);
    FolderReader reader = open(folder.path());
    EXPECT_EQ(readAll(reader),
              (Types{{"file", DT_REG}, {"..more", DT_REG}, {"folder", DT_DIR}, {"link", DT_LNK}, {"pipe", DT_FIFO}}));
}

TEST_F(FolderReaderTest, StaysAtTheEndUntilItStartsAgain)
{
    folder.write("first", "");
    FolderReader reader = open(folder.path());
    readAll(reader);
    folder.write("second", "");
    EXPECT_EQ(readAll(reader), Types{});
    EXPECT_EQ(reader.restart(), 0);
    EXPECT_EQ(readAll(reader), (Types{{"first", DT_REG}, {"second", DT_REG}}));
}

TEST_F(FolderReaderTest, FindsNothingInAFolderThatWasRemoved)
{
    fs::create_directory(folder / "removed");
    FolderReader reader = open(folder / "removed");
    fs::remove(folder / "removed");
    FoundName found;
    EXPECT_EQ(reader.next(found), 0);
    EXPECT_TRUE(found.name.empty());
    EXPECT_EQ(reader.restart(), 0);
    EXPECT_EQ(reader.next(found), 0);
    EXPECT_TRUE(found.name.empty());
}

TEST_F(FolderReaderTest, AnswersWhatFails)
{
    FolderReader reader = open(folder.path());
    ReplacedSystemCalls replaced;
    replaced->getdents64 = [](int, void*, std::size_t) -> ssize_t { return failWith(EIO); };
    replaced->lseek = [](int, off_t, int) -> off_t { return failWith(EINVAL); };
    FoundName found{"old", DT_REG};
    EXPECT_EQ(reader.next(found), EIO);
    EXPECT_TRUE(found.name.empty());
    EXPECT_EQ(reader.restart(), EINVAL);
}

} // namespace
} // namespace foundation::storage::local::detail
