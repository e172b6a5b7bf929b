#include <storage/memory/MemoryProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/StorageItem.hpp>
#include <tests/storage/memory/MemoryStore.hpp>

#include <chrono>
#include <stdexcept>

namespace foundation::storage::memory {
namespace {

using namespace provider;
using boost::posix_time::ptime;
using boost::posix_time::time_from_string;

TEST(MemoryProvider, HoldsARootFolderAndNothingElse)
{
    MemoryStore const store;
    EXPECT_TRUE(store.folderExists(at(u"/")));
    EXPECT_EQ(namesOf(*store.listAllRecursive(at(u"/"))), Names());
}

TEST(MemoryProvider, ServesAStorageItem)
{
    auto const store = std::make_shared<MemoryProvider>(StorageIRI(u"mem://test/"));
    StorageItem const file(store, StorageIRI(u"mem://test/file"));
    file.createFile();
    EXPECT_TRUE(file.fileExists());
}

TEST(MemoryProvider, KeepsStoresOfOneAuthorityApart)
{
    MemoryStore const one;
    MemoryStore const other;
    one.createFile(at(u"/file"));
    EXPECT_FALSE(other.fileExists(at(u"/file")));
}

// Locations

class ForeignLocation : public testing::TestWithParam<char16_t const*>
{};

TEST_P(ForeignLocation, IsInvalid)
{
    MemoryStore const store;
    StorageIRI const iri(GetParam());
    std::string const invalid = failure(ErrorCode::InvalidLocation, iri);
    EXPECT_EQ(failureOf([&] { store.exists(iri); }), invalid);
    EXPECT_EQ(failureOf([&] { store.createFile(iri); }), invalid);
    EXPECT_EQ(failureOf([&] { store.listAll(iri); }), invalid);
}

INSTANTIATE_TEST_SUITE_P(MemoryProvider, ForeignLocation,
                         testing::Values(u"file://test/a", u"mem://other/a", u"mem:/a", u"mem:///a", u"mem://test",
                                         u"mem://test/a?b", u"mem://test/a#b", u"mem://test:80/a", u"mem://TEST/a",
                                         u"memo://test/a", u"me://test/a", u"mem://test/a%00b",
                                         u"zip:mem://test/a.zip!/b"));

TEST(MemoryProvider, TakesTheSchemeInAnyCase)
{
    MemoryStore const store;
    store.createFile(StorageIRI(u"MeM://test/file"));
    EXPECT_TRUE(store.fileExists(at(u"/file")));
}

TEST(MemoryProvider, CannotBeMadeForAForeignLocation)
{
    StorageIRI const iri(u"file:///tmp");
    EXPECT_EQ(failureOf([&] { MemoryProvider{iri}; }), failure(ErrorCode::InvalidLocation, iri));
}

TEST(MemoryProvider, ServesLocationsWithoutAuthority)
{
    MemoryProvider const store(StorageIRI(u"mem:/anything"));
    store.createFile(StorageIRI(u"mem:/file"));
    EXPECT_TRUE(store.fileExists(StorageIRI(u"mem:///file")));
    EXPECT_EQ(store.getCanonicalLocation(StorageIRI(u"mem:/file")), StorageIRI(u"mem:///file"));
}

TEST(MemoryProvider, NamesTheCanonicalLocation)
{
    MemoryStore const store;
    EXPECT_EQ(store.getCanonicalLocation(at(u"/a/./b//../c")), at(u"/a/c"));
    EXPECT_EQ(store.getCanonicalLocation(at(u"/../..")), at(u"/"));
}

TEST(MemoryProvider, KeepsNamesAsTheyAre)
{
    MemoryStore const store;
    std::vector<std::u16string> const names{u" blank ",    u"%41",
                                            u"%2F",        u"a[1]",
                                            u"!",          u"#",
                                            u"?",          u"::",
                                            u".dot",       u"dot.",
                                            u"...",        u"caf\u00E9",
                                            u"cafe\u0301", u"a\nb",
                                            u"\U0001F600", u"back\\slash",
                                            u"UPPER",      u"upper",
                                            u"*",          u"\u0001",
                                            u"\uFFFF",     std::u16string(100000, u'x')};
    for (std::u16string const& name : names)
        store.write(u"/" + name, fl::i18n::to_utf8(name, fl::i18n::Malformed::Throw));
    for (std::u16string const& name : names)
        EXPECT_EQ(store.read(u"/" + name), fl::i18n::to_utf8(name, fl::i18n::Malformed::Throw));
    EXPECT_EQ(namesOf(*store.listFiles(at(u"/"))).size(), names.size());
}

TEST(MemoryProvider, ResolvesDotSegments)
{
    MemoryStore const store;
    store.createFolder(at(u"/a"));
    store.createFolder(at(u"/a/b"));
    store.createFile(at(u"/a/./b/../file"));
    EXPECT_TRUE(store.fileExists(at(u"/a/file")));
    EXPECT_TRUE(store.fileExists(at(u"/../../a//file")));
    EXPECT_TRUE(store.folderExists(at(u"/a/b/..")));
    EXPECT_TRUE(store.folderExists(at(u"/a/b/.")));
}

TEST(MemoryProvider, FindsNothingBehindDotSegmentsOfWhatIsNoFolder)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    EXPECT_EQ(store.exists(at(u"/file/.")), ExistenceType::AsNeither);
    EXPECT_EQ(store.exists(at(u"/file/../file")), ExistenceType::AsNeither);
    EXPECT_EQ(store.exists(at(u"/missing/..")), ExistenceType::AsNeither);
}

// Creating and removing

TEST(MemoryProvider, CreatesAnEmptyFile)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    EXPECT_EQ(store.existsExtended(at(u"/file")), ExistenceTypeExtended::RegularFile);
    EXPECT_EQ(store.read(u"/file"), "");
}

