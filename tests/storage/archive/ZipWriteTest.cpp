#include <storage/archive/ArchiveProvider.hpp>

#include <storage/archive/ArchiveException.hpp>
#include <storage/memory/MemoryProvider.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/StreamClosePolicy.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/rawZips.hpp>
#include <tests/storage/archive/writing.hpp>
#include <tests/storage/archive/zips.hpp>
#include <tests/support/failureOf.hpp>

#include <gmock/gmock.h>

#include <algorithm>
#include <random>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;
using testing::ElementsAre;
using testing::UnorderedElementsAre;
using Reason = ArchiveException::Reason;

namespace {

std::string const oldZip = makeZip({{.name = "old", .content = "old content"}, {.name = "folder/in", .content = "in"}});

/// Content that deflating does not make smaller.
std::string noise(std::size_t size)
{
    std::string bytes(size, '\0');
    std::mt19937 random(1);
    std::uniform_int_distribution<int> values(0, 255);
    std::generate(bytes.begin(), bytes.end(), [&] { return static_cast<char>(values(random)); });
    return bytes;
}

/// A zip in a store that fails when it is told to.
struct ArmedZip
{
    StorageIRI const location{u"mem://archives/archive"};
    std::shared_ptr<memory::MemoryProvider> const store = std::make_shared<memory::MemoryProvider>(location);
    StorageItem const container{store, location};
    std::shared_ptr<ArmedProvider> const arming = std::make_shared<ArmedProvider>(store, location);
    OpenZip const zip{(write(container, oldZip), arming->item())};
};

TEST(ZipWrite, LeavesTheArchiveAsItWasUntilItIsFlushed)
{
    OpenZip const zip(makeFile(oldZip));
    write(zip.item(u"new"), "new content");
    zip.item(u"old").removeFile();
    EXPECT_THAT(pathsBelow(zip.root()), UnorderedElementsAre(u"folder/", u"folder/in", u"new"));
    EXPECT_EQ(read(zip.container), oldZip);
    zip.provider->flush();
    EXPECT_NE(read(zip.container), oldZip);
}

TEST(ZipWrite, HasEveryChangeReachTheArchive)
{
    OpenZip const zip(makeFile(oldZip));
    write(zip.item(u"new"), "new content");
    zip.item(u"empty").createFolder();
    zip.item(u"old").moveFile(zip.item(u"empty/moved").getLocation(), ReplacementPolicy::Preserve);
    zip.copy(u"folder/in", u"copy");
    zip.item(u"folder").moveFolder(zip.item(u"renamed").getLocation(), ReplacementPolicy::Preserve);
    zip.provider->flush();
    OpenZip const again(zip.container);
    EXPECT_THAT(pathsBelow(again.root()),
                UnorderedElementsAre(u"new", u"empty/", u"empty/moved", u"copy", u"renamed/", u"renamed/in"));
    EXPECT_EQ(read(again.item(u"new")), "new content");
    EXPECT_EQ(read(again.item(u"empty/moved")), "old content");
    EXPECT_EQ(read(again.item(u"copy")), "in");
    EXPECT_EQ(read(again.item(u"renamed/in")), "in");
}

TEST(ZipWrite, HappensOnShutdown)
{
    OpenZip const zip(makeFile(oldZip));
    write(zip.item(u"new"), "new");
    zip.provider->shutdown();
    EXPECT_EQ(read(OpenZip(zip.container).item(u"new")), "new");
}

TEST(ZipWrite, IsLeftOutWhereNothingHasChanged)
{
    StorageItem const container = makeFile(oldZip);
    auto const before = container.getFileAttributes().getLastModified();
    OpenZip const zip(container);
    read(zip.item(u"old"));
    zip.provider->flush();
    EXPECT_EQ(container.getFileAttributes().getLastModified(), before);
}

TEST(ZipWrite, LosesWhatIsPendingWithTheProviderAndNothingElse)
{
    StorageItem const container = makeFile(oldZip);
    write(OpenZip(container).item(u"new"), "new");
    EXPECT_EQ(read(container), oldZip);
    EXPECT_THAT(pathsBelow(container.getParent()), ElementsAre(u"archive"));
}

TEST(ZipWrite, MakesAMissingArchive)
{
    StorageItem const container(makeFile("other", u"other").getParent(), u"made.zip");
    OpenZip const zip(container);
    EXPECT_FALSE(zip.root().folderExists());
    write(zip.item(u"new"), "new");
    EXPECT_TRUE(zip.root().folderExists());
    EXPECT_FALSE(container.fileExists());
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(container).item(u"new")), "new");
}

