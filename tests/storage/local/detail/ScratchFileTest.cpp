#include <storage/local/detail/ScratchFile.hpp>

#include <gtest/gtest.h>

#include <storage/local/DurabilityException.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/storage/local/detail/ScratchFileFixture.hpp>
#include <tests/support/failureOf.hpp>

#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace foundation::storage::local::detail {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;

TEST_F(ScratchFileTest, TakesTheTargetsPlaceWhole)
{
    for (Durability const durability : {Durability::None, Durability::File, Durability::Full}) {
        folder.write("file", "old, and longer");
        auto const scratch = begin(u"file", durability);
        EXPECT_EQ(folder.read("file"), "old, and longer");
        EXPECT_EQ(names().size(), 2u);
        scratch->commit(overwrite);
        EXPECT_EQ(folder.read("file"), "new");
        EXPECT_EQ(names(), Names{"file"});
    }
}

TEST_F(ScratchFileTest, LeavesNothingWhenItIsDiscardedOrDropped)
{
    folder.write("file", "old");
    begin(u"file")->discard();
    begin(u"file").reset();
    begin(u"new")->discard();
    EXPECT_EQ(names(), Names{"file"});
    EXPECT_EQ(folder.read("file"), "old");
}

TEST_F(ScratchFileTest, KeepsThePermissionBitsOfTheFileThatItReplaces)
{
    for (unsigned const mode : {0600u, 0640u, 0666u, 0755u, 0444u, 0u}) {
        fs::permissions(folder.write("file", "old"), fs::perms(mode));
        begin(u"file")->commit(overwrite);
        EXPECT_EQ(modeOf("file"), mode);
        fs::remove(folder / "file");
    }
}

TEST_F(ScratchFileTest, TakesPermissionBitsThatChangedMeanwhile)
{
    folder.write("file", "old");
    auto const scratch = begin(u"file");
    fs::permissions(folder / "file", fs::perms(0640));
    scratch->commit(overwrite);
    EXPECT_EQ(modeOf("file"), 0640u);
}

TEST_F(ScratchFileTest, GrantsNoOtherUsersRightsToItsContent)
{
    fs::permissions(folder.write("program", "old"), fs::perms(04755));
    begin(u"program")->commit(overwrite);
    EXPECT_EQ(modeOf("program"), 0755u);
}

TEST_F(ScratchFileTest, CannotBeReadByOthersWhereTheTargetCannot)
{
    fs::permissions(folder.write("secret", "old"), fs::perms(0600));
    fs::create_symlink("secret", folder / "link");
    for (char16_t const* const name : {u"secret", u"link"}) {
        auto const scratch = begin(name);
        struct stat status
        {};
        ASSERT_EQ(::fstat(scratch->file().get(), &status), 0);
        EXPECT_EQ(status.st_mode & 07777u, 0600u);
    }
}

TEST_F(ScratchFileTest, HasTheModeOfANewFileWhereItReplacesNone)
{
    mode_t const previous = ::umask(027);
    begin(u"new")->commit(overwrite);
    ScratchFile(root, at(u"other"), Durability::None, O_WRONLY, 0777).commit(preserve);
    ::umask(previous);
    EXPECT_EQ(modeOf("new"), 0640u);
    EXPECT_EQ(modeOf("other"), 0750u);
}

TEST_F(ScratchFileTest, ReplacesALinkAndNotWhatItLeadsTo)
{
    fs::permissions(folder.write("target", "target"), fs::perms(0640));
    fs::create_symlink("target", folder / "link");
    fs::create_symlink("nothing", folder / "broken");
    begin(u"link")->commit(overwrite);
    begin(u"broken")->commit(overwrite);
    EXPECT_EQ(folder.read("target"), "target");
    for (char const* const name : {"link", "broken"}) {
        EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(folder / name)));
        EXPECT_EQ(folder.read(name), "new");
    }
    EXPECT_EQ(modeOf("link"), 0640u);
}

TEST_F(ScratchFileTest, NeverReplacesAFolder)
{
    fs::create_directory(folder / "folder");
    fs::create_symlink("folder", folder / "link");
    for (auto const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber, ReplacementPolicy::Overwrite,
                              ReplacementPolicy::Clobber})
        for (char16_t const* const name : {u"folder", u"link"}) {
            auto scratch = begin(name);
            EXPECT_EQ(failureOf([&] { scratch->commit(policy); }), failure(ErrorCode::ResourceAlreadyExists, at(name)));
            scratch.reset();
            EXPECT_EQ(names(), (Names{"folder", "link"}));
        }
}