TEST(MemoryProvider, CreatesAFolder)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    EXPECT_EQ(store.existsExtended(at(u"/folder")), ExistenceTypeExtended::RegularFolder);
}

TEST(MemoryProvider, CreatesAFolderWithItsAncestors)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/a/b/c"));
    EXPECT_TRUE(store.folderExists(at(u"/a/b/c")));
}

TEST(MemoryProvider, CreatesNothingWhereSomethingIs)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    store.createFolder(at(u"/folder"));
    for (std::u16string const path : {u"/file", u"/folder", u"/"}) {
        std::string const taken = failure(ErrorCode::ResourceAlreadyExists, at(path));
        EXPECT_EQ(failureOf([&] { store.createFile(at(path)); }), taken);
        EXPECT_EQ(failureOf([&] { store.createFolder(at(path)); }), taken);
    }
}

TEST(MemoryProvider, CreatesNothingWhereNoFolderIs)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    for (std::u16string const path : {u"/file/new", u"/missing/new"}) {
        std::string const missing = failure(ErrorCode::ResourceNotFound, at(path));
        EXPECT_EQ(failureOf([&] { store.createFile(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.createFolder(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.openStream(at(path), rewrite); }), missing);
    }
}

TEST(MemoryProvider, RemovesAFile)
{
    MemoryStore const store;
    store.write(u"/file", "content");
    store.removeFile(at(u"/file"));
    EXPECT_EQ(store.exists(at(u"/file")), ExistenceType::AsNeither);
}

TEST(MemoryProvider, RemovesAnEmptyFolder)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    store.removeFolder(at(u"/folder"));
    EXPECT_EQ(store.exists(at(u"/folder")), ExistenceType::AsNeither);
}

TEST(MemoryProvider, RemovesNoFolderThatHoldsSomething)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/folder/sub"));
    EXPECT_EQ(failureOf([&] { store.removeFolder(at(u"/folder")); }),
              failure(ErrorCode::FolderNotEmpty, at(u"/folder")));
    EXPECT_TRUE(store.folderExists(at(u"/folder/sub")));
}

TEST(MemoryProvider, RemovesAFolderWithAllItHolds)
{
    MemoryStore const store;
    EXPECT_TRUE(store.hasFeature(ExtendedFeature::RecursiveFolderRemoval));
    store.createFolderRecursive(at(u"/folder/sub"));
    store.write(u"/folder/sub/file", "content");
    store.removeFolderRecursively(at(u"/folder"));
    EXPECT_EQ(namesOf(*store.listAllRecursive(at(u"/"))), Names());
}

