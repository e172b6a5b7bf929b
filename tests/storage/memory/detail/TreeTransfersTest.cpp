// Moves and copies within a store.

#include <storage/memory/detail/Tree.hpp>

#include <gtest/gtest.h>

#include <tests/storage/memory/MemoryStore.hpp>

#include <functional>

namespace foundation::storage::memory {
namespace {

using namespace provider;

constexpr ReplacementPolicy allPolicies[] = {ReplacementPolicy::Preserve, ReplacementPolicy::Overwrite,
                                             ReplacementPolicy::Clobber, ReplacementPolicy::NoClobber};
constexpr ReplacementPolicy replacing[] = {ReplacementPolicy::Overwrite, ReplacementPolicy::Clobber};
constexpr ReplacementPolicy preserving[] = {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber};

/// A way to bring a file to another place.
struct Transfer
{
    char const* name;
    std::function<void(IProvider const&, StorageIRI const&, StorageIRI const&, ReplacementPolicy)> run;
    bool keepsSource;
};

void PrintTo(Transfer const& transfer, std::ostream* stream)
{
    *stream << transfer.name;
}

Transfer const move{"Move", [](auto& store, auto& from, auto& to, auto policy) { store.moveFile(from, to, policy); },
                    false};
Transfer const copy{"Copy", [](auto& store, auto& from, auto& to, auto policy) { store.copyFile(from, to, policy); },
                    true};
Transfer const atomicCopy{"AtomicCopy",
                          [](auto& store, auto& from, auto& to, auto policy) {
                              EXPECT_EQ(store.copyFileAtomic(from, to, policy, {}), TransactionStatus::Completed);
                          },
                          true};

class FileTransfer : public testing::TestWithParam<Transfer>
{
protected:
    std::string transfer(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy) const
    {
        return failureOf([&] { GetParam().run(store, from, to, policy); });
    }

