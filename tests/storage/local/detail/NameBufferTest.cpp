#include <storage/local/detail/NameBuffer.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/FileDescriptor.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <fcntl.h>
#include <set>
#include <string>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace foundation::storage::local::detail {
namespace {

using tests::support::TemporaryFolder;

class NameBufferTest : public testing::Test
{
protected:
    NameBufferTest()
    {
        for (char const* const name : {"a", "b", "c"})
            folder.write(name, "");
        opened = FileDescriptor(::open(folder.path().c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    }

    FoundName next()
    {
        FoundName found;
        EXPECT_EQ(names.next(opened.get(), found), 0);
        return found;
    }

    TemporaryFolder folder;
    FileDescriptor opened;
    NameBuffer names;
};

TEST_F(NameBufferTest, TellsTheInodes)
{
    for (FoundName found = next(); !found.name.empty(); found = next()) {
        struct stat status;
        ASSERT_EQ(::stat((folder / std::string(found.name)).c_str(), &status), 0);
        EXPECT_EQ(found.inode, status.st_ino);
    }
}

TEST_F(NameBufferTest, TellsWhereToReadOn)
{
    next();
    ASSERT_NE(::lseek(opened.get(), next().end, SEEK_SET), -1);
    names.clear();
    std::string const last(next().name);
    EXPECT_FALSE(last.empty());
    EXPECT_EQ(next().name, "");
    ASSERT_NE(::lseek(opened.get(), 0, SEEK_SET), -1);
    std::string before;
    for (FoundName name = next(); !name.name.empty(); name = next())
        before = name.name;
    EXPECT_EQ(last, before);
}

TEST_F(NameBufferTest, GivesTheRestAway)
{
    std::multiset<std::string> found{std::string(next().name)};
    std::vector<char> const rest = names.takeRest();
    EXPECT_EQ(next().name, "") << "all has been read";
    names.putRest(rest);
    found.emplace(next().name);
    found.emplace(next().name);
    EXPECT_EQ(found, (std::multiset<std::string>{"a", "b", "c"}));
    EXPECT_EQ(next().name, "");
}

} // namespace
} // namespace foundation::storage::local::detail
