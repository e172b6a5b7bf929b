#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ExtendedFeature.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

constexpr ReplacementPolicy policies[] = {ReplacementPolicy::Preserve, ReplacementPolicy::Overwrite,
                                          ReplacementPolicy::Clobber, ReplacementPolicy::NoClobber};
constexpr ReplacementPolicy replacing[] = {ReplacementPolicy::Overwrite, ReplacementPolicy::Clobber};

constexpr std::size_t largeSize = 3000001;

/// Permission bits less the umask, as they were made by the one who runs the test.
mode_t withoutUmask(mode_t mode)
{
    mode_t const mask = ::umask(0);
    ::umask(mask);
    return mode & ~mask;
}

class LocalProviderCopies : public testing::Test
{
protected:
    void copy(std::u16string const& from, std::u16string const& to, ReplacementPolicy policy) const
    {
        provider_.copyFile(at(from), at(to), policy);
    }

    TransactionStatus copyAtomic(std::u16string const& from, std::u16string const& to, ReplacementPolicy policy,
                                 IProvider::Interrupt const& interrupt = {}) const
    {
        return provider_.copyFileAtomic(at(from), at(to), policy, interrupt);
    }

    /// Calls an action with each kind of copy.
    template <typename Action>
    void withBoth(Action const& action) const
    {
        action([&](auto& from, auto& to, ReplacementPolicy policy) { copy(from, to, policy); });
        action([&](auto& from, auto& to, ReplacementPolicy policy) {
            EXPECT_EQ(copyAtomic(from, to, policy), TransactionStatus::Completed);
        });
    }

    StorageIRI at(std::u16string const& name) const { return folder_.iri(name); }

    struct stat statusOf(std::string const& name) const
    {
        struct stat status
        {};
        EXPECT_EQ(::stat((folder_ / name).c_str(), &status), 0);
        return status;
    }

    mode_t modeOf(std::string const& name) const { return statusOf(name).st_mode & 07777; }

    auto entryCount() const { return std::distance(fs::directory_iterator(folder_.path()), {}); }

    TemporaryFolder folder_;
    LocalProvider provider_;
};

TEST_F(LocalProviderCopies, AreAnnouncedAsAtomic)
{
    EXPECT_TRUE(provider_.hasFeature(ExtendedFeature::AtomicFileCopy));
}

TEST_F(LocalProviderCopies, GiveANewFileThePermissionsOfItsSourceLessTheUmask)
{
    folder_.write("from", "content");
    for (mode_t const mode : {mode_t{0700}, mode_t{0777}, mode_t{04755}, mode_t{0444}}) {
        ASSERT_EQ(::chmod((folder_ / "from").c_str(), mode), 0);
        withBoth([&](auto const& copy) {
            copy(u"from", u"to", ReplacementPolicy::Preserve);
            EXPECT_EQ(modeOf("to"), withoutUmask(mode & 0777));
            fs::remove(folder_ / "to");
        });
    }
}

TEST_F(LocalProviderCopies, LeaveAReplacedFileItsPermissions)
{
    folder_.write("from", "content");
    folder_.write("to", "old");
    ASSERT_EQ(::chmod((folder_ / "from").c_str(), 0777), 0);
    ASSERT_EQ(::chmod((folder_ / "to").c_str(), 0640), 0);
    withBoth([&](auto const& copy) {
        copy(u"from", u"to", ReplacementPolicy::Overwrite);
        EXPECT_EQ(modeOf("to"), 0640);
        EXPECT_EQ(folder_.read("to"), "content");
    });
}

TEST_F(LocalProviderCopies, InPlaceLeaveTheFileItsNameAndLinks)
{
    folder_.write("from", "new");
    folder_.write("to", "old and longer");
    fs::create_hard_link(folder_ / "to", folder_ / "second");
    copy(u"from", u"to", ReplacementPolicy::Overwrite);
    EXPECT_EQ(folder_.read("second"), "new");
}

TEST_F(LocalProviderCopies, OfOneKindReplaceALinkAndOfTheOtherWriteThroughIt)
{
    folder_.write("from", "new");
    folder_.write("file", "old");
    fs::create_symlink("file", folder_ / "link");
    copyAtomic(u"from", u"link", ReplacementPolicy::Overwrite);
    EXPECT_FALSE(fs::is_symlink(folder_ / "link"));
    EXPECT_EQ(folder_.read("file"), "old");
    fs::remove(folder_ / "link");
    fs::create_symlink("file", folder_ / "link");
    copy(u"from", u"link", ReplacementPolicy::Overwrite);
    EXPECT_TRUE(fs::is_symlink(folder_ / "link"));
    EXPECT_EQ(folder_.read("file"), "new");
}