TEST(ZipWrite, MakesAnArchiveWithoutEntries)
{
    StorageItem const container(makeFile("other", u"other").getParent(), u"made.zip");
    OpenZip const zip(container);
    zip.root().createFolder();
    zip.provider->flush();
    EXPECT_EQ(read(container), makeZip({}));
    EXPECT_TRUE(OpenZip(container).root().folderExists());
}

TEST(ZipWrite, OfNothingInAMissingArchiveMakesNone)
{
    StorageItem const container(makeFile("other", u"other").getParent(), u"made.zip");
    OpenZip const zip(container);
    EXPECT_EQ(failureOf([&] { zip.item(u"missing").removeFile(); }),
              failure(ErrorCode::ResourceNotFound, zip.item(u"missing").getLocation()));
    EXPECT_FALSE(zip.root().folderExists());
    zip.provider->flush();
    EXPECT_FALSE(container.fileExists());
}

TEST(ZipWrite, CanTakeEverythingOut)
{
    OpenZip const zip(makeFile(oldZip));
    zip.item(u"old").removeFile();
    zip.item(u"folder").removeFolderRecursively();
    zip.provider->flush();
    EXPECT_THAT(pathsBelow(OpenZip(zip.container).root()), ElementsAre());
}

TEST(ZipWrite, KeepsAFolderThatOnlyPathsNamedWhenItsLastFileGoes)
{
    OpenZip const zip(makeFile(oldZip));
    zip.item(u"folder/in").removeFile();
    zip.provider->flush();
    EXPECT_THAT(pathsBelow(OpenZip(zip.container).root()), UnorderedElementsAre(u"old", u"folder/"));
}

TEST(ZipWrite, KeepsTheCommentWhenTheLastEntryGoes)
{
    OpenZip const zip(makeFile(bytesOf({.entries = {{.name = "a"}}, .comment = "what it says"})));
    zip.item(u"a").removeFile();
    zip.provider->flush();
    EXPECT_EQ(read(zip.container), bytesOf({.entries = {}, .comment = "what it says"}));
}

TEST(ZipWrite, KeepsTheModeOfAFolderThatIsNamedLikeAFile)
{
    std::uint32_t const mode = 040700;
    OpenZip const zip(makeFile(bytesOf({.entries = {{.name = "folder", .attributes = mode << 16}}})));
    zip.item(u"new").createFile();
    zip.provider->flush();
    EXPECT_EQ(modeOf(read(zip.container), "folder/"), mode);
}

TEST(ZipWrite, RefusesToWriteAFileThatWouldBeTooLargeToRead)
{
    OpenZip const zip(makeFile(oldZip), {.entryBytes = 1000});
    std::string const bytes(1001, 'x');
    auto const stream = zip.item(u"new").openStream({});
    EXPECT_THROW(stream->write(bytes.data(), 1001), ByteStreamFailure);
    stream->write(bytes.data(), 1000);
    stream->close();
    zip.provider->flush();
    EXPECT_EQ(OpenZip(zip.container).item(u"new").getFileAttributes().getSize(), 1000u);
}