TEST_F(ScratchFileTest, IsNotMadeForTheTopFolder)
{
    fs::create_directory(folder / "root");
    Root const confined((folder / "root").native());
    auto const make = [](Root const& store, StorageIRI const& iri) { ScratchFile(store, iri, Durability::Full); };
    EXPECT_EQ(failureOf([&] { make(confined, at(u"root")); }), failure(ErrorCode::ResourceAlreadyExists, at(u"root")));
    StorageIRI const top(u"file:///");
    EXPECT_EQ(failureOf([&] { make(root, top); }), failure(ErrorCode::ResourceAlreadyExists, top));
    EXPECT_EQ(names("root"), Names{});
}

TEST_F(ScratchFileTest, ReplacesNothingWhereItMustNot)
{
    folder.write("file", "old");
    fs::create_symlink("nothing", folder / "broken");
    for (auto const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber})
        for (char16_t const* const name : {u"file", u"broken"})
            EXPECT_EQ(failureOf([&] { begin(name)->commit(policy); }),
                      failure(ErrorCode::ResourceAlreadyExists, at(name)));
    begin(u"new")->commit(preserve);
    EXPECT_EQ(names(), (Names{"broken", "file", "new"}));
    EXPECT_EQ(folder.read("file"), "old");
}

TEST_F(ScratchFileTest, ReplacesNothingOnFileSystemsThatCannotRefuseInARename)
{
    ReplacedSystemCalls replaced;
    replaced->renameat2 = [](int from, char const* name, int to, char const* newName, unsigned flags) {
        return flags != 0 ? failWith(EINVAL) : ::renameat(from, name, to, newName);
    };
    folder.write("file", "old");
    EXPECT_EQ(failureOf([&] { begin(u"file")->commit(preserve); }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"file")));
    begin(u"new")->commit(preserve);
    EXPECT_EQ(names(), (Names{"file", "new"}));
    EXPECT_EQ(folder.read("file"), "old");
}

TEST_F(ScratchFileTest, StaysInItsFolderWhenThatIsSwappedForALink)
{
    fs::create_directory(folder / "folder");
    fs::create_directory(folder / "elsewhere");
    auto committed = begin(u"folder/file");
    auto nameless = begin(u"folder/unsynced", Durability::None);
    auto discarded = begin(u"folder/other");
    fs::rename(folder / "folder", folder / "moved");
    fs::create_directory_symlink("elsewhere", folder / "folder");
    committed->commit(overwrite);
    nameless->commit(overwrite);
    discarded->discard();
    EXPECT_EQ(names("moved"), (Names{"file", "unsynced"}));
    EXPECT_EQ(names("elsewhere"), Names{});
}

TEST_F(ScratchFileTest, WorksBeneathARoot)
{
    fs::create_directory(folder / "root");
    folder.write("outside", "secret");
    fs::create_symlink("../outside", folder / "root/link");
    Root const confined((folder / "root").native());
    ScratchFile scratch(confined, at(u"root/link"), Durability::Full);
    scratch.commit(overwrite);
    EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(folder / "root/link")));
    EXPECT_EQ(folder.read("outside"), "secret");
}

TEST_F(ScratchFileTest, CanStandInAnotherFolder)
{
    fs::create_directory(folder / "a");
    fs::create_directory(folder / "b");
    int const flags = O_WRONLY | O_CREAT;
    ScratchFile(root, at(u"a/file"), at(u"b/scratch"), Durability::Full, flags).commit(overwrite);
    EXPECT_EQ(names("a"), Names{"file"});
    EXPECT_EQ(names("b"), Names{});
    ScratchFile(root, at(u"a/file"), at(u"b/scratch"), Durability::Full, flags).discard();
    EXPECT_EQ(names("b"), Names{});
}

