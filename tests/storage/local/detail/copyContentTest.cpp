#include <storage/local/detail/copyContent.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <cstdlib>
#include <cstring>
#include <stdexcept>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace foundation::storage::local::detail {
namespace {

using provider::InterruptSignal;
using provider::IProvider;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

constexpr std::size_t mebibyte = std::size_t{1} << 20;

/// No two chunks of which are the same.
std::string someContent(std::size_t size)
{
    std::string content(size, '\0');
    std::uint32_t state = 1;
    for (char& c : content) {
        state = state * 1664525 + 1013904223;
        c = static_cast<char>(state >> 24 | 1);
    }
    return content;
}

int refuseClone(int, int)
{
    return failWith(EOPNOTSUPP);
}

class CopyContent : public testing::Test
{
protected:
    CopyContent() { calls_->ficlone = refuseClone; }

    CopyResult copy(std::string const& source, IProvider::Interrupt const& interrupt = {}, int targetFlags = 0)
    {
        FileDescriptor const from(::open(source.c_str(), O_RDONLY | O_CLOEXEC));
        FileDescriptor const to(
            ::open((folder_ / "to").c_str(), O_RDWR | O_CREAT | O_TRUNC | O_CLOEXEC | targetFlags, 0600));
        Status status;
        if (!to.isOpen() || ::statx(from.get(), "", AT_EMPTY_PATH, STATX_BASIC_STATS, &status) != 0)
            throw std::runtime_error("cannot open " + source);
        return copyContent(from, status, to, interrupt);
    }

    /// Copies a file with this content.
    CopyResult copyOf(std::string const& content, IProvider::Interrupt const& interrupt = {}, int targetFlags = 0)
    {
        return copy(folder_.write("from", content), interrupt, targetFlags);
    }

    std::string copied() const { return folder_.read("to"); }

    off_t bytesOnDisk(std::string const& name) const
    {
        struct stat status;
        return ::stat((folder_ / name).c_str(), &status) == 0 ? status.st_blocks * 512 : -1;
    }

