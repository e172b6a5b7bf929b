#include <storage/local/scratchFiles.hpp>

#include <gtest/gtest.h>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <array>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <fcntl.h>
#include <filesystem>
#include <string>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using namespace std::chrono_literals;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

class ScratchFiles : public testing::Test
{
protected:
    ScratchFiles() { folder.write(name, "content"); }

    StorageIRI iri() const { return folder.iri(std::u16string(name.begin(), name.end())); }

    void makeOld(std::chrono::hours age) const
    {
        fs::last_write_time(folder / name, fs::file_time_type::clock::now() - age);
    }

    std::string const name = "7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak";
    TemporaryFolder const folder;
};

TEST_F(ScratchFiles, AreRemovedWhenNobodyNeedsThem)
{
    makeOld(2h);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 1h), ScratchFileState::Abandoned);
    EXPECT_FALSE(fs::exists(folder / name));
}

TEST_F(ScratchFiles, AreOnlyLookedAtWhenExamined)
{
    EXPECT_EQ(examineScratchFile(iri(), 0s), ScratchFileState::Abandoned);
    EXPECT_EQ(folder.read(name), "content");
}

TEST_F(ScratchFiles, StayWhileTheyAreYoung)
{
    makeOld(2h);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 3h), ScratchFileState::Recent);
    EXPECT_TRUE(fs::exists(folder / name));
}

TEST_F(ScratchFiles, StayWhileTheyAreOpenInWhicheverWay)
{
    for (int const flags : {O_RDONLY, O_WRONLY, O_RDWR}) {
        int const descriptor = ::open((folder / name).c_str(), flags | O_CLOEXEC);
        EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::InUse);
        ::close(descriptor);
    }
    EXPECT_EQ(examineScratchFile(iri(), 0s), ScratchFileState::Abandoned);
}

TEST_F(ScratchFiles, StayWhileTheyAreMapped)
{
    int const descriptor = ::open((folder / name).c_str(), O_RDWR | O_CLOEXEC);
    void* const memory = ::mmap(nullptr, 7, PROT_READ | PROT_WRITE, MAP_SHARED, descriptor, 0);
    ::close(descriptor);
    ASSERT_NE(memory, MAP_FAILED);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::InUse);
    ::munmap(memory, 7);
}

TEST_F(ScratchFiles, StayWhileAnotherProcessHasThemOpen)
{
    int pipe[2];
    ASSERT_EQ(::pipe(pipe), 0);
    pid_t const child = ::fork();
    if (child == 0) {
        bool const isOpen = ::open((folder / name).c_str(), O_RDONLY | O_CLOEXEC) != -1;
        ::_exit(::write(pipe[1], &isOpen, 1) == 1 && ::pause() == 0);
    }
    bool isOpen = false;
    ASSERT_EQ(::read(pipe[0], &isOpen, 1), 1);
    EXPECT_TRUE(isOpen);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::InUse);
    ::kill(child, SIGKILL);
    ::waitpid(child, nullptr, 0);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::Abandoned);
    ::close(pipe[0]);
    ::close(pipe[1]);
}

/// Up to the rename, and under every durability.
TEST_F(ScratchFiles, StayWhileATransactionIsOpen)
{
    TemporaryFolder const other;
    LocalProvider const provider;
    auto const stream = provider.openTransactionalStream(other.iri(u"file"), {});
    std::u16string const scratch = provider.listAll(other.iri())->entry().getName();
    EXPECT_EQ(removeAbandonedScratchFile(other.iri(scratch), 0s), ScratchFileState::InUse);
    stream->byteStream()->close();
    EXPECT_EQ(removeAbandonedScratchFile(other.iri(scratch), 0s), ScratchFileState::InUse);
    stream->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(fs::exists(other / "file"));
}

TEST_F(ScratchFiles, AreOfTheirFormOnly)
{
    folder.write("file", "");
    EXPECT_EQ(failureOf([&] { removeAbandonedScratchFile(folder.iri(u"file"), 0s); }),
              failure(ErrorCode::InvalidLocation, folder.iri(u"file")));
    fs::remove(folder / name);
    auto const missing = failure(ErrorCode::ResourceNotFound, iri());
    EXPECT_EQ(failureOf([&] { removeAbandonedScratchFile(iri(), 0s); }), missing);
    ASSERT_EQ(::mkfifo((folder / name).c_str(), 0600), 0);
    EXPECT_EQ(failureOf([&] { removeAbandonedScratchFile(iri(), 0s); }), missing);
    EXPECT_TRUE(fs::exists(folder / name));
}

