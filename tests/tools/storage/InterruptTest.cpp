#include <tests/tools/storage/ToolTest.hpp>

#include <chrono>
#include <csignal>
#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/resource.h>
#include <thread>
#include <unistd.h>

namespace {

using namespace std::chrono_literals;

/// Copies of a file that is too large to be done before a signal comes.
class Interrupt : public ToolTest
{
protected:
    void SetUp() override
    {
        makeEndless("big");
        makeFolder("t");
    }

    /// Of memory without end the system makes this one as it is read, so that no store can share or skip any of it.
    void makeEndless(std::string const& name) const
    {
        std::filesystem::create_symlink("/proc/" + std::to_string(::getpid()) + "/pagemap", folder / name);
    }

    /// It has no blocks, but takes long to read.
    void makeHole(std::string const& name) const
    {
        std::filesystem::remove(folder / name);
        folder.write(name, "");
        std::filesystem::resize_file(folder / name, std::uintmax_t{64} << 30U);
    }

    /// Copying it takes a while, even where holes are skipped: each byte has a place of its own on the disk.
    void makeScattered(std::string const& name)
    {
        constexpr off_t pieces = 40000;
        mostBytes = RLIM_INFINITY;
        std::filesystem::remove(folder / name);
        int const file = ::open((folder / name).c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
        for (off_t i = 0; i < pieces; ++i)
            ASSERT_EQ(::pwrite(file, "x", 1, i << 17U), 1);
        ::close(file);
    }

    /// Those that the process has open in a folder and has written much to, so that all else that it does besides is
    /// done. They need not have a name, or it is a folder that has.
    int countScratchFiles(Process const& process, std::string const& name) const
    {
        namespace fs = std::filesystem;
        std::string const inside = (fs::canonical(folder.path()) / name).native() + '/';
        int count = 0;
        std::error_code gone;
        fs::directory_iterator file("/proc/" + std::to_string(process.id()) + "/fd", gone);
        for (; !gone && file != fs::directory_iterator(); file.increment(gone)) {
            std::error_code closed;
            std::string const path = fs::read_symlink(file->path(), closed).native();
            bool const isScratch = path.find(".tmp.bak") != std::string::npos || path.ends_with(" (deleted)");
            if (path.starts_with(inside) && isScratch && fs::file_size(file->path(), closed) >= much && !closed)
                ++count;
        }
        return count;
    }

    /// Where nothing ends an endless copy, this does before it fills the disk.
    void limitFiles() const
    {
        rlimit const limit{.rlim_cur = mostBytes, .rlim_max = mostBytes};
        ::setrlimit(RLIMIT_FSIZE, &limit);
        ::signal(SIGXFSZ, SIG_IGN);
    }

    /// Sends the signal while the tool makes so many copies in this folder, after it has made this entry.
    ProgramResult interrupt(Arguments const& arguments, int signal, std::string const& target = "t",
                            std::string const& entry = ".", int copies = 1) const
    {
        ProcessOptions options = inFolder();
        options.prepare = [this] { limitFiles(); };
        Process process(command(arguments), options);
        auto const deadline = std::chrono::steady_clock::now() + 60s;
        auto const isCopying = [&] {
            return exists(target + '/' + entry) && countScratchFiles(process, target) == copies;
        };
        while (!isCopying() && process.isRunning() && std::chrono::steady_clock::now() < deadline)
            std::this_thread::yield();
        EXPECT_TRUE(isCopying());
        process.send(signal);
        return process.finish();
    }

    static constexpr std::uintmax_t much = 32U << 20U;
    rlim_t mostBytes = rlim_t{1} << 30U;
};

TEST_F(Interrupt, LeavesNothingOfANewFile)
{
    ProgramResult const result = interrupt({"cp", "big", "t"}, SIGINT);
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: cp: interrupted: 0 of 1 file copied, 0 B\n");
    EXPECT_EQ(countEntries("t"), 0U);
}

TEST_F(Interrupt, TellsWhatWasDoneBefore)
{
    folder.write("a", "content");
    ProgramResult const result = interrupt({"cp", "-v", "a", "big", "t"}, SIGINT, "t", "a");
    EXPECT_EQ(result.output, "a -> t/a\n");
    EXPECT_EQ(result.errors, "storage: cp: interrupted: 1 of 2 files copied, 7 B\n");
    EXPECT_EQ(countEntries("t"), 1U);
}

TEST_F(Interrupt, LeavesTheOldFile)
{
    folder.write("t/big", "old");
    for (int const signal : {SIGTERM, SIGQUIT}) {
        ProgramResult const result = interrupt({"cp", "--replace", "big", "t"}, signal);
        EXPECT_EQ(result.status, 128 + signal);
        EXPECT_EQ(folder.read("t/big"), "old");
        EXPECT_EQ(countEntries("t"), 1U);
    }
}

TEST_F(Interrupt, EndsARecursiveCopy)
{
    makeFolder("d");
    std::filesystem::rename(folder / "big", folder / "d/big");
    makeFolder("t/d");
    ProgramResult const result = interrupt({"cp", "-r", "d", "t"}, SIGINT, "t/d");
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: cp: interrupted: 0 of 1 file copied, 0 B\n");
    EXPECT_EQ(countEntries("t/d"), 0U);
}

TEST_F(Interrupt, EndsAtOnceWhileNobodyReadsTheOutput)
{
    makeHole("big");
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

TEST_F(Interrupt, TellsOfFilesThatWereDoneAfterOneThatWasNot)
{
    folder.write("z", "content");
    ProgramResult const result = interrupt({"cp", "-v", "-j2", "big", "z", "t"}, SIGINT, "t", "z");
    EXPECT_EQ(result.output, "z -> t/z\n");
    EXPECT_EQ(result.errors, "storage: cp: interrupted: 1 of 2 files copied, 7 B\n");
}

TEST_F(Interrupt, EndsEveryCopyThatIsUnderWay)
{
    makeEndless("big2");
    ProgramResult const result = interrupt({"cp", "-j2", "big", "big2", "t"}, SIGTERM, "t", ".", 2);
    EXPECT_EQ(result.status, 143);
    EXPECT_EQ(result.errors, "storage: cp: interrupted: 0 of 2 files copied, 0 B\n");
    EXPECT_EQ(countEntries("t"), 0U);
}

TEST_F(Interrupt, LeavesASourceThatIsMovedByCopying)
{
    makeFolder("other");
    if (!mount("other", "256m"))
        GTEST_SKIP() << "file systems may not be mounted here";
    makeScattered("big");
    ProgramResult const result = interrupt({"mv", "big", "other"}, SIGINT, "other");
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: mv: interrupted: 0 of 1 moved\n");
    EXPECT_TRUE(exists("big"));
    EXPECT_EQ(countEntries("other"), 0U);
}

TEST_F(Interrupt, LeavesAFolderThatIsMovedByCopying)
{
    makeFolder("other");
    if (!mount("other", "256m"))
        GTEST_SKIP() << "file systems may not be mounted here";
    makeFolder("d/e");
    folder.write("d/f", "content");
    makeScattered("d/e/big");
    ProgramResult const result = interrupt({"mv", "d", "other"}, SIGINT, "other");
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: mv: interrupted: 0 of 1 moved\n");
    EXPECT_EQ(folder.read("d/f"), "content");
    EXPECT_TRUE(exists("d/e/big"));
    EXPECT_EQ(countEntries("other"), 0U);
}

/// Copies in place, of which nothing but the target itself is seen.
class InterruptInPlace : public Interrupt
{
protected:
    void SetUp() override
    {
        Interrupt::SetUp();
        makeHole("big");
    }

    ProgramResult interruptInPlace(Arguments const& arguments) const
    {
        Process process(command(arguments), inFolder());
        auto const deadline = std::chrono::steady_clock::now() + 60s;
        auto const isCopying = [&] { return isFile("t/big") && folder.read("t/big").empty(); };
        while (!isCopying() && process.isRunning() && std::chrono::steady_clock::now() < deadline)
            std::this_thread::yield();
        EXPECT_TRUE(isCopying());
        process.send(SIGINT);
        return process.finish();
    }
};

TEST_F(InterruptInPlace, LeavesNothingOfANewFile)
{
    ProgramResult const result = interruptInPlace({"cp", "--in-place", "big", "t"});
    EXPECT_EQ(result.errors, "storage: cp: interrupted: 0 of 1 file copied, 0 B\n");
    EXPECT_EQ(countEntries("t"), 0U);
}

TEST_F(InterruptInPlace, TellsThatAnOldFileIsIncomplete)
{
    folder.write("t/big", "old");
    ProgramResult const result = interruptInPlace({"cp", "--in-place", "--replace", "big", "t"});
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: cp: t/big: incomplete, because it was being written in place\n"
                             "storage: cp: interrupted: 0 of 1 file copied, 0 B\n");
}

} // namespace