TEST(MemoryProvider, DoesNotFindWhatIsMissingOrOfTheOtherKind)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    store.createFolder(at(u"/folder"));
    for (std::u16string const path : {u"/folder", u"/missing", u"/missing/file", u"/file/file", u"/"}) {
        std::string const missing = failure(ErrorCode::ResourceNotFound, at(path));
        EXPECT_EQ(failureOf([&] { store.removeFile(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.getFileAttributes(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.openReadOnlyStream(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.openStream(at(path), update); }), missing);
    }
    for (std::u16string const path : {u"/file", u"/missing", u"/missing/folder", u"/file/folder"}) {
        std::string const missing = failure(ErrorCode::ResourceNotFound, at(path));
        EXPECT_EQ(failureOf([&] { store.removeFolder(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.removeFolderRecursively(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.getFolderAttributes(at(path)); }), missing);
        EXPECT_EQ(failureOf([&] { store.listAll(at(path)); }), missing);
    }
}

TEST(MemoryProvider, KeepsItsRoot)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    std::string const inUse = failure(ErrorCode::ResourceInUse, at(u"/"));
    EXPECT_EQ(failureOf([&] { store.removeFolder(at(u"/")); }), inUse);
    EXPECT_EQ(failureOf([&] { store.removeFolderRecursively(at(u"/")); }), inUse);
    EXPECT_TRUE(store.fileExists(at(u"/file")));
}

// Attributes

/// Whether an action happened between two readings of the clock, by what it answers.
template <typename Action>
testing::AssertionResult isNow(Action const& action)
{
    ptime const before = boost::posix_time::microsec_clock::universal_time();
    ptime const time = action();
    ptime const after = boost::posix_time::microsec_clock::universal_time();
    if (before <= time && time <= after)
        return testing::AssertionSuccess();
    return testing::AssertionFailure() << time << " is not from " << before << " to " << after;
}

TEST(MemoryProvider, TellsTheAttributesOfAFile)
{
    MemoryStore const store;
    EXPECT_TRUE(isNow([&] {
        store.write(u"/file", "content");
        return store.getFileAttributes(at(u"/file")).getLastModified();
    }));
    EXPECT_EQ(store.getFileAttributes(at(u"/file")).getSize(), 7u);
    EXPECT_TRUE(store.getFileAttributes(at(u"/file")).isWritable());
}

TEST(MemoryProvider, AFolderIsModifiedByWhatComesAndGoesInIt)
{
    MemoryStore const store;
    auto const modified = [&] { return store.getFolderAttributes(at(u"/")).getLastModified(); };
    EXPECT_TRUE(isNow([&] { return store.createFile(at(u"/file")), modified(); }));
    EXPECT_TRUE(
        isNow([&] { return store.moveFile(at(u"/file"), at(u"/moved"), ReplacementPolicy::Preserve), modified(); }));
    EXPECT_TRUE(isNow([&] { return store.removeFile(at(u"/moved")), modified(); }));
    EXPECT_TRUE(store.getFolderAttributes(at(u"/")).isWritable());
}

TEST(MemoryProvider, KeepsTheModificationTimeItIsGiven)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    store.createFolder(at(u"/folder"));
    ptime const time = time_from_string("1969-07-20 20:17:40.123456");
    store.setLastModified(at(u"/file"), time);
    store.setLastModified(at(u"/folder"), time);
    EXPECT_EQ(store.getFileAttributes(at(u"/file")).getLastModified(), time);
    EXPECT_EQ(store.getFolderAttributes(at(u"/folder")).getLastModified(), time);
}

TEST(MemoryProvider, RefusesATimeThatIsNoTime)
{
    MemoryStore const store;
    EXPECT_EQ(failureOf([&] { store.setLastModified(at(u"/"), ptime()); }),
              failure(ErrorCode::UnsupportedOperation, at(u"/")));
}

TEST(MemoryProvider, SetsNoAttributesOfWhatIsMissing)
{
    MemoryStore const store;
    std::string const missing = failure(ErrorCode::ResourceNotFound, at(u"/missing"));
    EXPECT_EQ(failureOf([&] { store.setLastModified(at(u"/missing"), time_from_string("2020-01-01 00:00:00")); }),
              missing);
    EXPECT_EQ(failureOf([&] { store.setWritable(at(u"/missing"), true); }), missing);
}

TEST(MemoryProvider, HasNoExtendedAttributes)
{
    MemoryStore const store;
    ExtendedAttributes const attributes = store.getExtendedAttributes(at(u"/"));
    EXPECT_EQ(attributes.begin(), attributes.end());
}

// Writability

TEST(MemoryProvider, AnUnwritableFileCannotBeOpenedForWriting)
{
    MemoryStore const store;
    store.write(u"/file", "content");
    store.setWritable(at(u"/file"), false);
    EXPECT_FALSE(store.getFileAttributes(at(u"/file")).isWritable());
    std::string const denied = failure(ErrorCode::PermissionDenied, at(u"/file"));
    EXPECT_EQ(failureOf([&] { store.openStream(at(u"/file"), rewrite); }), denied);
    EXPECT_EQ(failureOf([&] { store.openStream(at(u"/file"), append); }), denied);
    EXPECT_EQ(store.read(u"/file"), "content");
}

TEST(MemoryProvider, AnUnwritableFileIsWrittenOnByWhoOpenedItBefore)
{
    MemoryStore const store;
    auto const stream = store.openStream(at(u"/file"), rewrite);
    store.setWritable(at(u"/file"), false);
    writeAll(*stream, "content");
    EXPECT_EQ(store.read(u"/file"), "content");
}

TEST(MemoryProvider, AnUnwritableFileCanBeMadeWritableAgain)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    store.setWritable(at(u"/file"), false);
    store.setWritable(at(u"/file"), true);
    store.write(u"/file", "content");
    EXPECT_EQ(store.read(u"/file"), "content");
}

TEST(MemoryProvider, AnUnwritableFileCanBeMovedAndRemoved)
{
    MemoryStore const store;
    store.createFile(at(u"/file"));
    store.setWritable(at(u"/file"), false);
    store.moveFile(at(u"/file"), at(u"/moved"), ReplacementPolicy::Preserve);
    store.removeFile(at(u"/moved"));
    EXPECT_FALSE(store.fileExists(at(u"/moved")));
}

TEST(MemoryProvider, InAnUnwritableFolderNothingIsCreatedOrRemoved)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/folder/sub"));
    store.createFile(at(u"/folder/file"));
    store.setWritable(at(u"/folder"), false);
    auto const denied = [](std::u16string const& path) { return failure(ErrorCode::PermissionDenied, at(path)); };
    EXPECT_EQ(failureOf([&] { store.createFile(at(u"/folder/new")); }), denied(u"/folder/new"));
    EXPECT_EQ(failureOf([&] { store.createFolder(at(u"/folder/new")); }), denied(u"/folder/new"));
    EXPECT_EQ(failureOf([&] { store.openStream(at(u"/folder/new"), rewrite); }), denied(u"/folder/new"));
    EXPECT_EQ(failureOf([&] { store.removeFile(at(u"/folder/file")); }), denied(u"/folder/file"));
    EXPECT_EQ(failureOf([&] { store.removeFolder(at(u"/folder/sub")); }), denied(u"/folder/sub"));
    EXPECT_EQ(failureOf([&] { store.removeFolderRecursively(at(u"/folder")); }), denied(u"/folder"));
    EXPECT_EQ(namesOf(*store.listAll(at(u"/folder"))), (Names{u"file", u"sub/"}));
}

