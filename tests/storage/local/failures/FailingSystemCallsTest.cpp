#include <tests/storage/local/failures/FailingSystemCalls.hpp>

#include <gtest/gtest.h>

#include <tests/support/TemporaryFolder.hpp>

#include <array>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <thread>
#include <unistd.h>

namespace foundation::tests::support {
namespace {

using storage::local::detail::realSystemCalls;
using storage::local::detail::SystemCalls;
using storage::local::detail::systemCalls;

constexpr int notOpen = 1'000'000;

std::array<void*, sizeof(SystemCalls) / sizeof(void*)> wordsOf(SystemCalls const& calls)
{
    std::array<void*, sizeof(SystemCalls) / sizeof(void*)> words;
    std::memcpy(words.data(), &calls, sizeof calls);
    return words;
}

TEST(FailingSystemCalls, StandBeforeEveryMemberOfTheTable)
{
    FailingSystemCalls failing;
    auto const real = wordsOf(realSystemCalls);
    auto const replaced = wordsOf(systemCalls());
    for (std::size_t i = 0; i < real.size(); ++i) {
        EXPECT_NE(replaced[i], nullptr) << i;
        EXPECT_NE(replaced[i], real[i]) << i;
    }
}

TEST(FailingSystemCalls, FailTheCallThatThePlanSaysAndNoOther)
{
    TemporaryFolder const folder;
    std::string const name = folder / "file";
    FailingSystemCalls failing(onlyCall(2, Fate::fails(EIO)));
    int const file = systemCalls().openat(AT_FDCWD, name.c_str(), O_RDWR | O_CREAT, 0600);
    ASSERT_GE(file, 0);
    EXPECT_EQ(systemCalls().write(file, "abc", 3), -1);
    EXPECT_EQ(errno, EIO);
    EXPECT_EQ(systemCalls().write(file, "xyz", 3), 3);
    EXPECT_EQ(systemCalls().close(file), 0);
    EXPECT_EQ(folder.read("file"), "xyz");
}

TEST(FailingSystemCalls, CountCallsAndTellWhatTheyWorkOn)
{
    TemporaryFolder const folder;
    std::string const name = folder.write("file", "content");
    FailingSystemCalls failing;
    int const at = systemCalls().openat(AT_FDCWD, folder.path().c_str(), O_PATH, 0);
    int const file = systemCalls().openat(at, "file", O_WRONLY, 0);
    systemCalls().renameat2(at, "file", at, "new", 0);
    systemCalls().fsync(file);
    systemCalls().close(file);
    systemCalls().close(at);
    auto const& calls = failing.calls();
    ASSERT_EQ(calls.size(), 6u);
    EXPECT_EQ(calls[1].number, 2u);
    EXPECT_EQ(calls[1].name, "openat");
    EXPECT_EQ(calls[1].numberOfKind, 2u);
    EXPECT_EQ(calls[1].paths, std::vector{name});
    EXPECT_FALSE(calls[1].mayWrite);
    EXPECT_EQ(calls[2].paths, (std::vector{name, (folder / "new").native()}));
    EXPECT_EQ(calls[3].paths, std::vector{(folder / "new").native()});
    EXPECT_TRUE(calls[4].mayWrite);
    EXPECT_FALSE(calls[5].mayWrite);
}

TEST(FailingSystemCalls, CloseEvenWhenCloseFails)
{
    int const file = ::open("/dev/null", O_RDONLY | O_CLOEXEC);
    FailingSystemCalls failing(everyCall(Fate::fails(EINTR)));
    EXPECT_EQ(systemCalls().close(file), -1);
    EXPECT_EQ(errno, EINTR);
    EXPECT_EQ(::fcntl(file, F_GETFD), -1);
}

TEST(FailingSystemCalls, DoLittleWhenTheyAreShort)
{
    TemporaryFolder const folder;
    std::string const name = folder.write("file", std::string(1000, 'x'));
    for (char const c : std::string("abcdefgh"))
        folder.write(std::string(200, c), "");
    int const file = ::open(name.c_str(), O_RDWR | O_CLOEXEC);
    int const other = ::open((folder / "other").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    int const listed = ::open(folder.path().c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    {
        FailingSystemCalls failing(everyCall(Fate::short_()));
        std::array<char, 1024> buffer{};
        EXPECT_EQ(systemCalls().read(file, buffer.data(), buffer.size()), 97);
        EXPECT_EQ(systemCalls().read(file, buffer.data(), 3), 3);
        EXPECT_EQ(systemCalls().write(file, buffer.data(), buffer.size()), 97);
        EXPECT_EQ(systemCalls().copy_file_range(file, nullptr, other, nullptr, 500, 0), 97);
        ssize_t const entries = systemCalls().getdents64(listed, buffer.data(), buffer.size());
        EXPECT_GT(entries, 0);
        EXPECT_LT(entries, 300);
    }
    for (int const descriptor : {file, other, listed})
        ::close(descriptor);
}

TEST(FailingSystemCalls, LetOtherThreadsPass)
{
    FailingSystemCalls failing(everyCall(Fate::fails(EIO)));
    int error = 0;
    std::thread([&] {
        systemCalls().close(notOpen);
        error = errno;
    }).join();
    EXPECT_EQ(error, EBADF);
    EXPECT_TRUE(failing.calls().empty());
}

TEST(FailingSystemCalls, PutTheOldOnesBack)
{
    {
        FailingSystemCalls failing(everyCall(Fate::fails(EIO)));
    }
    EXPECT_EQ(systemCalls().close(notOpen), -1);
    EXPECT_EQ(errno, EBADF);
}

} // namespace
} // namespace foundation::tests::support
