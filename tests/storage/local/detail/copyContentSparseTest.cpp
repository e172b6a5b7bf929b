#include <storage/local/detail/copyContent.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <fcntl.h>
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

constexpr off_t mebibyte = off_t{1} << 20;

struct Piece
{
    off_t begin;
    std::string content;
};

/// A file of pieces of data between holes, and its copy.
class CopyContentSparse : public testing::Test
{
protected:
    CopyContentSparse()
    {
        calls_->ficlone = [](int, int) { return failWith(EOPNOTSUPP); };
    }

    void make(std::vector<Piece> const& pieces, off_t size) const
    {
        FileDescriptor const file(::open((folder_ / "from").c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600));
        for (Piece const& piece : pieces)
            if (::pwrite(file.get(), piece.content.data(), piece.content.size(), piece.begin) !=
                static_cast<ssize_t>(piece.content.size()))
                throw std::runtime_error("cannot write");
        if (::ftruncate(file.get(), size) != 0)
            throw std::runtime_error("cannot set the size");
    }

    bool hasHoles() const { return bytesOnDisk("from") < sizeOf("from") / 2; }

    CopyOutcome copy(IProvider::Interrupt const& interrupt = {})
    {
        FileDescriptor const from(::open((folder_ / "from").c_str(), O_RDONLY | O_CLOEXEC));
        FileDescriptor const to(::open((folder_ / "to").c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600));
        Status status;
        if (!to.isOpen() || ::statx(from.get(), "", AT_EMPTY_PATH, STATX_BASIC_STATS, &status) != 0)
            throw std::runtime_error("cannot open");
        return copyContent(from, status, to, interrupt).outcome;
    }

    struct stat statusOf(std::string const& name) const
    {
        struct stat status;
        if (::stat((folder_ / name).c_str(), &status) != 0)
            throw std::runtime_error("nothing at " + name);
        return status;
    }

    off_t sizeOf(std::string const& name) const { return statusOf(name).st_size; }
    off_t bytesOnDisk(std::string const& name) const { return statusOf(name).st_blocks * 512; }

    bool takeBlocksBeyondTheEnd(off_t count) const
    {
        FileDescriptor const file(::open((folder_ / "from").c_str(), O_WRONLY | O_CLOEXEC));
        return ::fallocate(file.get(), FALLOC_FL_KEEP_SIZE, sizeOf("from"), count) == 0;
    }

    void expectCopied() { EXPECT_TRUE(folder_.read("to") == folder_.read("from")); }

    TemporaryFolder folder_;
    ReplacedSystemCalls calls_;
};

TEST_F(CopyContentSparse, KeepsHolesBeforeBetweenAndBehindTheData)
{
    std::string const data(5000, 'x');
    for (std::vector<Piece> const& pieces : {std::vector<Piece>{},
                                             {{0, data}},
                                             {{3 * mebibyte, data}},
                                             {{4 * mebibyte - 5000, data}},
                                             {{0, data}, {mebibyte, data}, {3 * mebibyte, std::string(600000, 'y')}}})
    {
        make(pieces, 4 * mebibyte);
        if (!hasHoles())
            GTEST_SKIP() << "the file system makes no holes";
        EXPECT_EQ(copy(), CopyOutcome::Completed);
        expectCopied();
        EXPECT_LE(bytesOnDisk("to"), bytesOnDisk("from") + 65536);
    }
}

TEST_F(CopyContentSparse, KeepsHolesOfWhatTheKernelDoesNotCopy)
{
    calls_->copy_file_range = [](int, off64_t*, int, off64_t*, std::size_t, unsigned) {
        return static_cast<ssize_t>(failWith(EXDEV));
    };
    make({{mebibyte, "data"}, {2 * mebibyte, std::string(70000, 'z')}}, 4 * mebibyte);
    if (!hasHoles())
        GTEST_SKIP() << "the file system makes no holes";
    EXPECT_EQ(copy(), CopyOutcome::Completed);
    expectCopied();
    EXPECT_LT(bytesOnDisk("to"), mebibyte);
}

TEST_F(CopyContentSparse, KeepsHolesOfAFileWithBlocksBeyondItsEnd)
{
    make({{0, "x"}, {4 * mebibyte - 1, "y"}}, 4 * mebibyte);
    if (!hasHoles() || !takeBlocksBeyondTheEnd(8 * mebibyte))
        GTEST_SKIP() << "the file system makes no holes, or takes no blocks beforehand";
    ASSERT_GE(bytesOnDisk("from"), 4 * mebibyte);
    EXPECT_EQ(copy(), CopyOutcome::Completed);
    expectCopied();
    EXPECT_LE(bytesOnDisk("to"), 131072);
}

TEST_F(CopyContentSparse, KeepsASmallFileThatIsAHole)
{
    make({}, 8192);
    EXPECT_EQ(copy(), CopyOutcome::Completed);
    expectCopied();
    EXPECT_LE(bytesOnDisk("to"), bytesOnDisk("from"));
}

TEST_F(CopyContentSparse, CopiesAllOfAFileWhoseHolesNobodyKnows)
{
    make({{mebibyte, "data"}}, 2 * mebibyte);
    calls_->lseek = [](int file, off_t offset, int origin) {
        return origin == SEEK_DATA ? off_t{failWith(EINVAL)} : ::lseek(file, offset, origin);
    };
    EXPECT_EQ(copy(), CopyOutcome::Completed);
    expectCopied();
}

TEST_F(CopyContentSparse, CopiesToTheEndWhereNobodyKnowsTheNextHole)
{
    make({{mebibyte, "data"}}, 2 * mebibyte);
    calls_->lseek = [](int file, off_t offset, int origin) {
        return origin == SEEK_HOLE ? off_t{failWith(EINVAL)} : ::lseek(file, offset, origin);
    };
    EXPECT_EQ(copy(), CopyOutcome::Completed);
    expectCopied();
}

TEST_F(CopyContentSparse, EndsWhereTheSourceEndsThatBecameShorter)
{
    make({{mebibyte, std::string(100000, 'x')}, {3 * mebibyte, "data"}}, 4 * mebibyte);
    bool isShortened = false;
    EXPECT_EQ(copy([&] {
                  if (!std::exchange(isShortened, true))
                      std::filesystem::resize_file(folder_ / "from", mebibyte + 50);
                  return InterruptSignal::Continue;
              }),
              CopyOutcome::Completed);
    expectCopied();
}

TEST_F(CopyContentSparse, StopsBetweenPieces)
{
    make({{0, "data"}, {mebibyte, "data"}, {3 * mebibyte, "data"}}, 4 * mebibyte);
    int asked = 0;
    EXPECT_EQ(copy([&] { return ++asked == 3 ? InterruptSignal::Abort : InterruptSignal::Continue; }),
              CopyOutcome::Aborted);
    EXPECT_LT(sizeOf("to"), 3 * mebibyte);
}

TEST_F(CopyContentSparse, SaysThatTheEndCouldNotBeSet)
{
    make({{0, "data"}}, 4 * mebibyte);
    calls_->ftruncate = [](int, off_t) { return failWith(EFBIG); };
    EXPECT_EQ(copy(), CopyOutcome::TargetFailed);
}

} // namespace
} // namespace foundation::storage::local::detail
