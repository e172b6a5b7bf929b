#include <storage/local/detail/Inotify.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/SystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <sys/inotify.h>

namespace foundation::storage::local::detail {
namespace {

using tests::support::TemporaryFolder;

std::string bytesOf(int watch, std::uint32_t mask, std::uint32_t cookie, std::string name)
{
    inotify_event event{};
    event.wd = watch;
    event.mask = mask;
    event.cookie = cookie;
    if (!name.empty())
        name.resize((name.size() / sizeof event + 1) * sizeof event, '\0');
    event.len = static_cast<std::uint32_t>(name.size());
    std::string bytes(sizeof event, '\0');
    std::memcpy(bytes.data(), &event, sizeof event);
    return bytes + name;
}

FileDescriptor opened(std::filesystem::path const& path)
{
    return FileDescriptor(::open(path.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
}

TEST(ParseEvents, OfNothingAreNone)
{
    EXPECT_TRUE(parseEvents({}).empty());
}

TEST(ParseEvents, FindsEachWithItsNameWhateverThePadding)
{
    std::string const longName(255, 'x');
    std::vector<RawEvent> const events = parseEvents(bytesOf(1, IN_CREATE, 0, "a") + bytesOf(2, IN_DELETE_SELF, 0, "") +
                                                     bytesOf(3, IN_MOVED_TO | IN_ISDIR, 7, longName));
    ASSERT_EQ(events.size(), 3U);
    EXPECT_EQ(events[0].watch, 1);
    EXPECT_EQ(events[0].name, "a");
    EXPECT_EQ(events[1].mask, static_cast<std::uint32_t>(IN_DELETE_SELF));
    EXPECT_EQ(events[1].name, "");
    EXPECT_EQ(events[2].mask, static_cast<std::uint32_t>(IN_MOVED_TO | IN_ISDIR));
    EXPECT_EQ(events[2].cookie, 7U);
    EXPECT_EQ(events[2].name, longName);
}

TEST(ParseEvents, LeavesOutWhatIsCutOff)
{
    std::string const bytes = bytesOf(1, IN_CREATE, 0, "");
    EXPECT_EQ(parseEvents(bytes + bytes.substr(0, bytes.size() - 1)).size(), 1U);
}

TEST(Inotify, GivesOneNumberToOneFolder)
{
    TemporaryFolder const folder;
    std::filesystem::create_directory(folder / "a");
    std::filesystem::create_directory_symlink("a", folder / "link");
    Inotify inotify;
    ASSERT_EQ(inotify.open(), 0);
    int first = 0;
    int second = 0;
    int other = 0;
    EXPECT_EQ(inotify.add(opened(folder / "a"), IN_CREATE, first), 0);
    EXPECT_EQ(inotify.add(opened(folder / "link"), IN_DELETE, second), 0);
    EXPECT_EQ(inotify.add(opened(folder.path()), IN_CREATE, other), 0);
    EXPECT_EQ(first, second);
    EXPECT_NE(first, other);
}

TEST(Inotify, KeepsWhatIsWatchedWhenMoreIs)
{
    TemporaryFolder const folder;
    Inotify inotify;
    ASSERT_EQ(inotify.open(), 0);
    int watch = 0;
    ASSERT_EQ(inotify.add(opened(folder.path()), IN_CREATE, watch), 0);
    ASSERT_EQ(inotify.add(opened(folder.path()), IN_DELETE, watch), 0);
    folder.write("file", "");
    std::vector<RawEvent> events;
    ASSERT_EQ(inotify.read(events), 0);
    ASSERT_EQ(events.size(), 1U);
    EXPECT_EQ(events[0].name, "file");
}

TEST(Inotify, ReadsNothingWhereNothingHappened)
{
    Inotify inotify;
    ASSERT_EQ(inotify.open(), 0);
    std::vector<RawEvent> events(1);
    EXPECT_EQ(inotify.read(events), 0);
    EXPECT_TRUE(events.empty());
}

TEST(Inotify, RefusesWhatIsNoFolder)
{
    TemporaryFolder const folder;
    FileDescriptor const file(::open(folder.write("file", "").c_str(), O_PATH | O_CLOEXEC));
    Inotify inotify;
    ASSERT_EQ(inotify.open(), 0);
    int watch = 0;
    EXPECT_EQ(inotify.add(file, IN_CREATE, watch), ENOTDIR);
}

} // namespace
} // namespace foundation::storage::local::detail