TEST(MemoryProvider, InAnUnwritableFolderFilesCanBeWritten)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    store.createFile(at(u"/folder/file"));
    store.setWritable(at(u"/folder"), false);
    store.write(u"/folder/file", "content");
    EXPECT_EQ(store.read(u"/folder/file"), "content");
}

TEST(MemoryProvider, AnEmptyUnwritableFolderCanBeRemoved)
{
    MemoryStore const store;
    store.createFolder(at(u"/folder"));
    store.setWritable(at(u"/folder"), false);
    store.removeFolder(at(u"/folder"));
    EXPECT_FALSE(store.folderExists(at(u"/folder")));
}

TEST(MemoryProvider, AnUnwritableFolderDeepBelowKeepsAllFromRemoval)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/top/middle/bottom"));
    store.setWritable(at(u"/top/middle"), false);
    EXPECT_EQ(failureOf([&] { store.removeFolderRecursively(at(u"/top")); }),
              failure(ErrorCode::PermissionDenied, at(u"/top")));
    EXPECT_TRUE(store.folderExists(at(u"/top/middle/bottom")));
}

// Configuration and shutdown

TEST(MemoryProvider, RefusesWhatGoesBeyondTheLimitAndKeepsTheContent)
{
    MemoryStore store;
    store.limit("10");
    store.write(u"/file", "12345678");
    auto const stream = store.openStream(at(u"/file"), append);
    try {
        stream->write("abc", 3);
        FAIL() << "nothing was thrown";
    } catch (ByteStreamFailure const& refusal) {
        EXPECT_EQ(refusal.getErrorCode(), ErrorCode::NoSpaceLeft);
    }
    EXPECT_EQ(store.read(u"/file"), "12345678");
    writeAll(*stream, "ab");
    EXPECT_EQ(store.read(u"/file"), "12345678ab");
}