TEST(ZipWrite, GivesEntriesTheNamesThatTheyAreShownUnder)
{
    OpenZip const zip(makeFile(makeZip({{.name = "../up", .content = "up"}, {.name = "/top", .content = "top"}})));
    auto const shown = pathsBelow(zip.root());
    write(zip.item(u"new"), "new");
    zip.provider->flush();
    std::string const bytes = read(zip.container);
    EXPECT_EQ(bytes.find("../up"), std::string::npos);
    EXPECT_EQ(bytes.find("/top"), std::string::npos);
    OpenZip const again(zip.container);
    EXPECT_EQ(read(again.item(u"%2E%2E/up").getParent(), u"up"), "up");
    EXPECT_EQ(read(again.item(u"top")), "top");
    EXPECT_EQ(pathsBelow(again.root()).size(), shown.size() + 1);
}

TEST(ZipWrite, KeepsBytesAndModesOfEntriesThatHaveNotChanged)
{
    std::string damaged = makeZip({{.name = "kept", .content = "stored bytes", .isStored = true, .unixMode = 0100751}});
    damaged[damaged.find("stored bytes")] = 'X'; // which who unpacks it would notice
    OpenZip const zip(makeFile(damaged));
    zip.item(u"kept").moveFile(zip.item(u"moved").getLocation(), ReplacementPolicy::Preserve);
    write(zip.item(u"new"), "new");
    zip.provider->flush();
    std::string const bytes = read(zip.container);
    EXPECT_NE(bytes.find("Xtored bytes"), std::string::npos);
    EXPECT_EQ(modeOf(bytes, "moved"), 0100751u);
    EXPECT_EQ(modeOf(bytes, "new"), 0100644u);
}

TEST(ZipWrite, CopiesTheModeOfAnEntry)
{
    OpenZip const zip(makeFile(makeZip({{.name = "program", .content = "run", .unixMode = 0100755}})));
    zip.copy(u"program", u"copy");
    zip.provider->flush();
    EXPECT_EQ(modeOf(read(zip.container), "copy"), 0100755u);
}

TEST(ZipWrite, KeepsTimesToTheSecond)
{
    using boost::gregorian::date;
    boost::posix_time::ptime const past(date(1971, 2, 3), boost::posix_time::hours(4));
    boost::posix_time::ptime const future(date(2099, 12, 31), boost::posix_time::seconds(86399));
    OpenZip const zip(makeFile(oldZip));
    auto const untouched = zip.item(u"folder/in").getFileAttributes().getLastModified();
    write(zip.item(u"new"), "new");
    zip.item(u"made").createFolder();
    zip.item(u"old").setLastModified(past);
    zip.item(u"new").setLastModified(future);
    zip.item(u"made").setLastModified(past);
    zip.provider->flush();
    OpenZip const again(zip.container);
    EXPECT_EQ(again.item(u"old").getFileAttributes().getLastModified(), past);
    EXPECT_EQ(again.item(u"new").getFileAttributes().getLastModified(), future);
    EXPECT_EQ(again.item(u"made").getFolderAttributes().getLastModified(), past);
    EXPECT_EQ(again.item(u"folder/in").getFileAttributes().getLastModified(), untouched);
}

TEST(ZipWrite, ExchangesNames)
{
    OpenZip const zip(makeFile(makeZip({{.name = "a", .content = "of a"}, {.name = "b", .content = "of b"}})));
    zip.item(u"a").moveFile(zip.item(u"c").getLocation(), ReplacementPolicy::Preserve);
    zip.item(u"b").moveFile(zip.item(u"a").getLocation(), ReplacementPolicy::Preserve);
    zip.item(u"c").moveFile(zip.item(u"b").getLocation(), ReplacementPolicy::Preserve);
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(zip.container).item(u"a")), "of b");
    EXPECT_EQ(read(OpenZip(zip.container).item(u"b")), "of a");
}

