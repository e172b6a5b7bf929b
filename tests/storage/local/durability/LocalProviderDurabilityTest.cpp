#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/DurabilityException.hpp>
#include <tests/storage/local/RecordedSystemCalls.hpp>
#include <tests/storage/local/namelessFiles.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <boost/property_tree/ptree.hpp>

#include <fcntl.h>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>
#include <unistd.h>
#include <utility>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::RecordedSystemCalls;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;
using Told = std::vector<std::string>;

constexpr auto commit = StreamClosePolicy::Commit;
constexpr auto abandon = StreamClosePolicy::Abort;

class LocalProviderDurability : public testing::Test
{
protected:
    LocalProviderDurability() { folder.write("file", "old"); }

    void configure(std::string const& durability)
    {
        boost::property_tree::ptree settings;
        settings.put("durability", durability);
        provider.configure(settings);
    }

    StorageIRI at(std::u16string const& name) const { return folder.iri(name); }

    std::unique_ptr<TransactionalStream> begin() const
    {
        auto stream = provider.openTransactionalStream(at(u"file"), {});
        stream->write("new", 3);
        return stream;
    }

    std::string folderName() const { return folder.path().filename(); }

    TemporaryFolder const folder;
    LocalProvider provider;
};

TEST_F(LocalProviderDurability, SyncsContentThenNameThenFolderInAFullCommit)
{
    RecordedSystemCalls const record;
    begin()->close(commit);
    EXPECT_EQ(record.told(), (Told{"create scratch", "write \"new\"", "sync scratch", "rename scratch to file",
                                   "sync " + folderName()}));
}

TEST_F(LocalProviderDurability, SyncsContentBeforeTheNameUnderFile)
{
    configure("file");
    RecordedSystemCalls const record;
    begin()->close(commit);
    EXPECT_EQ(record.told(), (Told{"create scratch", "write \"new\"", "sync scratch", "rename scratch to file"}));
}

TEST_F(LocalProviderDurability, SyncsNothingUnderNone)
{
    configure("none");
    RecordedSystemCalls const record;
    begin()->close(commit);
    EXPECT_EQ(record.told(), (Told{"create scratch", "write \"new\"", "rename scratch to file"}));
}

TEST_F(LocalProviderDurability, OfAnAtomicCopyIsThatOfACommit)
{
    folder.write("source", "new");
    std::vector<std::pair<std::string, Told>> const rows{
        {"full", {"sync scratch", "rename scratch to file", "sync " + folderName()}},
        {"file", {"sync scratch", "rename scratch to file"}},
        {"none", {"rename scratch to file"}},
    };
    for (auto const& [durability, end] : rows) {
        configure(durability);
        RecordedSystemCalls const record;
        EXPECT_EQ(provider.copyFileAtomic(at(u"source"), at(u"file"), ReplacementPolicy::Overwrite, {}),
                  TransactionStatus::Completed);
        Told told = record.told();
        ASSERT_GT(told.size(), end.size());
        EXPECT_EQ(told.front(), "create scratch");
        EXPECT_EQ(told[told.size() - end.size() - 1], "write \"new\"");
        told.erase(told.begin(), told.end() - static_cast<std::ptrdiff_t>(end.size()));
        EXPECT_EQ(told, end) << durability;
    }
}

TEST_F(LocalProviderDurability, NamesACopyOnceItIsWholeUnderNone)
{
    if (!tests::support::hasNamelessFiles(folder.path()))
        GTEST_SKIP() << "the file system has no files without names";
    folder.write("source", "new");
    configure("none");
    RecordedSystemCalls const record;
    provider.copyFileAtomic(at(u"source"), at(u"copy"), ReplacementPolicy::Preserve, {});
    EXPECT_EQ(record.told(), (Told{"create nameless", "write \"new\"", "link nameless to copy"}));
}

TEST_F(LocalProviderDurability, SyncsNothingThatIsAborted)
{
    RecordedSystemCalls const record;
    begin()->close(abandon);
    EXPECT_EQ(record.told(), (Told{"create scratch", "write \"new\"", "unlink scratch"}));
}