TEST_F(LocalProviderCopies, OntoAnotherNameOrALinkChangeNothing)
{
    folder_.write("file", "content");
    fs::create_hard_link(folder_ / "file", folder_ / "second");
    fs::create_symlink("file", folder_ / "link");
    auto const before = statusOf("file");
    withBoth([&](auto const& copy) {
        for (std::u16string const from : {u"file", u"second", u"link"})
            for (std::u16string const to : {u"file", u"second", u"link"})
                for (ReplacementPolicy const policy : replacing)
                    copy(from, to, policy);
    });
    EXPECT_TRUE(fs::is_symlink(folder_ / "link"));
    for (std::string const name : {"file", "second"}) {
        EXPECT_EQ(statusOf(name).st_ino, before.st_ino);
        EXPECT_EQ(statusOf(name).st_mtim.tv_nsec, before.st_mtim.tv_nsec);
    }
    EXPECT_EQ(folder_.read("file"), "content");
}

TEST_F(LocalProviderCopies, NameTheTargetThatIsInTheWayWhateverTheSource)
{
    folder_.write("small", "content");
    folder_.write("large", std::string(largeSize, 'x'));
    folder_.write("file", "old");
    fs::create_directory(folder_ / "folder");
    fs::create_symlink("folder", folder_ / "link to folder");
    withBoth([&](auto const& copy) {
        for (std::u16string const from : {u"small", u"large", u"missing", u"folder"}) {
            for (ReplacementPolicy const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber})
                EXPECT_EQ(failureOf([&] { copy(from, u"file", policy); }),
                          failure(ErrorCode::ResourceAlreadyExists, at(u"file")));
            for (ReplacementPolicy const policy : policies)
                for (std::u16string const to : {u"folder", u"link to folder"})
                    EXPECT_EQ(failureOf([&] { copy(from, to, policy); }),
                              failure(ErrorCode::ResourceAlreadyExists, at(to)));
        }
    });
    EXPECT_EQ(folder_.read("file"), "old");
    EXPECT_EQ(entryCount(), 5);
}

TEST_F(LocalProviderCopies, RefuseSpecialFilesWithoutWaiting)
{
    ASSERT_EQ(::mkfifo((folder_ / "pipe").c_str(), 0600), 0);
    withBoth([&](auto const& copy) {
        EXPECT_EQ(failureOf([&] { copy(u"pipe", u"to", ReplacementPolicy::Overwrite); }),
                  failure(ErrorCode::UnsupportedOperation, at(u"pipe")));
    });
    EXPECT_FALSE(fs::exists(folder_ / "to"));
}

TEST_F(LocalProviderCopies, KeepHoles)
{
    fs::resize_file(folder_.write("from", "x"), 8 << 20);
    if (statusOf("from").st_blocks * 512 > 1 << 20)
        GTEST_SKIP() << "the file system makes no holes";
    withBoth([&](auto const& copy) {
        copy(u"from", u"to", ReplacementPolicy::Overwrite);
        EXPECT_EQ(statusOf("to").st_size, 8 << 20);
        EXPECT_LE(statusOf("to").st_blocks * 512, 1 << 20);
    });
}

TEST_F(LocalProviderCopies, InterruptedAtAnyChunkLeaveNothing)
{
    folder_.write("from", std::string(largeSize, 'x'));
    TransactionStatus status = TransactionStatus::Aborted;
    int chunk = 0;
    while (status == TransactionStatus::Aborted) {
        EXPECT_EQ(entryCount(), 1);
        int asked = 0;
        ++chunk;
        status = copyAtomic(u"from", u"to", ReplacementPolicy::Preserve,
                            [&] { return ++asked == chunk ? InterruptSignal::Abort : InterruptSignal::Continue; });
    }
    EXPECT_GT(chunk, 1);
    EXPECT_EQ(entryCount(), 2);
}

TEST_F(LocalProviderCopies, LeaveNothingWhenTheInterruptFunctionThrows)
{
    folder_.write("from", "content");
    EXPECT_THROW(copyAtomic(u"from", u"to", ReplacementPolicy::Preserve, []() -> InterruptSignal { throw 1; }), int);
    EXPECT_EQ(entryCount(), 1);
}