TEST(ZipWrite, KeepsEncryptedEntriesAsTheyAre)
{
    OpenZip const zip(makeFile(makeZip({{.name = "secret", .content = "words", .password = "key"}})));
    EXPECT_EQ(failureOf([&] { zip.copy(u"secret", u"copy"); }),
              failure(ErrorCode::PermissionDenied, zip.item(u"secret").getLocation()));
    zip.item(u"secret").moveFile(zip.item(u"moved").getLocation(), ReplacementPolicy::Preserve);
    write(zip.item(u"new"), "new");
    zip.provider->flush();
    EXPECT_EQ(decrypted(read(zip.container), "moved", "key"), "words");
}

TEST(ZipWrite, RefusesNamesThatAreNoText)
{
    OpenZip const zip(makeFile(oldZip));
    for (std::u16string const& name : {std::u16string(u"\uEFFF"), std::u16string(70'000, u'n')}) {
        StorageItem const item(zip.root(), name);
        EXPECT_EQ(failureOf([&] { item.createFile(); }), failure(ErrorCode::InvalidLocation, item.getLocation()));
    }
}

TEST(ZipWrite, RefusesMoreEntriesThanWouldBeRead)
{
    OpenZip const zip(makeFile(makeZip({{.name = "a"}})), {.entries = 2});
    zip.item(u"b").createFile();
    EXPECT_THROW(zip.item(u"c").createFile(), ArchiveException);
    zip.provider->flush();
    EXPECT_THAT(pathsBelow(OpenZip(zip.container, {.entries = 2}).root()), ElementsAre(u"a", u"b"));
}

TEST(ZipWrite, PacksNoMoreHighlyThanIsRead)
{
    ArchiveLimits const limits{.ratio = 50, .bytesOfAnyRatio = 1000};
    OpenZip const zip(makeFile(oldZip), limits);
    std::string const zeros(10'000'000, '\0');
    write(zip.item(u"zeros"), zeros);
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(zip.container, limits).item(u"zeros")), zeros);
}

TEST(ZipWrite, TakesAFileThatIsBeingWrittenAsItIs)
{
    OpenZip const zip(makeFile(oldZip));
    auto const stream = zip.item(u"log").openStream({});
    stream->write("one", 3);
    auto const transaction = zip.item(u"later").openTransactionalStream({});
    transaction->write("later", 5);
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(zip.container).item(u"log")), "one");
    EXPECT_FALSE(OpenZip(zip.container).item(u"later").fileExists());
    stream->write(" two", 4);
    stream->close();
    transaction->close(StreamClosePolicy::Commit);
    EXPECT_EQ(read(OpenZip(zip.container).item(u"log")), "one");
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(zip.container).item(u"log")), "one two");
    EXPECT_EQ(read(OpenZip(zip.container).item(u"later")), "later");
}