/// Two `statx` look at the target, before and after, one at the scratch file.
TEST_F(LocalProviderDurability, TakesNoCallTooMany)
{
    RecordedSystemCalls const record;
    begin()->close(commit);
    EXPECT_EQ(record.calls(), (Told{"openat", "statx", "openat", "write", "statx", "statx", "fsync", "renameat2",
                                    "fsync", "close", "close"}));
}

TEST_F(LocalProviderDurability, SyncsTheFolderOfANewFolder)
{
    {
        RecordedSystemCalls const record;
        provider.createFolder(at(u"new"));
        provider.createFolderRecursive(at(u"new/a/b"));
        EXPECT_EQ(record.told(),
                  (Told{"create new", "sync " + folderName(), "create a", "sync new", "create b", "sync a"}));
    }
    configure("file");
    RecordedSystemCalls const record;
    provider.createFolder(at(u"other"));
    EXPECT_EQ(record.told(), Told{"create other"});
}

TEST_F(LocalProviderDurability, SyncsTheFolderOfTheTargetThenThatOfTheSourceOfAMove)
{
    fs::create_directories(folder / "a/moved");
    fs::create_directory(folder / "b");
    RecordedSystemCalls record;
    provider.moveFile(at(u"file"), at(u"a/file"), ReplacementPolicy::Preserve);
    EXPECT_EQ(record.told(), (Told{"rename file to file", "sync a", "sync " + folderName()}));
    record.clear();
    provider.moveFolder(at(u"a/moved"), at(u"b/moved"), ReplacementPolicy::Preserve);
    EXPECT_EQ(record.told(), (Told{"rename moved to moved", "sync b", "sync a"}));
    record.clear();
    provider.moveFile(at(u"a/file"), at(u"a/other"), ReplacementPolicy::Overwrite);
    EXPECT_EQ(record.told(), (Told{"rename file to other", "sync a"}));
    record.clear();
    configure("file");
    provider.moveFile(at(u"a/other"), at(u"file"), ReplacementPolicy::Preserve);
    EXPECT_EQ(record.told(), (Told{"rename other to file"}));
}

TEST_F(LocalProviderDurability, SyncsAScratchFileThatItsWriterMovesToItsPlace)
{
    folder.write("7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak", "new");
    RecordedSystemCalls const record;
    provider.moveFile(at(u"7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak"), at(u"new"), ReplacementPolicy::NoClobber);
    EXPECT_EQ(record.told(), (Told{"sync scratch", "rename scratch to new", "sync " + folderName()}));
}

TEST_F(LocalProviderDurability, MovesNoScratchFileThatCannotBeSynced)
{
    std::string const name = "7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak";
    StorageIRI const scratch = at(std::u16string(name.begin(), name.end()));
    folder.write(name, "new");
    ReplacedSystemCalls replaced;
    for (auto const& [error, code] :
         {std::pair(EMFILE, ErrorCode::ResourceInUse), {EACCES, ErrorCode::PermissionDenied}}) {
        static int refusal;
        refusal = error;
        replaced->openat = [](int, char const*, int, mode_t) { return failWith(refusal); };
        EXPECT_EQ(failureOf([&] { provider.moveFile(scratch, at(u"new"), ReplacementPolicy::NoClobber); }),
                  failure(code, scratch));
        EXPECT_FALSE(fs::exists(folder / "new"));
    }
}

TEST_F(LocalProviderDurability, SyncsAScratchFileThatMayOnlyBeWritten)
{
    folder.write("7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak", "new");
    RecordedSystemCalls record;
    static decltype(record->openat) open;
    open = record->openat;
    record->openat = [](int at, char const* path, int flags, mode_t mode) {
        bool const reads = (flags & (O_ACCMODE | O_PATH | O_DIRECTORY)) == O_RDONLY;
        return reads ? failWith(EACCES) : open(at, path, flags, mode);
    };
    provider.moveFile(at(u"7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak"), at(u"new"), ReplacementPolicy::NoClobber);
    EXPECT_EQ(record.told(), (Told{"sync scratch", "rename scratch to new", "sync " + folderName()}));
}