    MemoryStore store;
};

INSTANTIATE_TEST_SUITE_P(Memory, FileTransfer, testing::Values(move, copy, atomicCopy),
                         [](auto const& row) { return row.param.name; });

TEST_P(FileTransfer, BringsTheContentToANewPlace)
{
    store.createFolder(at(u"/folder"));
    for (ReplacementPolicy const policy : allPolicies) {
        store.write(u"/source", "content");
        EXPECT_EQ(transfer(at(u"/source"), at(u"/folder/target"), policy), "no failure");
        EXPECT_EQ(store.read(u"/folder/target"), "content");
        EXPECT_EQ(store.fileExists(at(u"/source")), GetParam().keepsSource);
        store.removeFile(at(u"/folder/target"));
    }
}

TEST_P(FileTransfer, ReplacesAFileWhenToldTo)
{
    for (ReplacementPolicy const policy : replacing) {
        store.write(u"/source", "new");
        store.write(u"/target", "old content");
        EXPECT_EQ(transfer(at(u"/source"), at(u"/target"), policy), "no failure");
        EXPECT_EQ(store.read(u"/target"), "new");
    }
}

TEST_P(FileTransfer, PreservesAFileUnlessToldToReplaceIt)
{
    store.write(u"/source", "new");
    store.write(u"/target", "old");
    for (ReplacementPolicy const policy : preserving) {
        EXPECT_EQ(transfer(at(u"/source"), at(u"/target"), policy),
                  failure(ErrorCode::ResourceAlreadyExists, at(u"/target")));
        EXPECT_EQ(store.read(u"/source"), "new");
        EXPECT_EQ(store.read(u"/target"), "old");
    }
}

TEST_P(FileTransfer, NeverReplacesAFolder)
{
    store.write(u"/source", "content");
    store.createFolder(at(u"/target"));
    for (ReplacementPolicy const policy : allPolicies) {
        for (std::u16string const target : {u"/target", u"/"})
            EXPECT_EQ(transfer(at(u"/source"), at(target), policy),
                      failure(ErrorCode::ResourceAlreadyExists, at(target)));
    }
    EXPECT_EQ(store.read(u"/source"), "content");
}

TEST_P(FileTransfer, OntoItselfChangesNothing)
{
    store.write(u"/file", "content");
    auto const before = store.getFileAttributes(at(u"/file")).getLastModified();
    for (ReplacementPolicy const policy : replacing) {
        EXPECT_EQ(transfer(at(u"/file"), at(u"/file"), policy), "no failure");
        EXPECT_EQ(transfer(at(u"/file"), at(u"/./file"), policy), "no failure");
    }
    EXPECT_EQ(store.read(u"/file"), "content");
    EXPECT_EQ(store.getFileAttributes(at(u"/file")).getLastModified(), before);
}

TEST_P(FileTransfer, OntoItselfIsRefusedWhenExistingFilesArePreserved)
{
    store.write(u"/file", "content");
    for (ReplacementPolicy const policy : preserving)
        EXPECT_EQ(transfer(at(u"/file"), at(u"/file"), policy),
                  failure(ErrorCode::ResourceAlreadyExists, at(u"/file")));
}

TEST_P(FileTransfer, NamesAMissingSource)
{
    store.write(u"/target", "old");
    for (std::u16string const target : {u"/target", u"/new", u"/missing/new"})
        EXPECT_EQ(transfer(at(u"/missing"), at(target), ReplacementPolicy::Overwrite),
                  failure(ErrorCode::ResourceNotFound, at(u"/missing")));
    EXPECT_EQ(store.read(u"/target"), "old");
}

TEST_P(FileTransfer, DoesNotTakeAFolder)
{
    store.createFolder(at(u"/folder"));
    EXPECT_EQ(transfer(at(u"/folder"), at(u"/new"), ReplacementPolicy::Overwrite),
              failure(ErrorCode::ResourceNotFound, at(u"/folder")));
    EXPECT_FALSE(store.folderExists(at(u"/new")));
}

TEST_P(FileTransfer, NamesATargetWithoutAFolder)
{
    store.write(u"/source", "content");
    for (std::u16string const target : {u"/missing/new", u"/source/new"})
        EXPECT_EQ(transfer(at(u"/source"), at(target), ReplacementPolicy::Overwrite),
                  failure(ErrorCode::ResourceNotFound, at(target)));
    EXPECT_EQ(store.read(u"/source"), "content");
}

TEST_P(FileTransfer, NamesAnUnwritableTargetFolder)
{
    store.write(u"/source", "content");
    store.createFolder(at(u"/folder"));
    store.setWritable(at(u"/folder"), false);
    EXPECT_EQ(transfer(at(u"/source"), at(u"/folder/new"), ReplacementPolicy::Overwrite),
              failure(ErrorCode::PermissionDenied, at(u"/folder/new")));
    EXPECT_EQ(store.read(u"/source"), "content");
}

TEST_P(FileTransfer, NamesAForeignLocation)
{
    store.write(u"/file", "content");
    StorageIRI const foreign(u"mem://other/file");
    EXPECT_EQ(transfer(foreign, at(u"/new"), ReplacementPolicy::Overwrite),
              failure(ErrorCode::InvalidLocation, foreign));
    EXPECT_EQ(transfer(at(u"/file"), foreign, ReplacementPolicy::Overwrite),
              failure(ErrorCode::InvalidLocation, foreign));
}

TEST_P(FileTransfer, LeavesTheReadersOfTheOldTargetTheirContent)
{
    store.write(u"/source", "new");
    store.write(u"/target", "old");
    auto const reader = store.openReadOnlyStream(at(u"/target"));
    EXPECT_EQ(transfer(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite), "no failure");
    EXPECT_EQ(readAll(*reader), "old");
}

// Moves

TEST(MemoryMove, TakesTheAttributesAlong)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    store.setWritable(at(u"/file"), false);
    auto const time = store.getFileAttributes(at(u"/file")).getLastModified();
    store.moveFile(at(u"/file"), at(u"/moved"), ReplacementPolicy::Preserve);
    EXPECT_FALSE(store.getFileAttributes(at(u"/moved")).isWritable());
    EXPECT_EQ(store.getFileAttributes(at(u"/moved")).getLastModified(), time);
}

TEST(MemoryMove, IsFollowedByOpenStreams)
{
    MemoryStore const store;
    auto const stream = store.openStream(at(u"/file"), rewrite);
    store.moveFile(at(u"/file"), at(u"/moved"), ReplacementPolicy::Preserve);
    writeAll(*stream, "content");
    EXPECT_EQ(store.read(u"/moved"), "content");
}

TEST(MemoryMove, NamesASourceThatMayNotBeTakenAway)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    store.createFile(at(u"/folder/file"));
    store.setWritable(at(u"/folder"), false);
    EXPECT_EQ(failureOf([&] { store.moveFile(at(u"/folder/file"), at(u"/moved"), ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::PermissionDenied, at(u"/folder/file")));
    EXPECT_TRUE(store.fileExists(at(u"/folder/file")));
}

TEST(MemoryMove, TakesAFolderWithAllItHolds)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/folder/sub"));
    store.createFolder(at(u"/other"));
    store.write(u"/folder/sub/file", "content");
    store.moveFolder(at(u"/folder"), at(u"/other/moved"), ReplacementPolicy::Preserve);
    EXPECT_EQ(store.read(u"/other/moved/sub/file"), "content");
    EXPECT_FALSE(store.folderExists(at(u"/folder")));
}

TEST(MemoryMove, NeverReplacesAnythingByAFolder)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    store.createFolder(at(u"/empty"));
    store.createFile(at(u"/file"));
    for (ReplacementPolicy const policy : allPolicies) {
        for (std::u16string const target : {u"/empty", u"/file", u"/"})
            EXPECT_EQ(failureOf([&] { store.moveFolder(at(u"/folder"), at(target), policy); }),
                      failure(ErrorCode::ResourceAlreadyExists, at(target)));
    }
}