TEST(ZipWrite, LetsReadersFinishWithTheOldArchive)
{
    std::string const content(300'000, 'x');
    OpenZip const zip(makeFile(makeZip({{.name = "old", .content = content}})));
    auto const stream = zip.item(u"old").openReadOnlyStream();
    zip.item(u"old").removeFile();
    zip.provider->flush();
    std::string bytes(content.size(), '\0');
    long done = 0;
    for (long read; (read = stream->read(bytes.data() + done, static_cast<long>(bytes.size()) - done)) > 0;)
        done += read;
    EXPECT_EQ(bytes, content);
}

TEST(ZipWrite, ReachesTheOuterArchiveThroughTheInnerOne)
{
    StorageItem const container = makeFile(makeZip({{.name = "in.zip", .content = oldZip}}));
    OpenZip const outer(container);
    OpenZip const inner(outer.item(u"in.zip"));
    write(inner.item(u"new"), "new");
    inner.provider->flush();
    EXPECT_EQ(read(OpenZip(OpenZip(container).item(u"in.zip")).item(u"old")), "old content");
    EXPECT_FALSE(OpenZip(OpenZip(container).item(u"in.zip")).item(u"new").fileExists());
    outer.provider->flush();
    EXPECT_EQ(read(OpenZip(OpenZip(container).item(u"in.zip")).item(u"new")), "new");
    write(inner.item(u"more"), "more");
    EXPECT_EQ(read(inner.item(u"new")), "new");
}

TEST(ZipWrite, RefusesToOverwriteWhatSomebodyElseHasWritten)
{
    StorageItem const container = makeFile(oldZip);
    OpenZip const zip(container);
    write(zip.item(u"mine"), "mine");
    std::string const theirs = makeZip({{.name = "theirs", .content = "theirs"}});
    write(container, theirs);
    EXPECT_EQ(reasonOf([&] { zip.provider->flush(); }), Reason::Changed);
    EXPECT_EQ(read(container), theirs);
    EXPECT_EQ(read(zip.item(u"mine")), "mine");
}

TEST(ZipWrite, FindsWhatSomebodyElseWroteBeforeTheFirstChange)
{
    StorageItem const container = makeFile(oldZip);
    OpenZip const zip(container);
    read(zip.item(u"old"));
    write(container, makeZip({{.name = "theirs", .content = "theirs"}}));
    write(zip.item(u"mine"), "mine");
    zip.provider->flush();
    EXPECT_THAT(pathsBelow(OpenZip(container).root()), UnorderedElementsAre(u"theirs", u"mine"));
}

TEST(ZipWrite, InAReadOnlyStoreIsRefusedWithTheFirstChange)
{
    StorageItem const outer = makeFile(readOnlyArchiveOf(oldZip));
    StorageItem const container(openRoot(ArchiveFormat::Tar, outer), u"a.zip");
    OpenZip const zip(container);
    EXPECT_EQ(failureOf([&] { zip.item(u"new").createFile(); }),
              failure(ErrorCode::ReadOnlyProvider, container.getLocation()));
    EXPECT_FALSE(zip.item(u"new").fileExists());
    zip.provider->flush();
}

/// libzip would drop the program. The offsets in the zip count it, as they should.
TEST(ZipWrite, OfAProgramWithAZipBehindItIsRefusedWithTheFirstChange)
{
    StorageItem const container =
        makeFile(bytesOf({.entries = {{.name = "old", .content = "old content"}}, .prefix = "#!/bin/sh\n"}));
    std::string const before = read(container);
    OpenZip const zip(container);
    EXPECT_EQ(read(zip.item(u"old")), "old content");
    EXPECT_FALSE(zip.item(u"old").getFileAttributes().isWritable());
    EXPECT_EQ(failureOf([&] { zip.item(u"new").createFile(); }),
              failure(ErrorCode::UnsupportedOperation, container.getLocation()));
    zip.provider->flush();
    EXPECT_EQ(read(container), before);
}

/// The store of the archive fails with one operation after the other, until all have had their turn. That it cannot
/// seek is no reason to fail.
TEST(ZipWrite, ThatFailsKeepsTheArchiveAndTheChangesAndCanBeTriedAgain)
{
    std::string const content = noise(3'000'000);
    std::size_t failures = 0;
    bool isArmed = false;
    for (std::size_t failing = 1; !isArmed; ++failing) {
        SCOPED_TRACE(failing);
        ArmedZip const armed;
        write(armed.zip.item(u"new"), content);
        armed.arming->arm(failing);
        try {
            armed.zip.provider->flush();
        } catch (ArchiveException const& error) {
            ++failures;
            EXPECT_EQ(error.getErrorCode(), ErrorCode::NoSpaceLeft);
            EXPECT_EQ(read(armed.container), oldZip);
            EXPECT_THAT(pathsBelow(armed.container.getParent()), ElementsAre(u"archive"));
            EXPECT_EQ(read(armed.zip.item(u"new")), content);
        }
        isArmed = armed.arming->isArmed();
        armed.arming->disarm();
        armed.zip.provider->flush();
        EXPECT_EQ(read(OpenZip(armed.container).item(u"new")), content);
    }
    EXPECT_GT(failures, 4u);
}

TEST(ZipWrite, ThatFailsLosesNothingOfAFileThatIsBeingWritten)
{
    std::size_t turns = 0;
    for (bool isArmed = false; !isArmed; ++turns) {
        SCOPED_TRACE(turns);
        ArmedZip const armed;
        auto const stream = armed.zip.item(u"new").openStream({});
        stream->write("one", 3);
        armed.arming->arm(turns + 1);
        try {
            armed.zip.provider->flush();
            EXPECT_EQ(read(OpenZip(armed.container).item(u"new")), "one");
        } catch (ArchiveException const&) {
            EXPECT_EQ(read(armed.container), oldZip);
        }
        isArmed = armed.arming->isArmed();
        armed.arming->disarm();
        stream->write("two", 3);
        stream->close();
        armed.zip.provider->flush();
        EXPECT_EQ(read(OpenZip(armed.container).item(u"new")), "onetwo");
    }
    EXPECT_GT(turns, 4u);
}

TEST(ZipWrite, GoesOnAfterAFailureOnceTheArchiveWasInPlace)
{
    ArmedZip const armed;
    auto const stream = armed.zip.item(u"new").openStream({});
    stream->write("one", 3);
    armed.arming->failAfterCommit();
    EXPECT_THROW(armed.zip.provider->flush(), ArchiveException);
    stream->write("two", 3);
    stream->close();
    write(armed.zip.item(u"more"), "more");
    armed.zip.provider->flush();
    EXPECT_EQ(read(OpenZip(armed.container).item(u"new")), "onetwo");
    EXPECT_EQ(read(OpenZip(armed.container).item(u"more")), "more");
}

/// That can happen where the archive is in place, and cannot be opened again at once.
TEST(ZipWrite, FailsTheStreamOfAFileThatSomebodyElseTookOutAfterAFlush)
{
    std::size_t lost = 0;
    bool isArmed = false;
    for (std::size_t failing = 1; !isArmed; ++failing) {
        ArmedZip const armed;
        auto const stream = armed.zip.item(u"new").openStream({});
        stream->write("one", 3);
        armed.arming->arm(failing);
        try {
            armed.zip.provider->flush();
        } catch (ArchiveException const&) {
            continue;
        }
        isArmed = armed.arming->isArmed();
        armed.arming->disarm();
        write(armed.container, oldZip);
        armed.zip.item(u"other").createFile();
        try {
            stream->write("two", 3);
        } catch (ByteStreamFailure const&) {
            ++lost;
            EXPECT_THROW(stream->close(), ByteStreamFailure);
        }
    }
    EXPECT_GT(lost, 0u);
}

TEST(ZipWrite, RefusesToTruncateWhatItCannotWriteAndLeavesItAsItWas)
{
    bool isRefused = true;
    for (std::size_t failing = 1; isRefused; ++failing) {
        SCOPED_TRACE(failing);
        ArmedZip const armed;
        StorageItem const file = armed.zip.item(u"old");
        read(file);
        armed.arming->arm(failing);
        isRefused = false;
        try {
            file.openStream({.truncate = ByteStreamTruncate::TruncateExisting});
        } catch (Exception const&) {
            isRefused = true;
        }
        armed.arming->disarm();
        if (!isRefused) {
            EXPECT_GT(failing, 2u);
            break;
        }
        EXPECT_EQ(read(file), "old content");
        write(armed.zip.item(u"other"), "other");
        armed.zip.provider->flush();
        EXPECT_EQ(read(OpenZip(armed.container).item(u"old")), "old content");
    }
}

TEST(ZipWrite, GivesAFileThatIsBeingWrittenTheTimeOfItsLastWrite)
{
    boost::posix_time::ptime const past(boost::gregorian::date(2001, 1, 1));
    auto const timeIn = [](OpenZip const& zip) { return zip.item(u"old").getFileAttributes().getLastModified(); };
    OpenZip const zip(makeFile(oldZip));
    zip.item(u"old").setLastModified(past);
    zip.provider->flush();
    auto const stream = zip.item(u"old").openStream({});
    stream->write("new", 3);
    auto const written = timeIn(zip);
    EXPECT_GT(written, past);
    zip.provider->flush();
    EXPECT_EQ(timeIn(OpenZip(zip.container)), written);
    stream->close();
    EXPECT_EQ(timeIn(zip), written);
}

TEST(ZipWrite, ReplacesAFileThoughNoMoreEntriesAreTaken)
{
    OpenZip const zip(makeFile(makeZip({{.name = "a", .content = "of a"}, {.name = "b", .content = "of b"}})),
                      {.entries = 2});
    zip.item(u"a").moveFile(zip.item(u"b").getLocation(), ReplacementPolicy::Overwrite);
    EXPECT_THAT(pathsBelow(zip.root()), ElementsAre(u"b"));
    EXPECT_EQ(read(zip.item(u"b")), "of a");
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(zip.container).item(u"b")), "of a");
}