TEST_F(LocalProviderDurability, IsThatOfTheSettingsThatAStreamWasOpenedWith)
{
    RecordedSystemCalls const record;
    auto const stream = begin();
    configure("none");
    stream->close(commit);
    EXPECT_EQ(record.told().back(), "sync " + folderName());
}

/// A commit whose n-th sync fails, counted from 0.
std::string failingSync(TransactionalStream& stream, int number)
{
    static int left;
    left = number;
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return left-- == 0 ? failWith(EIO) : 0; };
    try {
        stream.close(commit);
        return "no failure";
    } catch (DurabilityException const& error) {
        return "not durable: " + failure(error.getErrorCode(), error.getStorageIRI());
    } catch (Exception const& error) {
        return failure(error.getErrorCode(), error.getStorageIRI());
    }
}

TEST_F(LocalProviderDurability, RefusesForGoodToCommitContentThatTheDiskDidNotTake)
{
    auto const stream = begin();
    EXPECT_EQ(failingSync(*stream, 0), failure(ErrorCode::IOError, at(u"file")));
    EXPECT_EQ(failureOf([&] { stream->close(commit); }), failure(ErrorCode::IOError, at(u"file")));
    EXPECT_EQ(folder.read("file"), "old");
    stream->close(abandon);
    EXPECT_EQ(folder.read("file"), "old");
    EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 1);
}

TEST_F(LocalProviderDurability, LetsACommitWhoseFolderWasNotSyncedBeTriedAgain)
{
    auto const stream = begin();
    EXPECT_EQ(failingSync(*stream, 1), "not durable: " + failure(ErrorCode::IOError, at(u"file")));
    EXPECT_EQ(folder.read("file"), "new");
    RecordedSystemCalls const record;
    stream->close(commit);
    EXPECT_EQ(record.told(), Told{"sync " + folderName()});
}

TEST_F(LocalProviderDurability, LeavesInPlaceWhatIsAbortedAfterTheRename)
{
    for (bool const isDropped : {false, true}) {
        auto stream = begin();
        EXPECT_EQ(failingSync(*stream, 1), "not durable: " + failure(ErrorCode::IOError, at(u"file")));
        if (!isDropped)
            stream->close(abandon);
        stream.reset();
        EXPECT_EQ(folder.read("file"), "new");
        EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 1);
    }
}

TEST_F(LocalProviderDurability, SaysThatANewFolderOrAMoveIsNotCertain)
{
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return failWith(EIO); };
    EXPECT_THROW(provider.createFolder(at(u"new")), DurabilityException);
    EXPECT_THROW(provider.createFolderRecursive(at(u"several/folders/deep")), DurabilityException);
    EXPECT_TRUE(fs::exists(folder / "several/folders/deep"));
    EXPECT_THROW(provider.moveFile(at(u"file"), at(u"new/file"), ReplacementPolicy::Preserve), DurabilityException);
    EXPECT_EQ(folder.read("new/file"), "old");
}

TEST_F(LocalProviderDurability, MakesAllFoldersBeforeItSaysThatTheyAreNotCertain)
{
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return failWith(EIO); };
    try {
        provider.createFolderRecursive(at(u"a/b/c"));
        ADD_FAILURE() << "nothing is reported";
    } catch (DurabilityException const& error) {
        EXPECT_EQ(error.getErrorCode(), ErrorCode::IOError);
        EXPECT_EQ(error.getStorageIRI(), at(u"a/b/c"));
    }
    EXPECT_TRUE(fs::is_directory(folder / "a/b/c"));
}

TEST_F(LocalProviderDurability, DoesNotCallAFolderUncertainThatCouldNotBeMade)
{
    ReplacedSystemCalls replaced;
    replaced->fsync = [](int) { return failWith(EIO); };
    replaced->mkdirat = [](int at, char const* path, mode_t mode) {
        return std::string_view(path).ends_with('b') ? failWith(ENOSPC) : realSystemCalls.mkdirat(at, path, mode);
    };
    EXPECT_EQ(failureOf([&] { provider.createFolderRecursive(at(u"a/b/c")); }),
              failure(ErrorCode::NoSpaceLeft, at(u"a/b/c")));
}