TEST(MemoryMove, OfAFolderOntoItselfChangesNothing)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/folder/sub"));
    for (ReplacementPolicy const policy : replacing)
        store.moveFolder(at(u"/folder"), at(u"/folder"), policy);
    for (ReplacementPolicy const policy : preserving)
        EXPECT_EQ(failureOf([&] { store.moveFolder(at(u"/folder"), at(u"/folder"), policy); }),
                  failure(ErrorCode::ResourceAlreadyExists, at(u"/folder")));
    EXPECT_TRUE(store.folderExists(at(u"/folder/sub")));
}

TEST(MemoryMove, OfAFolderBelowItselfIsInvalid)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/folder/sub"));
    for (std::u16string const target : {u"/folder/new", u"/folder/sub/new", u"/./folder/new", u"/folder/../folder/new"})
        EXPECT_EQ(failureOf([&] { store.moveFolder(at(u"/folder"), at(target), ReplacementPolicy::Overwrite); }),
                  failure(ErrorCode::InvalidLocation, at(target)));
    EXPECT_TRUE(store.folderExists(at(u"/folder/sub")));
}

TEST(MemoryMove, OfAFolderDoesNotTakeAFile)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    for (std::u16string const source : {u"/file", u"/missing"})
        EXPECT_EQ(failureOf([&] { store.moveFolder(at(source), at(u"/new"), ReplacementPolicy::Overwrite); }),
                  failure(ErrorCode::ResourceNotFound, at(source)));
}