TEST(ZipWrite, KeepsALinkThatACopyCannotReplace)
{
    OpenZip const zip(makeFile(makeZip({{.name = "a", .content = "of a"},
                                        {.name = "b", .content = "of b"},
                                        {.name = "link", .content = "a", .unixMode = 0120777}})),
                      {.entries = 3});
    EXPECT_THROW(zip.provider->copyFile(zip.item(u"b").getLocation(), zip.item(u"link").getLocation(),
                                        ReplacementPolicy::Overwrite),
                 ArchiveException);
    EXPECT_EQ(read(zip.item(u"link")), "of a");
}

TEST(ZipWrite, CountsNothingThatWasRemoved)
{
    OpenZip const zip(makeFile(oldZip), {.indexBytes = 3000});
    for (int turn = 0; turn != 1000; ++turn) {
        zip.item(u"new").createFile();
        zip.item(u"new").removeFile();
    }
    EXPECT_THAT(pathsBelow(zip.root()), UnorderedElementsAre(u"old", u"folder/", u"folder/in"));
}

TEST(ZipWrite, RefusesToMoveAFolderToWhereItWouldBeTooDeep)
{
    OpenZip const zip(makeFile(makeZip({{.name = "a/b/c", .content = "c"}, {.name = "d/e/f", .content = "f"}})),
                      {.depth = 4});
    StorageIRI const tooDeep = zip.item(u"d/e/a").getLocation();
    EXPECT_EQ(failureOf([&] { zip.item(u"a").moveFolder(tooDeep, ReplacementPolicy::Preserve); }),
              failure(ErrorCode::InvalidLocation, tooDeep));
    zip.item(u"a").moveFolder(zip.item(u"d/a").getLocation(), ReplacementPolicy::Preserve);
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(zip.container, {.depth = 4}).item(u"d/a/b/c")), "c");
}

TEST(ZipWrite, RefusesToMoveAFolderToWhereItsPathsWouldBeTooLong)
{
    OpenZip const zip(makeFile(oldZip));
    std::u16string const name(40'000, u'n');
    zip.item(name).createFolder();
    zip.item(u"other").createFolder();
    zip.item(u"other/" + name).createFile();
    StorageIRI const tooLong = zip.item(name + u"/other").getLocation();
    EXPECT_EQ(failureOf([&] { zip.item(u"other").moveFolder(tooLong, ReplacementPolicy::Preserve); }),
              failure(ErrorCode::InvalidLocation, tooLong));
    zip.provider->flush();
}

TEST(ZipWrite, WritesThroughStreamsThatDoNotSeek)
{
    ArmedZip const armed;
    armed.arming->refuseToSeek();
    OpenZip const& zip = armed.zip;
    std::string const content = noise(3'000'000);
    write(zip.item(u"new"), content);
    zip.provider->flush();
    EXPECT_EQ(read(OpenZip(armed.container).item(u"new")), content);
    EXPECT_EQ(read(OpenZip(armed.container).item(u"old")), "old content");
}

} // namespace

} // namespace foundation::storage::archive