    TemporaryFolder folder_;
    ReplacedSystemCalls calls_;
};

testing::AssertionResult isCompleted(CopyResult const& result)
{
    if (result.outcome == CopyOutcome::Completed)
        return testing::AssertionSuccess();
    return testing::AssertionFailure() << "outcome " << static_cast<int>(result.outcome) << ", "
                                       << std::strerror(result.error);
}

TEST_F(CopyContent, CopiesFilesOfEverySizeWhole)
{
    for (std::size_t const size : {std::size_t{0}, std::size_t{1}, std::size_t{4096}, std::size_t{16384},
                                   std::size_t{16385}, mebibyte, 3 * mebibyte + 1})
    {
        std::string const content = someContent(size);
        EXPECT_TRUE(isCompleted(copyOf(content)));
        EXPECT_TRUE(copied() == content) << size << " bytes";
    }
}

TEST_F(CopyContent, ReadsAndWritesASmallFileOnce)
{
    static int reads;
    static int writes;
    reads = writes = 0;
    calls_->read = [](int file, void* buffer, std::size_t count) {
        ++reads;
        return ::read(file, buffer, count);
    };
    calls_->write = [](int file, void const* data, std::size_t count) {
        ++writes;
        return ::write(file, data, count);
    };
    calls_->copy_file_range = [](int, off64_t*, int, off64_t*, std::size_t, unsigned) -> ssize_t {
        throw std::logic_error("copy_file_range");
    };
    EXPECT_TRUE(isCompleted(copyOf(someContent(4096))));
    EXPECT_EQ(reads, 1);
    EXPECT_EQ(writes, 1);
}

TEST_F(CopyContent, LetsTheKernelCopyALargeFile)
{
    calls_->read = [](int, void*, std::size_t) -> ssize_t { throw std::logic_error("read"); };
    std::string const content = someContent(2 * mebibyte + 7);
    EXPECT_TRUE(isCompleted(copyOf(content)));
    EXPECT_TRUE(copied() == content);
}

TEST_F(CopyContent, SharesContentWhereTheFileSystemCan)
{
    calls_->ficlone = [](int to, int) { return ::write(to, "shared", 6) == 6 ? 0 : -1; };
    EXPECT_TRUE(isCompleted(copyOf(someContent(mebibyte))));
    EXPECT_EQ(copied(), "shared");
}

TEST_F(CopyContent, ReadsAndWritesWhatTheKernelDoesNotCopy)
{
    std::string const content = someContent(2 * mebibyte + 7);
    static int error;
    calls_->copy_file_range = [](int, off64_t*, int, off64_t*, std::size_t, unsigned) {
        return static_cast<ssize_t>(failWith(error));
    };
    for (int const refusal : {EXDEV, EINVAL, EOPNOTSUPP, ENOSYS, EBADF, EPERM, ETXTBSY, EIO}) {
        error = refusal;
        EXPECT_TRUE(isCompleted(copyOf(content)));
        EXPECT_TRUE(copied() == content) << std::strerror(refusal);
    }
}

TEST_F(CopyContent, GoesOnFromWhereTheKernelStopsCopying)
{
    static int calls;
    calls = 0;
    calls_->copy_file_range = [](int from, off64_t*, int to, off64_t*, std::size_t, unsigned) {
        if (++calls > 2)
            return static_cast<ssize_t>(failWith(EINVAL));
        return ::copy_file_range(from, nullptr, to, nullptr, 1000, 0);
    };
    std::string const content = someContent(mebibyte + 7);
    EXPECT_TRUE(isCompleted(copyOf(content)));
    EXPECT_TRUE(copied() == content);
    EXPECT_EQ(calls, 3);
}

TEST_F(CopyContent, ReadsWhatTheKernelTakesForEmpty)
{
    calls_->copy_file_range = [](int, off64_t*, int, off64_t*, std::size_t, unsigned) { return ssize_t{0}; };
    std::string const content = someContent(mebibyte + 7);
    EXPECT_TRUE(isCompleted(copyOf(content)));
    EXPECT_TRUE(copied() == content);
}

TEST_F(CopyContent, CopiesAFileThatDoesNotTellItsSize)
{
    std::string const path = "/proc/filesystems";
    ASSERT_EQ(std::filesystem::file_size(path), 0);
    EXPECT_TRUE(isCompleted(copy(path)));
    EXPECT_EQ(copied(), folder_.read(path));
    EXPECT_NE(copied(), "");
}

TEST_F(CopyContent, CopiesAFileThatHoldsLessThanItsSizeSays)
{
    std::string const path = "/sys/kernel/mm/transparent_hugepage/enabled";
    if (::access(path.c_str(), R_OK) != 0)
        GTEST_SKIP() << "there is no " << path;
    EXPECT_TRUE(isCompleted(copy(path)));
    EXPECT_TRUE(copied() == folder_.read(path));
}

TEST_F(CopyContent, TakesShortCountsAndSignals)
{
    calls_->copy_file_range = [](int, off64_t*, int, off64_t*, std::size_t, unsigned) {
        return static_cast<ssize_t>(failWith(ENOSYS));
    };
    static int call;
    call = 0;
    calls_->read = [](int file, void* buffer, std::size_t count) {
        return ++call % 3 == 0 ? static_cast<ssize_t>(failWith(EINTR))
                               : ::read(file, buffer, std::min(count, std::size_t{999}));
    };
    calls_->write = [](int file, void const* data, std::size_t count) {
        return ++call % 5 == 0 ? static_cast<ssize_t>(failWith(EINTR))
                               : ::write(file, data, std::min(count, std::size_t{100}));
    };
    for (std::size_t const size : {std::size_t{5000}, std::size_t{50000}}) {
        std::string const content = someContent(size);
        EXPECT_TRUE(isCompleted(copyOf(content)));
        EXPECT_TRUE(copied() == content);
    }
}

TEST_F(CopyContent, CopiesAgainWhenASignalInterruptsTheKernel)
{
    static int call;
    call = 0;
    calls_->read = [](int, void*, std::size_t) -> ssize_t { throw std::logic_error("read"); };
    calls_->copy_file_range = [](int from, off64_t*, int to, off64_t*, std::size_t count, unsigned) {
        return ++call % 2 == 1 ? static_cast<ssize_t>(failWith(EINTR))
                               : ::copy_file_range(from, nullptr, to, nullptr, std::min(count, std::size_t{9999}), 0);
    };
    std::string const content = someContent(100000);
    EXPECT_TRUE(isCompleted(copyOf(content)));
    EXPECT_TRUE(copied() == content);
}

TEST_F(CopyContent, AppendsToAFileThatOnlyGrows)
{
    std::string const content = someContent(mebibyte + 7);
    EXPECT_TRUE(isCompleted(copyOf(content, {}, O_APPEND)));
    EXPECT_TRUE(copied() == content);
}

TEST_F(CopyContent, SaysWhichEndFailed)
{
    calls_->copy_file_range = [](int, off64_t*, int, off64_t*, std::size_t, unsigned) {
        return static_cast<ssize_t>(failWith(EIO));
    };
    for (std::size_t const size : {std::size_t{0}, std::size_t{4096}, mebibyte}) {
        calls_->read = [](int, void*, std::size_t) { return static_cast<ssize_t>(failWith(EIO)); };
        CopyResult const unread = copyOf(someContent(size));
        EXPECT_EQ(unread.outcome, CopyOutcome::SourceFailed);
        EXPECT_EQ(unread.error, EIO);
    }
    calls_->read = ::read;
    for (std::size_t const size : {std::size_t{4096}, mebibyte}) {
        calls_->write = [](int, void const*, std::size_t) { return static_cast<ssize_t>(failWith(ENOSPC)); };
        CopyResult const unwritten = copyOf(someContent(size));
        EXPECT_EQ(unwritten.outcome, CopyOutcome::TargetFailed);
        EXPECT_EQ(unwritten.error, ENOSPC);
        calls_->write = [](int, void const*, std::size_t) { return ssize_t{0}; };
        EXPECT_EQ(copyOf(someContent(size)).error, EIO);
    }
}

TEST_F(CopyContent, AsksBeforeEachChunk)
{
    int asked = 0;
    auto const goOn = [&] {
        ++asked;
        return InterruptSignal::Continue;
    };
    EXPECT_TRUE(isCompleted(copyOf(someContent(4096), goOn)));
    EXPECT_EQ(asked, 1);
    asked = 0;
    EXPECT_TRUE(isCompleted(copyOf(someContent(3 * mebibyte), goOn)));
    EXPECT_GE(asked, 3);
}

TEST_F(CopyContent, StopsAtEachChunk)
{
    std::string const content = someContent(3 * mebibyte + 1);
    CopyResult result{CopyOutcome::Aborted};
    for (int chunk = 1; result.outcome == CopyOutcome::Aborted; ++chunk) {
        int asked = 0;
        result = copyOf(content, [&] { return ++asked == chunk ? InterruptSignal::Abort : InterruptSignal::Continue; });
        EXPECT_EQ(asked == chunk, result.outcome == CopyOutcome::Aborted);
        EXPECT_TRUE(content.starts_with(copied()));
        EXPECT_EQ(copied() == content, result.outcome == CopyOutcome::Completed);
    }
    EXPECT_TRUE(isCompleted(result));
}

TEST_F(CopyContent, StopsBeforeASmallOrSharedFileToo)
{
    auto const stop = [] { return InterruptSignal::Abort; };
    calls_->ficlone = [](int, int) { return 0; };
    for (std::size_t const size : {std::size_t{0}, std::size_t{1}, mebibyte}) {
        EXPECT_EQ(copyOf(someContent(size), stop).outcome, CopyOutcome::Aborted);
        EXPECT_EQ(copied(), "");
    }
}

TEST_F(CopyContent, LeavesOutWhatIsAppendedMeanwhile)
{
    for (std::size_t const size : {std::size_t{4096}, 2 * mebibyte}) {
        std::string const content = someContent(size);
        auto const grow = [&] {
            std::ofstream(folder_ / "from", std::ios::app) << "more";
            return InterruptSignal::Continue;
        };
        EXPECT_TRUE(isCompleted(copyOf(content, grow)));
        EXPECT_TRUE(copied() == content);
    }
}

TEST_F(CopyContent, EndsWhereTheSourceEndsThatBecameShorter)
{
    for (std::size_t const size : {std::size_t{4096}, 2 * mebibyte}) {
        std::string const content = someContent(size);
        auto const shrink = [&] {
            std::filesystem::resize_file(folder_ / "from", size / 2);
            return InterruptSignal::Continue;
        };
        EXPECT_TRUE(isCompleted(copyOf(content, shrink)));
        EXPECT_TRUE(copied() == content.substr(0, size / 2));
    }
}

} // namespace
} // namespace foundation::storage::local::detail