fs::path swapped;

void swapFolder()
{
    if (fs::exists(swapped.native() + " away"))
        return;
    fs::rename(swapped, swapped.native() + " away");
    fs::create_directory(swapped);
}

/// Folders that are swapped for others once something has been put into them.
class LocalProviderDurabilityInSwappedFolders : public LocalProviderDurability
{
protected:
    LocalProviderDurabilityInSwappedFolders()
    {
        swapped = folder / "a";
        fs::create_directory(swapped);
        synced.clear();
        replaced->fsync = [](int descriptor) {
            synced.push_back(fs::read_symlink("/proc/self/fd/" + std::to_string(descriptor)).filename());
            return realSystemCalls.fsync(descriptor);
        };
        replaced->renameat2 = [](int from, char const* name, int to, char const* newName, unsigned flags) {
            int const result = realSystemCalls.renameat2(from, name, to, newName, flags);
            swapFolder();
            return result;
        };
        replaced->mkdirat = [](int at, char const* path, mode_t mode) {
            int const result = realSystemCalls.mkdirat(at, path, mode);
            swapFolder();
            return result;
        };
    }

    inline static Told synced;
    ReplacedSystemCalls replaced;
};

TEST_F(LocalProviderDurabilityInSwappedFolders, IsThatOfTheFolderThatHoldsTheNewOne)
{
    provider.createFolder(at(u"a/new"));
    EXPECT_EQ(synced, Told{"a away"});
}

TEST_F(LocalProviderDurabilityInSwappedFolders, IsThatOfTheFolderThatHoldsWhatWasMoved)
{
    provider.moveFile(at(u"file"), at(u"a/file"), ReplacementPolicy::Preserve);
    EXPECT_EQ(synced, (Told{"a away", folderName()}));
    EXPECT_EQ(folder.read("a away/file"), "old");
}

TEST_F(LocalProviderDurabilityInSwappedFolders, IsThatOfTheFolderThatHeldIt)
{
    folder.write("a/inner", "inner");
    provider.moveFile(at(u"a/inner"), at(u"inner"), ReplacementPolicy::Preserve);
    EXPECT_EQ(synced, (Told{folderName(), "a away"}));
}

TEST_F(LocalProviderDurability, LeavesNoScratchFileBehindAnException)
{
    EXPECT_THROW(
        {
            auto const stream = begin();
            throw std::runtime_error("the writer gives up");
        },
        std::runtime_error);
    EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 1);
}

TEST_F(LocalProviderDurability, NeedsAScratchFileThatIsNotToBeCreated)
{
    ByteStreamOpenOptions const options{ByteStreamAccess::WriteOnly, ByteStreamCreate::NeverCreate,
                                        ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite};
    try {
        provider.openTransactionalStream(at(u"file"), options);
        ADD_FAILURE() << "opened what is not there";
    } catch (Exception const& error) {
        EXPECT_EQ(error.getErrorCode(), ErrorCode::ResourceNotFound);
        EXPECT_TRUE(error.getStorageIRI().getName().ends_with(u".tmp.bak"));
    }
}

TEST_F(LocalProviderDurability, ReadsOnlyWhatWasOpenedForReading)
{
    auto const stream = begin();
    char byte = 0;
    EXPECT_EQ(stream->seek(0, std::ios_base::beg), 0);
    EXPECT_EQ(stream->read(&byte, 1), -1);
    ByteStreamOpenOptions options;
    options.access = ByteStreamAccess::ReadWrite;
    auto const readable = provider.openTransactionalStream(at(u"file"), options);
    readable->write("x", 1);
    EXPECT_EQ(readable->seek(0, std::ios_base::beg), 0);
    EXPECT_EQ(readable->read(&byte, 1), 1);
    EXPECT_EQ(byte, 'x');
}

} // namespace
} // namespace foundation::storage::local
