#include <tests/tools/storage/ToolTest.hpp>

#include <chrono>
#include <csignal>
#include <fcntl.h>
#include <sys/ioctl.h>
#include <thread>
#include <unistd.h>

namespace {

using namespace std::chrono_literals;

/// Copies of a file that is too large to be done before a signal comes: it has no blocks, but takes long to read.
class Interrupt : public ToolTest
{
protected:
    void SetUp() override
    {
        folder.write("big", "");
        std::filesystem::resize_file(folder / "big", std::uintmax_t{64} << 30U);
        makeFolder("t");
    }

    bool hasScratchFile(std::string const& name) const
    {
        for (auto const& entry : std::filesystem::directory_iterator(folder / name)) {
            if (entry.path().native().ends_with(".tmp.bak"))
                return true;
        }
        return false;
    }

    /// Sends the signal while the tool copies to this folder, after it has made this entry.
    ProgramResult interrupt(Arguments const& arguments, int signal, std::string const& target = "t",
                            std::string const& entry = ".") const
    {
        Process process(command(arguments), inFolder());
        auto const deadline = std::chrono::steady_clock::now() + 60s;
        auto const isCopying = [&] { return exists(target + '/' + entry) && hasScratchFile(target); };
        while (!isCopying() && process.isRunning() && std::chrono::steady_clock::now() < deadline)
            std::this_thread::yield();
        EXPECT_TRUE(isCopying());
        process.send(signal);
        return process.finish();
    }
};

TEST_F(Interrupt, LeavesNothingOfANewFile)
{
    ProgramResult const result = interrupt({"cp", "big", "t"}, SIGINT);
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: cp: interrupted\n");
    EXPECT_EQ(countEntries("t"), 0U);
}

TEST_F(Interrupt, TellsWhatWasDoneBefore)
{
    folder.write("a", "content");
    EXPECT_EQ(interrupt({"cp", "-v", "a", "big", "t"}, SIGINT, "t", "a").output, "a -> t/a\n");
    EXPECT_EQ(countEntries("t"), 1U);
}

TEST_F(Interrupt, LeavesTheOldFile)
{
    folder.write("t/big", "old");
    ProgramResult const result = interrupt({"cp", "--replace", "big", "t"}, SIGTERM);
    EXPECT_EQ(result.status, 143);
    EXPECT_EQ(folder.read("t/big"), "old");
    EXPECT_EQ(countEntries("t"), 1U);
}

TEST_F(Interrupt, EndsARecursiveCopy)
{
    makeFolder("d");
    std::filesystem::rename(folder / "big", folder / "d/big");
    makeFolder("t/d");
    ProgramResult const result = interrupt({"cp", "-r", "d", "t"}, SIGINT, "t/d");
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: cp: interrupted\n");
    EXPECT_EQ(countEntries("t/d"), 0U);
}

TEST_F(Interrupt, EndsAtOnceWhileNobodyReadsTheOutput)
{
    makePipe("pipe");
    ProcessOptions options = inFolder();
    options.output = folder / "pipe";
    int const pipe = ::open(options.output.c_str(), O_RDWR | O_CLOEXEC);
    int const capacity = ::fcntl(pipe, F_GETPIPE_SZ);
    ASSERT_GT(capacity, 0);
    Process process(command({"cat", "big"}), options);
    auto const deadline = std::chrono::steady_clock::now() + 60s;
    int held = 0;
    while (held < capacity && process.isRunning() && std::chrono::steady_clock::now() < deadline)
        ASSERT_EQ(::ioctl(pipe, FIONREAD, &held), 0);
    EXPECT_EQ(held, capacity);
    process.send(SIGINT);
    ProgramResult const result = process.finish();
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: cat: interrupted\n");
    ::close(pipe);
}

} // namespace
