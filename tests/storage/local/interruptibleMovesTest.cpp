#include <storage/local/interruptibleMoves.hpp>

#include <gtest/gtest.h>

#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <cstdint>
#include <filesystem>
#include <string>
#include <sys/stat.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::TemporaryFolder;

std::size_t countIn(TemporaryFolder const& folder)
{
    return static_cast<std::size_t>(std::distance(fs::directory_iterator(folder.path()), fs::directory_iterator()));
}

dev_t deviceOf(TemporaryFolder const& folder)
{
    struct stat status = {};
    EXPECT_EQ(::stat(folder.path().c_str(), &status), 0);
    return status.st_dev;
}

/// A file of a few chunks, and a folder that holds one, to be moved to another file system.
class InterruptibleMoves : public testing::Test
{
protected:
    void SetUp() override
    {
        if (deviceOf(from) == deviceOf(to))
            GTEST_SKIP() << "the folder for temporary files and /dev/shm are on one file system";
        from.write("file", content);
        fs::create_directories(from / "folder/inner");
        from.write("folder/inner/file", content);
        from.write("folder/small", "1");
    }

    TransactionStatus moveFile(MoveOptions const& options) const
    {
        return moveFileInterruptibly(from.iri(u"file"), to.iri(u"file"), options);
    }

    TransactionStatus moveFolder(MoveOptions const& options) const
    {
        return moveFolderInterruptibly(from.iri(u"folder"), to.iri(u"folder"), options);
    }

    /// Options that interrupt when the move has asked so often.
    static MoveOptions stopAfter(int& questions)
    {
        MoveOptions options;
        options.observer.interrupt = [&questions] {
            return questions-- > 0 ? InterruptSignal::Continue : InterruptSignal::Abort;
        };
        return options;
    }

    std::string const content = std::string(3'500'001, 'x') + "end";
    TemporaryFolder const from;
    TemporaryFolder const to{"/dev/shm"};
};

TEST_F(InterruptibleMoves, AreCompleteWhenNobodyInterrupts)
{
    EXPECT_EQ(moveFile({}), TransactionStatus::Completed);
    EXPECT_EQ(moveFolder({}), TransactionStatus::Completed);
    EXPECT_EQ(to.read("file") + to.read("folder/inner/file"), content + content);
    EXPECT_EQ(countIn(from), 0u);
}

TEST_F(InterruptibleMoves, OfAFileLeaveBothEndsWhereverTheyAreInterrupted)
{
    int stops = 0;
    for (;; ++stops) {
        int questions = stops;
        if (moveFile(stopAfter(questions)) == TransactionStatus::Completed)
            break;
        ASSERT_EQ(from.read("file"), content) << stops;
        ASSERT_EQ(countIn(to), 0u) << stops;
    }
    EXPECT_EQ(to.read("file"), content);
    EXPECT_GE(stops, 8); // four chunks, copied and read back
}

TEST_F(InterruptibleMoves, OfAFolderLeaveBothEndsWhereverTheyAreInterrupted)
{
    int stops = 0;
    for (;; ++stops) {
        int questions = stops;
        if (moveFolder(stopAfter(questions)) == TransactionStatus::Completed)
            break;
        ASSERT_EQ(from.read("folder/inner/file") + from.read("folder/small"), content + "1") << stops;
        ASSERT_EQ(countIn(to), 0u) << stops;
    }
    EXPECT_EQ(to.read("folder/inner/file") + to.read("folder/small"), content + "1");
    EXPECT_FALSE(fs::exists(from / "folder"));
    EXPECT_GE(stops, 20);
}

TEST_F(InterruptibleMoves, LeaveBothEndsWhenTheObserverThrows)
{
    MoveOptions options;
    int questions = 6;
    options.observer.interrupt = [&]() -> InterruptSignal {
        if (--questions == 0)
            throw 42;
        return InterruptSignal::Continue;
    };
    EXPECT_THROW(moveFolder(options), int);
    EXPECT_EQ(from.read("folder/inner/file"), content);
    EXPECT_EQ(countIn(to), 0u);
}

TEST_F(InterruptibleMoves, TellOfEachByteOnceAndOfEachFile)
{
    std::uint64_t bytes = 0;
    int files = 0;
    MoveOptions options;
    options.observer.onBytes = [&](std::uint64_t count) { bytes += count; };
    options.observer.onFile = [&] { ++files; };
    moveFile(options);
    EXPECT_EQ(bytes, content.size());
    EXPECT_EQ(files, 1);
    moveFolder(options);
    EXPECT_EQ(bytes, 2 * content.size() + 1);
    EXPECT_EQ(files, 3);
}

TEST_F(InterruptibleMoves, KeepThePolicy)
{
    to.write("file", "old");
    EXPECT_EQ(failureOf([&] { moveFile({}); }), failure(ErrorCode::ResourceAlreadyExists, to.iri(u"file")));
    EXPECT_EQ(moveFile({.policy = ReplacementPolicy::Overwrite}), TransactionStatus::Completed);
    EXPECT_EQ(to.read("file"), content);
}

TEST_F(InterruptibleMoves, AskNobodyInOneFileSystem)
{
    int questions = 0;
    EXPECT_EQ(moveFileInterruptibly(from.iri(u"file"), from.iri(u"new"), stopAfter(questions)),
              TransactionStatus::Completed);
    EXPECT_EQ(from.read("new"), content);
}

} // namespace
} // namespace foundation::storage::local