TEST_F(ScratchFileTest, IsNotMadeThroughALink)
{
    folder.write("victim", "victim");
    fs::create_symlink("victim", folder / "scratch");
    EXPECT_EQ(failureOf([&] {
                  ScratchFile(root, at(u"file"), at(u"scratch"), Durability::Full, O_WRONLY | O_CREAT | O_TRUNC);
              }),
              failure(ErrorCode::InvalidLocation, at(u"scratch")));
    EXPECT_EQ(folder.read("victim"), "victim");
    EXPECT_EQ(names(), (Names{"scratch", "victim"}));
}

TEST_F(ScratchFileTest, NamesTheTargetInItsFailuresWhereTheNameIsItsOwn)
{
    EXPECT_EQ(failureOf([&] { begin(u"missing/file"); }), failure(ErrorCode::ResourceNotFound, at(u"missing/file")));
    EXPECT_EQ(failureOf([&] {
                  ScratchFile(root, at(u"missing/file"), at(u"missing/scratch"), Durability::Full, O_WRONLY | O_CREAT);
              }),
              failure(ErrorCode::ResourceNotFound, at(u"missing/scratch")));
}

TEST_F(ScratchFileTest, CanBeCommittedAgainWhenTheRenameFailed)
{
    folder.write("file", "old");
    auto const scratch = begin(u"file");
    {
        ReplacedSystemCalls replaced;
        replaced->renameat2 = [](int, char const*, int, char const*, unsigned) { return failWith(EBUSY); };
        EXPECT_EQ(failureOf([&] { scratch->commit(overwrite); }), failure(ErrorCode::ResourceInUse, at(u"file")));
        EXPECT_EQ(folder.read("file"), "old");
    }
    scratch->commit(overwrite);
    EXPECT_EQ(folder.read("file"), "new");
    EXPECT_EQ(names(), Names{"file"});
}

TEST_F(ScratchFileTest, IsNeverCommittedOnceItsContentWasNotWritten)
{
    for (Durability const durability : {Durability::None, Durability::File, Durability::Full}) {
        folder.write("file", "old");
        auto const scratch = begin(u"file", durability);
        auto const failed = failure(ErrorCode::IOError, at(u"file"));
        {
            ReplacedSystemCalls replaced;
            replaced->fsync = [](int) { return failWith(EIO); };
            replaced->close = [](int descriptor) { return ::close(descriptor), failWith(EIO); };
            EXPECT_EQ(failureOf([&] { scratch->commit(overwrite); }), failed);
        }
        EXPECT_EQ(failureOf([&] { scratch->commit(overwrite); }), failed);
        EXPECT_EQ(folder.read("file"), "old");
        scratch->discard();
        EXPECT_EQ(names(), Names{"file"});
    }
}

TEST_F(ScratchFileTest, SaysWhenItIsInPlaceAndNotCertainToSurvive)
{
    folder.write("file", "old");
    static int syncs;
    syncs = 0;
    auto const scratch = begin(u"file");
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return syncs++ == 0 ? 0 : failWith(EIO); };
    for (int attempt = 1; attempt <= 2; ++attempt)
        EXPECT_THROW(scratch->commit(overwrite), DurabilityException);
    EXPECT_EQ(syncs, 3) << "the content is synced once, the folder by each commit";
    EXPECT_EQ(folder.read("file"), "new");
    scratch->discard();
    EXPECT_EQ(folder.read("file"), "new");
    EXPECT_EQ(names(), Names{"file"});
}

TEST_F(ScratchFileTest, RepeatsTheSyncOfTheFolderAlone)
{
    auto const scratch = begin(u"file");
    static int syncs;
    syncs = 0;
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return syncs++ == 1 ? failWith(EIO) : 0; };
    EXPECT_THROW(scratch->commit(overwrite), DurabilityException);
    folder.write("file", "newer");
    scratch->commit(overwrite);
    EXPECT_EQ(syncs, 3);
    EXPECT_EQ(folder.read("file"), "newer");
}

TEST_F(ScratchFileTest, SyncsAllOfAFileSystemThatSyncsNoSingleFolder)
{
    static int whole;
    whole = 0;
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return failWith(EINVAL); };
    replaced->syncfs = [](int descriptor) {
        ++whole;
        return ::fcntl(descriptor, F_GETFD) == -1 ? -1 : 0;
    };
    begin(u"file")->commit(overwrite);
    EXPECT_EQ(whole, 2);
}

} // namespace
} // namespace foundation::storage::local::detail