TEST_F(LocalProviderCopies, NameTheEndThatFailed)
{
    folder_.write("from", "content");
    folder_.write("to", "old");
    {
        ReplacedSystemCalls calls;
        calls->write = [](int, void const*, std::size_t) { return static_cast<ssize_t>(failWith(ENOSPC)); };
        EXPECT_EQ(failureOf([&] { copyAtomic(u"from", u"to", ReplacementPolicy::Overwrite); }),
                  failure(ErrorCode::NoSpaceLeft, at(u"to")));
    }
    {
        ReplacedSystemCalls calls;
        calls->read = [](int, void*, std::size_t) { return static_cast<ssize_t>(failWith(EIO)); };
        EXPECT_EQ(failureOf([&] { copyAtomic(u"from", u"to", ReplacementPolicy::Overwrite); }),
                  failure(ErrorCode::IOError, at(u"from")));
    }
    EXPECT_EQ(folder_.read("to"), "old");
    EXPECT_EQ(entryCount(), 2);
}

TEST_F(LocalProviderCopies, InPlaceNameTheSourceWhicheverEndFailed)
{
    folder_.write("from", "content");
    ReplacedSystemCalls calls;
    calls->write = [](int, void const*, std::size_t) { return static_cast<ssize_t>(failWith(ENOSPC)); };
    EXPECT_EQ(failureOf([&] { copy(u"from", u"to", ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::NoSpaceLeft, at(u"from")));
}

TEST_F(LocalProviderCopies, OfSmallFilesToNewNamesLookAtNothingButTheOpenSource)
{
    folder_.write("from", "content");
    int looks = 0;
    {
        ReplacedSystemCalls calls;
        static int* counter = nullptr;
        counter = &looks;
        calls->statx = [](int at, char const* path, int flags, unsigned mask, struct statx* result) {
            ++*counter;
            return ::statx(at, path, flags, mask, result);
        };
        copyAtomic(u"from", u"to", ReplacementPolicy::NoClobber);
    }
    EXPECT_EQ(looks, 1);
    EXPECT_EQ(folder_.read("to"), "content");
}

TEST_F(LocalProviderCopies, NeverReplaceWhatAppearsMeanwhile)
{
    for (std::size_t const size : {std::size_t{7}, largeSize}) {
        folder_.write("from", std::string(size, 'x'));
        auto const appear = [&] {
            folder_.write("to", "somebody else's");
            return InterruptSignal::Continue;
        };
        EXPECT_EQ(failureOf([&] { copyAtomic(u"from", u"to", ReplacementPolicy::NoClobber, appear); }),
                  failure(ErrorCode::ResourceAlreadyExists, at(u"to")));
        EXPECT_EQ(folder_.read("to"), "somebody else's");
        EXPECT_EQ(entryCount(), 2);
        fs::remove(folder_ / "to");
    }
}

/// Between the look at the target and its opening.
fs::path appearing;

TEST_F(LocalProviderCopies, InPlaceDoNotWriteIntoAFileThatAppearsMeanwhile)
{
    folder_.write("from", "content");
    appearing = folder_ / "to";
    for (ReplacementPolicy const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber}) {
        fs::remove(appearing);
        ReplacedSystemCalls replaced;
        replaced->openat = [](int at, char const* path, int flags, mode_t mode) {
            if ((flags & O_CREAT) != 0)
                std::ofstream(appearing) << "of the winner";
            return realSystemCalls.openat(at, path, flags, mode);
        };
        EXPECT_EQ(failureOf([&] { copy(u"from", u"to", policy); }),
                  failure(ErrorCode::ResourceAlreadyExists, at(u"to")));
        EXPECT_EQ(folder_.read("to"), "of the winner");
    }
}

TEST_F(LocalProviderCopies, InPlaceMakeWhatABrokenLinkLeadsTo)
{
    folder_.write("from", "content");
    fs::create_symlink("missing", folder_ / "link");
    copy(u"from", u"link", ReplacementPolicy::Preserve);
    EXPECT_EQ(folder_.read("missing"), "content");
    EXPECT_TRUE(fs::is_symlink(folder_ / "link"));
}

TEST_F(LocalProviderCopies, OntoThemselvesNeedNoPermissionToWrite)
{
    folder_.write("file", "content");
    fs::create_symlink("file", folder_ / "link");
    fs::create_hard_link(folder_ / "file", folder_ / "second name");
    ReplacedSystemCalls replaced;
    replaced->openat = [](int at, char const* path, int flags, mode_t mode) {
        bool const writes = (flags & O_PATH) == 0 && (flags & O_ACCMODE) != O_RDONLY;
        return writes ? failWith(ETXTBSY) : realSystemCalls.openat(at, path, flags, mode);
    };
    for (auto const* const name : {u"file", u"link", u"second name"})
        withBoth([&](auto const& copy) {
            EXPECT_EQ(failureOf([&] { copy(u"file", name, ReplacementPolicy::Overwrite); }), "no failure");
        });
    EXPECT_EQ(folder_.read("file"), "content");
}

} // namespace
} // namespace foundation::storage::local