TEST(MemoryMove, OfTheRootIsRefused)
{
    MemoryStore const store;
    EXPECT_EQ(failureOf([&] { store.moveFolder(at(u"/"), at(u"/"), ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::ResourceInUse, at(u"/")));
}

TEST(MemoryMove, OfAnUnwritableFolderToAnotherFolderIsDenied)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    store.createFolder(at(u"/other"));
    store.setWritable(at(u"/folder"), false);
    EXPECT_EQ(failureOf([&] { store.moveFolder(at(u"/folder"), at(u"/other/new"), ReplacementPolicy::Preserve); }),
              failure(ErrorCode::PermissionDenied, at(u"/other/new")));
    store.moveFolder(at(u"/folder"), at(u"/renamed"), ReplacementPolicy::Preserve);
    EXPECT_TRUE(store.folderExists(at(u"/renamed")));
}

// Copies

TEST(MemoryCopy, SharesNothingThatCanBeSeen)
{
    MemoryStore const store;
    std::string const large(3 * 1048576 + 17, 'x');
    store.write(u"/source", large);
    store.copyFile(at(u"/source"), at(u"/copy"), ReplacementPolicy::Preserve);
    auto const stream = store.openStream(at(u"/copy"), update);
    writeAll(*stream, "changed");
    EXPECT_EQ(store.read(u"/source"), large);
    EXPECT_EQ(store.read(u"/copy"), "changed" + large.substr(7));
}

TEST(MemoryCopy, LooksAtTheTargetFirst)
{
    MemoryStore const store;
    store.write(u"/target", "old");
    for (ReplacementPolicy const policy : preserving)
        EXPECT_EQ(failureOf([&] { store.copyFile(at(u"/missing"), at(u"/target"), policy); }),
                  failure(ErrorCode::ResourceAlreadyExists, at(u"/target")));
}

TEST(MemoryCopy, WritesInPlace)
{
    MemoryStore const store;
    store.write(u"/source", "new");
    auto const stream = store.openStream(at(u"/target"), rewrite);
    store.copyFile(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite);
    EXPECT_EQ(readAll(*stream), "new");
}

TEST(MemoryCopy, OntoAnUnwritableFileIsDenied)
{
    MemoryStore const store;
    store.write(u"/source", "new");
    store.write(u"/target", "old");
    store.setWritable(at(u"/target"), false);
    EXPECT_EQ(failureOf([&] { store.copyFile(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::PermissionDenied, at(u"/target")));
    EXPECT_EQ(store.read(u"/target"), "old");
}

TEST(MemoryCopy, BeyondTheLimitNamesTheSourceAndChangesNothing)
{
    MemoryStore store;
    store.write(u"/source", "12345");
    store.write(u"/target", "old");
    store.limit("9");
    std::string const full = failure(ErrorCode::NoSpaceLeft, at(u"/source"));
    EXPECT_EQ(failureOf([&] { store.copyFile(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite); }), full);
    EXPECT_EQ(failureOf([&] { store.copyFile(at(u"/source"), at(u"/new"), ReplacementPolicy::Overwrite); }), full);
    EXPECT_EQ(store.read(u"/target"), "old");
    EXPECT_FALSE(store.fileExists(at(u"/new")));
}

TEST(MemoryAtomicCopy, IsAnnounced)
{
    EXPECT_TRUE(MemoryStore().hasFeature(ExtendedFeature::AtomicFileCopy));
}

TEST(MemoryAtomicCopy, ReplacesAnUnwritableFile)
{
    MemoryStore const store;
    store.write(u"/source", "new");
    store.write(u"/target", "old");
    store.setWritable(at(u"/target"), false);
    store.copyFileAtomic(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite, {});
    EXPECT_EQ(store.read(u"/target"), "new");
    EXPECT_TRUE(store.getFileAttributes(at(u"/target")).isWritable());
}

TEST(MemoryAtomicCopy, BeyondTheLimitNamesTheTargetAndChangesNothing)
{
    MemoryStore store;
    store.write(u"/source", "12345");
    store.write(u"/target", "old");
    store.limit("12");
    EXPECT_EQ(
        failureOf([&] { store.copyFileAtomic(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite, {}); }),
        failure(ErrorCode::NoSpaceLeft, at(u"/target")));
    EXPECT_EQ(store.read(u"/target"), "old");
}

/// How often a copy asks whether to go on, when told to stop at the given question.
int questionsAsked(MemoryStore const& store, int stopAt, TransactionStatus expected)
{
    int asked = 0;
    auto const interrupt = [&] { return ++asked == stopAt ? InterruptSignal::Abort : InterruptSignal::Continue; };
    EXPECT_EQ(store.copyFileAtomic(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite, interrupt), expected);
    return asked;
}

TEST(MemoryAtomicCopy, AsksWhetherToGoOnAfterEachMebibyte)
{
    struct Row
    {
        std::size_t size;
        int questions;
    };
    for (auto const& [size, questions] : {Row{0, 1}, Row{1, 1}, Row{1048576, 1}, Row{1048577, 2}, Row{5 * 1048576, 5}})
    {
        MemoryStore const store;
        store.write(u"/source", std::string(size, 'x'));
        EXPECT_EQ(questionsAsked(store, -1, TransactionStatus::Completed), questions) << size;
        EXPECT_EQ(store.read(u"/target"), std::string(size, 'x'));
    }
}

TEST(MemoryAtomicCopy, LeavesTheTargetAloneWhenInterruptedAtAnyChunk)
{
    MemoryStore const store;
    store.write(u"/source", std::string(3 * 1048576, 'x'));
    store.write(u"/target", "old");
    for (int const stopAt : {1, 2, 3}) {
        EXPECT_EQ(questionsAsked(store, stopAt, TransactionStatus::Aborted), stopAt);
        EXPECT_EQ(store.read(u"/target"), "old");
        EXPECT_EQ(namesOf(*store.listAll(at(u"/"))), (Names{u"source", u"target"}));
    }
}

TEST(MemoryAtomicCopy, CopiesTheContentOfTheMomentItBegan)
{
    MemoryStore const store;
    store.write(u"/source", std::string(2 * 1048576, 'x'));
    auto const interrupt = [&] { return store.write(u"/source", "changed"), InterruptSignal::Continue; };
    store.copyFileAtomic(at(u"/source"), at(u"/target"), ReplacementPolicy::Preserve, interrupt);
    EXPECT_EQ(store.read(u"/target"), std::string(2 * 1048576, 'x'));
}

TEST(MemoryAtomicCopy, PreservesATargetThatCameMeanwhile)
{
    MemoryStore const store;
    store.write(u"/source", "content");
    auto const interrupt = [&] { return store.write(u"/target", "came first"), InterruptSignal::Continue; };
    EXPECT_EQ(failureOf([&] {
                  store.copyFileAtomic(at(u"/source"), at(u"/target"), ReplacementPolicy::Preserve, interrupt);
              }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"/target")));
    EXPECT_EQ(store.read(u"/target"), "came first");
}

TEST(MemoryAtomicCopy, LeavesTheTargetAloneWhenTheInterruptFunctionThrows)
{
    MemoryStore const store;
    store.write(u"/source", "new");
    store.write(u"/target", "old");
    auto const interrupt = []() -> InterruptSignal { throw std::runtime_error("no answer"); };
    EXPECT_THROW(store.copyFileAtomic(at(u"/source"), at(u"/target"), ReplacementPolicy::Overwrite, interrupt),
                 std::runtime_error);
    EXPECT_EQ(store.read(u"/target"), "old");
}

} // namespace
} // namespace foundation::storage::memory