TEST(MemoryProvider, OverwritesWithinTheLimit)
{
    MemoryStore store;
    store.limit("4");
    store.write(u"/file", "1234");
    auto const stream = store.openStream(at(u"/file"), update);
    writeAll(*stream, "abcd");
    EXPECT_EQ(store.read(u"/file"), "abcd");
}

TEST(MemoryProvider, CountsGapsTowardsTheLimit)
{
    MemoryStore store;
    store.limit("100");
    auto const stream = store.openStream(at(u"/file"), rewrite);
    stream->seek(100, std::ios_base::beg);
    EXPECT_THROW(stream->write("x", 1), ByteStreamFailure);
    EXPECT_EQ(store.getFileAttributes(at(u"/file")).getSize(), 0u);
}

TEST(MemoryProvider, GetsSpaceBackWhenAFileIsTruncatedOrRemoved)
{
    MemoryStore store;
    store.limit("4");
    store.write(u"/file", "1234");
    store.write(u"/file", "4321");
    store.removeFile(at(u"/file"));
    store.write(u"/other", "1234");
    EXPECT_EQ(store.read(u"/other"), "1234");
}

TEST(MemoryProvider, ARemovedFileTakesSpaceUntilItsLastWriterCloses)
{
    MemoryStore store;
    store.limit("4");
    auto const writer = store.openStream(at(u"/file"), rewrite);
    writeAll(*writer, "1234");
    store.removeFile(at(u"/file"));
    EXPECT_THROW(store.write(u"/other", "1234"), ByteStreamFailure);
    writer->close();
    store.write(u"/other", "1234");
    EXPECT_EQ(store.read(u"/other"), "1234");
}

TEST(MemoryProvider, ALimitBelowWhatIsInUseRefusesGrowthAlone)
{
    MemoryStore store;
    store.write(u"/file", "12345678");
    store.limit("4");
    auto const stream = store.openStream(at(u"/file"), update);
    writeAll(*stream, "abcdefgh");
    EXPECT_THROW(stream->write("i", 1), ByteStreamFailure);
    EXPECT_EQ(store.read(u"/file"), "abcdefgh");
}

TEST(MemoryProvider, LosesItsLimitWithAConfigurationThatHasNone)
{
    MemoryStore store;
    store.limit("0");
    store.configure({});
    store.write(u"/file", "content");
    EXPECT_EQ(store.read(u"/file"), "content");
}

TEST(MemoryProvider, RefusesALimitThatIsNoNumberOfBytesAndKeepsTheOldOne)
{
    MemoryStore store;
    store.limit("4");
    for (char const* const text : {"", "-1", "1k", " 1", "0x10", "18446744073709551616", "abc"})
        EXPECT_THROW(store.limit(text), std::invalid_argument) << text;
    EXPECT_THROW(store.write(u"/file", "12345"), ByteStreamFailure);
}

TEST(MemoryProvider, CanBeUsedAfterItsShutdown)
{
    MemoryStore store;
    store.write(u"/file", "content");
    store.shutdown();
    EXPECT_EQ(store.read(u"/file"), "content");
    store.createFolder(at(u"/folder"));
    EXPECT_TRUE(store.folderExists(at(u"/folder")));
}

TEST(MemoryProvider, RefusesToTellOfAFileThatCannotBe)
{
    MemoryStore const store;
    auto const ignore = [](auto&&...) {};
    EXPECT_THROW(store.publishFileEventsFor(at(u"/"), ignore, {events::Kind::Created}),
                 ChangeEventsSubscriptionException);
    EXPECT_EQ(
        failureOf([&] { store.publishFileEventsFor(StorageIRI(u"mem://test"), ignore, {events::Kind::Created}); }),
        failure(ErrorCode::InvalidLocation, StorageIRI(u"mem://test")));
}

} // namespace
} // namespace foundation::storage::memory
