#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/storage/local/durability/MountedFileSystem.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <fl/filesystem/native_name.hpp>

#include <algorithm>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <functional>
#include <optional>
#include <sstream>
#include <string>
#include <sys/resource.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failWith;
using tests::support::MountedFileSystem;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

/// Replaces the file at a path by several MB and answers the code of the failure that ends it, be it of the stream or
/// of the commit.
std::optional<ErrorCode> failureOfWriting(fs::path const& path)
{
    LocalProvider const provider;
    StorageIRI const file(StorageIRI(u"file:///"), fl::filesystem::from_native_bytes(path.native()));
    try {
        auto const stream = provider.openTransactionalStream(file, {});
        std::string const chunk(1 << 16, 'x');
        for (int i = 0; i < 64; ++i)
            for (std::size_t done = 0; done < chunk.size();)
                done += static_cast<std::size_t>(
                    stream->write(chunk.data() + done, static_cast<long>(chunk.size() - done)));
        stream->close(StreamClosePolicy::Commit);
    } catch (ByteStreamFailure const& failure) {
        return failure.getErrorCode();
    } catch (Exception const& failure) {
        return failure.getErrorCode();
    }
    return std::nullopt;
}

/// Expects that writing fails, and that the folder is as it was.
void expectNothingLeft(fs::path const& folder, ErrorCode expected)
{
    std::ofstream(folder / "file") << "old";
    EXPECT_EQ(failureOfWriting(folder / "file"), expected);
    std::ostringstream content;
    content << std::ifstream(folder / "file").rdbuf();
    EXPECT_EQ(content.str(), "old");
    long const others = std::count_if(fs::directory_iterator(folder), {}, [](fs::directory_entry const& entry) {
        return entry.path().filename() != "file" && entry.path().filename() != "lost+found";
    });
    EXPECT_EQ(others, 0) << "a scratch file is left";
}

class FullDisk : public testing::TestWithParam<char const*>
{};

TEST_P(FullDisk, KeepsTheOldContentAndNothingElse)
{
    if (std::string const objection = MountedFileSystem::objection(GetParam()); !objection.empty())
        GTEST_SKIP() << objection;
    MountedFileSystem const disk(GetParam(), 2u << 20);
    expectNothingLeft(disk.path(), ErrorCode::NoSpaceLeft);
}

INSTANTIATE_TEST_SUITE_P(FileSystems, FullDisk, testing::Values("tmpfs", "ext4"));

/// For as long as this lives, no file of this process may grow beyond a MiB.
class SizeLimit
{
public:
    SizeLimit()
    {
        ::getrlimit(RLIMIT_FSIZE, &previous_);
        rlimit const limit{.rlim_cur = 1 << 20, .rlim_max = previous_.rlim_max};
        ::setrlimit(RLIMIT_FSIZE, &limit);
        handler_ = std::signal(SIGXFSZ, SIG_IGN);
    }
    ~SizeLimit()
    {
        ::setrlimit(RLIMIT_FSIZE, &previous_);
        std::signal(SIGXFSZ, handler_);
    }
    SizeLimit(SizeLimit const&) = delete;
    SizeLimit& operator=(SizeLimit const&) = delete;

private:
    rlimit previous_{};
    void (*handler_)(int);
};

TEST(FailedWrite, LeavesNothingWhereAFileGrowsTooLarge)
{
    TemporaryFolder const folder;
    SizeLimit const limit;
    expectNothingLeft(folder.path(), ErrorCode::FileTooLarge);
}

TEST(FailedWrite, LeavesNothingWhenTheContentCannotBeSynced)
{
    TemporaryFolder const folder;
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return failWith(ENOSPC); };
    expectNothingLeft(folder.path(), ErrorCode::NoSpaceLeft);
}

TEST(FailedWrite, LeavesNothingWhenTheRenameFails)
{
    TemporaryFolder const folder;
    ReplacedSystemCalls replaced;
    replaced->renameat2 = [](int, char const*, int, char const*, unsigned) { return failWith(EIO); };
    expectNothingLeft(folder.path(), ErrorCode::IOError);
}

} // namespace
} // namespace foundation::storage::local