TEST_F(ScratchFiles, AreLinksThatAreOldThemselves)
{
    fs::remove(folder / name);
    folder.write("file", "");
    fs::create_symlink("file", folder / name);
    std::array<timespec, 2> const longAgo{};
    ASSERT_EQ(::utimensat(AT_FDCWD, (folder / name).c_str(), longAgo.data(), AT_SYMLINK_NOFOLLOW), 0);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 1h), ScratchFileState::Recent) << "it was made just now";
    EXPECT_EQ(examineScratchFile(iri(), 0s), ScratchFileState::Abandoned);
    EXPECT_TRUE(fs::is_symlink(folder / name));
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::Abandoned);
    EXPECT_FALSE(fs::is_symlink(folder / name));
    EXPECT_TRUE(fs::exists(folder / "file"));
}

/// What a move to another file system leaves that was killed.
class ScratchFolders : public ScratchFiles
{
protected:
    ScratchFolders()
    {
        fs::remove(folder / name);
        fs::create_directories(folder / name / "a/b");
        folder.write(name + "/a/b/inner", "content");
        fs::create_symlink("nothing", folder / name / "link");
    }
};

TEST_F(ScratchFolders, AreRemovedWhole)
{
    EXPECT_EQ(examineScratchFile(iri(), 0s), ScratchFileState::Abandoned);
    EXPECT_EQ(folder.read(name + "/a/b/inner"), "content");
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::Abandoned);
    EXPECT_FALSE(fs::exists(folder / name));
}

TEST_F(ScratchFolders, StayWhileTheyAreYoungWhateverTimesWereCopied)
{
    for (char const* const entry : {"", "/a", "/a/b", "/a/b/inner"})
        fs::last_write_time(folder / (name + entry), fs::file_time_type::clock::now() - 24h);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 1h), ScratchFileState::Recent);
    EXPECT_EQ(folder.read(name + "/a/b/inner"), "content");
}

TEST_F(ScratchFolders, StayWhileAFileInThemIsOpen)
{
    int const descriptor = ::open((folder / (name + "/a/b/inner")).c_str(), O_RDONLY | O_CLOEXEC);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::InUse);
    EXPECT_EQ(folder.read(name + "/a/b/inner"), "content");
    EXPECT_TRUE(fs::is_symlink(folder / (name + "/link")));
    ::close(descriptor);
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::Abandoned);
}

int leaseError;

class ScratchFilesWithRefusedLeases : public ScratchFiles
{
protected:
    ScratchFilesWithRefusedLeases()
    {
        replaced->fcntl = [](int descriptor, int command, int argument) {
            return command == F_SETLEASE ? failWith(leaseError) : realSystemCalls.fcntl(descriptor, command, argument);
        };
    }

    ReplacedSystemCalls replaced;
};

TEST_F(ScratchFilesWithRefusedLeases, CannotBeJudgedOnFileSystemsWithoutLeases)
{
    leaseError = EINVAL;
    EXPECT_EQ(failureOf([&] { removeAbandonedScratchFile(iri(), 0s); }),
              failure(ErrorCode::UnsupportedOperation, iri()));
    EXPECT_EQ(folder.read(name), "content");
}

TEST_F(ScratchFilesWithRefusedLeases, AreInUse)
{
    leaseError = EWOULDBLOCK;
    EXPECT_EQ(removeAbandonedScratchFile(iri(), 0s), ScratchFileState::InUse);
    EXPECT_EQ(folder.read(name), "content");
}

TEST_F(ScratchFilesWithRefusedLeases, CannotBeJudgedWhenOfOthers)
{
    leaseError = EACCES;
    EXPECT_EQ(failureOf([&] { removeAbandonedScratchFile(iri(), 0s); }), failure(ErrorCode::PermissionDenied, iri()));
    EXPECT_EQ(folder.read(name), "content");
}

TEST(ScratchNames, AreKnownByTheirForm)
{
    EXPECT_TRUE(isScratchName(makeScratchName()));
    EXPECT_TRUE(isScratchName(u"7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak"));
    // The lower byte of U+0137 is that of the digit 7, and of U+0162 that of the letter b.
    EXPECT_FALSE(isScratchName(u"\u0137e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak"));
    EXPECT_FALSE(isScratchName(u"7e9f4b5e-0000-4000-\u0162000-0123456789ab.tmp.bak"));
    EXPECT_FALSE(isScratchName(u"7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak.bak"));
}

} // namespace
} // namespace foundation::storage::local
