#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <boost/date_time/posix_time/time_formatters.hpp>

#include <fcntl.h>
#include <functional>
#include <string>
#include <sys/stat.h>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

/// One of each kind of entry, and what each of them leads to.
class LocalProviderTest : public testing::Test
{
protected:
    LocalProviderTest()
    {
        folder.write("file", "content");
        fs::create_directory(folder / "folder");
        folder.write("folder/inside", "");
        fs::create_symlink("file", folder / "link to file");
        fs::create_symlink("folder", folder / "link to folder");
        fs::create_symlink("nothing", folder / "broken link");
        fs::create_symlink("loop", folder / "loop");
        fs::create_symlink("file/below", folder / "link below file");
        fs::create_symlink("pipe", folder / "link to pipe");
        ::mkfifo((folder / "pipe").c_str(), 0600);
    }

    TemporaryFolder folder;
    LocalProvider const provider;

    StorageIRI at(std::u16string const& name) const { return folder.iri(name); }
    bool isThere(std::string const& name) const { return fs::exists(fs::symlink_status(folder / name)); }
};

TEST_F(LocalProviderTest, CreatesAnEmptyFile)
{
    provider.createFile(at(u"new"));
    EXPECT_TRUE(fs::is_regular_file(folder / "new"));
    EXPECT_EQ(folder.read("new"), "");
}

TEST_F(LocalProviderTest, CreatesAFolder)
{
    provider.createFolder(at(u"new"));
    EXPECT_TRUE(fs::is_directory(folder / "new"));
}

TEST_F(LocalProviderTest, NewFilesAndFoldersHaveThePermissionsThatTheUserWants)
{
    mode_t const previous = ::umask(027);
    provider.createFile(at(u"new file"));
    provider.createFolder(at(u"new folder"));
    provider.openStream(at(u"new stream"), {})->close();
    ::umask(previous);
    EXPECT_EQ(fs::status(folder / "new file").permissions(), fs::perms(0640));
    EXPECT_EQ(fs::status(folder / "new stream").permissions(), fs::perms(0640));
    EXPECT_EQ(fs::status(folder / "new folder").permissions(), fs::perms(0750));
}

TEST_F(LocalProviderTest, CreatesNothingWhereSomethingIs)
{
    for (char16_t const* const name : {u"file", u"folder", u"link to file", u"link to folder", u"broken link", u"loop",
                                       u"pipe", u"/", u"folder/.", u"folder/.."})
    {
        StorageIRI const iri = at(name);
        EXPECT_EQ(failureOf([&] { provider.createFile(iri); }), failure(ErrorCode::ResourceAlreadyExists, iri));
        EXPECT_EQ(failureOf([&] { provider.createFolder(iri); }), failure(ErrorCode::ResourceAlreadyExists, iri));
    }
    EXPECT_EQ(folder.read("file"), "content");
    EXPECT_FALSE(isThere("nothing"));
}

TEST_F(LocalProviderTest, CreatesNothingInAFolderThatIsMissing)
{
    for (char16_t const* const name : {u"missing/new", u"file/new", u"broken link/new"}) {
        StorageIRI const iri = at(name);
        EXPECT_EQ(failureOf([&] { provider.createFile(iri); }), failure(ErrorCode::ResourceNotFound, iri));
        EXPECT_EQ(failureOf([&] { provider.createFolder(iri); }), failure(ErrorCode::ResourceNotFound, iri));
    }
}

TEST_F(LocalProviderTest, RefusesANameThatIsTooLong)
{
    StorageIRI const iri = at(std::u16string(256, u'x'));
    EXPECT_EQ(failureOf([&] { provider.createFile(iri); }), failure(ErrorCode::InvalidLocation, iri));
    EXPECT_EQ(provider.exists(iri), ExistenceType::AsNeither);
    EXPECT_EQ(provider.existsExtended(iri), ExistenceTypeExtended::None);
}

TEST_F(LocalProviderTest, CreatesAFolderWithItsAncestors)
{
    provider.createFolderRecursive(at(u"a/b/c"));
    EXPECT_TRUE(fs::is_directory(folder / "a/b/c"));
}

TEST_F(LocalProviderTest, KnowsWhatIsThere)
{
    struct Row
    {
        std::u16string name;
        ExistenceType coarse;
        ExistenceTypeExtended fine;
    };
    using Coarse = ExistenceType;
    using Fine = ExistenceTypeExtended;
    for (auto const& [name, coarse, fine] : std::vector<Row>{
             {u"file", Coarse::AsFile, Fine::RegularFile},
             {u"pipe", Coarse::AsFile, Fine::SpecialFile},
             {u"/dev/null", Coarse::AsFile, Fine::SpecialFile},
             {u"folder", Coarse::AsFolder, Fine::RegularFolder},
             {u"/", Coarse::AsFolder, Fine::RegularFolder},
             {u"folder/..", Coarse::AsFolder, Fine::RegularFolder},
             {u"link to file", Coarse::AsFile, Fine::SymlinkToFile},
             {u"link to pipe", Coarse::AsFile, Fine::SymlinkToFile},
             {u"link to folder", Coarse::AsFolder, Fine::SymlinkToFolder},
             {u"link to folder/inside", Coarse::AsFile, Fine::RegularFile},
             {u"broken link", Coarse::AsNeither, Fine::BrokenSymlink},
             {u"loop", Coarse::AsNeither, Fine::BrokenSymlink},
             {u"link below file", Coarse::AsNeither, Fine::BrokenSymlink},
             {u"missing", Coarse::AsNeither, Fine::None},
             {u"missing/name", Coarse::AsNeither, Fine::None},
             {u"file/name", Coarse::AsNeither, Fine::None},
             {u"loop/name", Coarse::AsNeither, Fine::None},
         })
    {
        StorageIRI const iri = at(name);
        EXPECT_EQ(provider.exists(iri), coarse) << iri;
        EXPECT_EQ(provider.fileExists(iri), coarse == Coarse::AsFile) << iri;
        EXPECT_EQ(provider.folderExists(iri), coarse == Coarse::AsFolder) << iri;
        EXPECT_EQ(provider.existsExtended(iri), fine) << iri;
    }
}

TEST_F(LocalProviderTest, RemovesFilesSpecialFilesAndLinksButNotWhatTheyLeadTo)
{
    for (std::string const name : {"link to file", "link to folder", "broken link", "loop", "pipe", "file"}) {
        provider.removeFile(at(std::u16string(name.begin(), name.end())));
        EXPECT_FALSE(isThere(name)) << name;
    }
    EXPECT_TRUE(isThere("folder/inside"));
}

TEST_F(LocalProviderTest, RemovesNoFolderAsAFile)
{
    for (char16_t const* const name : {u"folder", u"missing", u"missing/name", u"file/name", u"/"}) {
        StorageIRI const iri = at(name);
        EXPECT_EQ(failureOf([&] { provider.removeFile(iri); }), failure(ErrorCode::ResourceNotFound, iri));
    }
    EXPECT_TRUE(isThere("folder/inside"));
}

TEST_F(LocalProviderTest, RemovesAnEmptyFolder)
{
    provider.removeFile(at(u"folder/inside"));
    provider.removeFolder(at(u"folder"));
    EXPECT_FALSE(isThere("folder"));
}

TEST_F(LocalProviderTest, RemovesNoFolderThatHoldsSomething)
{
    EXPECT_EQ(failureOf([&] { provider.removeFolder(at(u"folder")); }),
              failure(ErrorCode::FolderNotEmpty, at(u"folder")));
    EXPECT_TRUE(isThere("folder/inside"));
}

TEST_F(LocalProviderTest, RemovesNoFolderOfWhichTheFileSystemSaysInItsOwnWayThatItIsNotEmpty)
{
    ReplacedSystemCalls replaced;
    replaced->unlinkat = [](int, char const*, int) { return failWith(EEXIST); };
    EXPECT_EQ(failureOf([&] { provider.removeFolder(at(u"folder")); }),
              failure(ErrorCode::FolderNotEmpty, at(u"folder")));
}

TEST_F(LocalProviderTest, RemovesNothingButAFolderAsAFolder)
{
    for (std::string const name : {"file", "pipe", "link to file", "broken link", "loop", "missing"}) {
        StorageIRI const iri = at(std::u16string(name.begin(), name.end()));
        EXPECT_EQ(failureOf([&] { provider.removeFolder(iri); }), failure(ErrorCode::ResourceNotFound, iri));
        EXPECT_EQ(isThere(name), name != "missing");
    }
}

TEST_F(LocalProviderTest, RemovesNoFolderThroughALink)
{
    fs::create_directory(folder / "empty");
    fs::create_symlink("empty", folder / "link to empty");
    for (std::u16string const name : {u"link to empty", u"link to empty/"}) {
        StorageIRI const iri = at(name);
        EXPECT_EQ(failureOf([&] { provider.removeFolder(iri); }), failure(ErrorCode::InvalidLocation, iri));
    }
    EXPECT_TRUE(isThere("empty"));
    EXPECT_TRUE(isThere("link to empty"));
}

TEST_F(LocalProviderTest, KnowsTheSizeOfAFileAndWhenItWasModified)
{
    timespec const times[] = {{0, 0}, {-1, 123'456'789}};
    ASSERT_EQ(::utimensat(AT_FDCWD, (folder / "file").c_str(), times, 0), 0);
    for (char16_t const* const name : {u"file", u"link to file"}) {
        FileAttributes const attributes = provider.getFileAttributes(at(name));
        EXPECT_EQ(attributes.getSize(), 7u);
        EXPECT_EQ(to_iso_extended_string(attributes.getLastModified()), "1969-12-31T23:59:59.123456");
        EXPECT_TRUE(attributes.isWritable());
    }
}

TEST_F(LocalProviderTest, KnowsTheSizeOfAFileBeyond4GiB)
{
    fs::resize_file(folder / "file", 5'000'000'000);
    EXPECT_EQ(provider.getFileAttributes(at(u"file")).getSize(), 5'000'000'000u);
}

TEST_F(LocalProviderTest, KnowsWhenAFolderWasModified)
{
    timespec const times[] = {{0, 0}, {1'234'567'890, 999'999'999}};
    ASSERT_EQ(::utimensat(AT_FDCWD, (folder / "folder").c_str(), times, 0), 0);
    for (char16_t const* const name : {u"folder", u"link to folder"}) {
        FolderAttributes const attributes = provider.getFolderAttributes(at(name));
        EXPECT_EQ(to_iso_extended_string(attributes.getLastModified()), "2009-02-13T23:31:30.999999");
        EXPECT_TRUE(attributes.isWritable());
    }
}

TEST_F(LocalProviderTest, AsksForWritabilityWhenSomebodyWantsToKnow)
{
    FileAttributes const attributes = provider.getFileAttributes(at(u"file"));
    provider.removeFile(at(u"file"));
    EXPECT_FALSE(attributes.isWritable());
}

TEST_F(LocalProviderTest, HasAttributesOfFilesForFilesAndOfFoldersForFolders)
{
    for (char16_t const* const name : {u"folder", u"link to folder", u"broken link", u"missing", u"file/name"})
        EXPECT_EQ(failureOf([&] { static_cast<void>(provider.getFileAttributes(at(name))); }),
                  failure(ErrorCode::ResourceNotFound, at(name)));
    for (char16_t const* const name : {u"file", u"link to file", u"pipe", u"broken link", u"missing", u"file/name"})
        EXPECT_EQ(failureOf([&] { static_cast<void>(provider.getFolderAttributes(at(name))); }),
                  failure(ErrorCode::ResourceNotFound, at(name)));
    EXPECT_EQ(provider.getFileAttributes(at(u"pipe")).getSize(), 0u);
}

TEST_F(LocalProviderTest, CopiesAFile)
{
    provider.copyFile(at(u"file"), at(u"copy"), ReplacementPolicy::Preserve);
    EXPECT_EQ(folder.read("copy"), "content");
}

TEST_F(LocalProviderTest, CopiesAFileOverAnother)
{
    folder.write("copy", "something longer than the content");
    provider.copyFile(at(u"link to file"), at(u"copy"), ReplacementPolicy::Overwrite);
    EXPECT_EQ(folder.read("copy"), "content");
}

TEST_F(LocalProviderTest, CopiesOverNothingThatIsToBePreserved)
{
    folder.write("copy", "old");
    for (ReplacementPolicy const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber})
        for (char16_t const* const source : {u"file", u"copy", u"missing"})
            EXPECT_EQ(failureOf([&] { provider.copyFile(at(source), at(u"copy"), policy); }),
                      failure(ErrorCode::ResourceAlreadyExists, at(u"copy")));
    EXPECT_EQ(folder.read("copy"), "old");
}

TEST_F(LocalProviderTest, CopiesOverNoFolder)
{
    for (char16_t const* const target : {u"folder", u"link to folder"})
        EXPECT_EQ(failureOf([&] { provider.copyFile(at(u"file"), at(target), ReplacementPolicy::Clobber); }),
                  failure(ErrorCode::ResourceAlreadyExists, at(target)));
}

TEST_F(LocalProviderTest, CopiesNoMissingSourceAndLeavesTheTarget)
{
    folder.write("copy", "old");
    for (char16_t const* const source : {u"missing", u"folder", u"broken link"})
        EXPECT_EQ(failureOf([&] { provider.copyFile(at(source), at(u"copy"), ReplacementPolicy::Overwrite); }),
                  failure(ErrorCode::ResourceNotFound, at(source)));
    EXPECT_EQ(folder.read("copy"), "old");
}

TEST_F(LocalProviderTest, LeavesAFileAloneThatIsCopiedOntoItselfUnderAnyName)
{
    fs::create_hard_link(folder / "file", folder / "second name");
    for (ReplacementPolicy const policy : {ReplacementPolicy::Overwrite, ReplacementPolicy::Clobber})
        for (char16_t const* const target : {u"file", u"second name", u"link to file", u"folder/../file"}) {
            provider.copyFile(at(u"file"), at(target), policy);
            provider.copyFile(at(target), at(u"file"), policy);
            EXPECT_EQ(folder.read("file"), "content");
        }
}

TEST_F(LocalProviderTest, CopiesNothingOntoItselfThatIsNoFile)
{
    EXPECT_EQ(failureOf([&] { provider.copyFile(at(u"folder"), at(u"folder"), ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"folder")));
    EXPECT_EQ(failureOf([&] { provider.copyFile(at(u"pipe"), at(u"pipe"), ReplacementPolicy::Overwrite); }),
              failure(ErrorCode::UnsupportedOperation, at(u"pipe")));
}

TEST_F(LocalProviderTest, CommitsATransactionInPlaceOfTheOldContent)
{
    auto const stream = provider.openTransactionalStream(at(u"file"), {});
    ASSERT_EQ(stream->write("new", 3), 3);
    EXPECT_EQ(folder.read("file"), "content");
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(folder.read("file"), "new");
}

TEST_F(LocalProviderTest, LeavesNothingOfATransactionThatIsDropped)
{
    provider.openTransactionalStream(at(u"folder/inside"), {})->write("new", 3);
    EXPECT_EQ(folder.read("folder/inside"), "");
    EXPECT_EQ(std::distance(fs::directory_iterator(folder / "folder"), {}), 1);
}

TEST_F(LocalProviderTest, WritesAFileWithTheLongestNameAllOrNothing)
{
    std::string const name(255, 'x');
    auto const stream = provider.openTransactionalStream(at(std::u16string(name.begin(), name.end())), {});
    stream->write("new", 3);
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(folder.read(name), "new");
}

TEST_F(LocalProviderTest, CommitsOverNoFolder)
{
    auto const stream = provider.openTransactionalStream(at(u"folder"), {});
    EXPECT_EQ(failureOf([&] { stream->close(StreamClosePolicy::Commit); }),
              failure(ErrorCode::ResourceAlreadyExists, at(u"folder")));
    EXPECT_TRUE(isThere("folder/inside"));
}

TEST_F(LocalProviderTest, TellsNamesApartThatDifferInCase)
{
    FilenameSensitivity const sensitivity = provider.getFilenameSensitivity(folder.iri());
    EXPECT_TRUE(sensitivity.caseSensitive);
    EXPECT_TRUE(sensitivity.casePreserving);
    EXPECT_FALSE(provider.fileExists(at(u"FILE")));
}

TEST_F(LocalProviderTest, RefusesForeignLocationsInEveryOperation)
{
    StorageIRI const iri(u"file://example.org/file");
    StorageIRI const to = at(u"new");
    std::vector<std::function<void()>> const operations{
        [&] { provider.createFile(iri); },
        [&] { provider.createFolder(iri); },
        [&] { provider.fileExists(iri); },
        [&] { provider.folderExists(iri); },
        [&] { provider.exists(iri); },
        [&] { provider.existsExtended(iri); },
        [&] { provider.removeFile(iri); },
        [&] { provider.removeFolder(iri); },
        [&] { provider.getFileAttributes(iri); },
        [&] { provider.getFolderAttributes(iri); },
        [&] { provider.openStream(iri, {}); },
        [&] { provider.openReadOnlyStream(iri); },
        [&] { provider.openTransactionalStream(iri, {}); },
        [&] { provider.listAll(iri); },
        [&] { provider.listFiles(iri); },
        [&] { provider.listFolders(iri); },
        [&] { provider.listAllNamesOnly(iri); },
        [&] { provider.listFilesNamesOnly(iri); },
        [&] { provider.listFoldersNamesOnly(iri); },
        [&] { provider.moveFile(iri, to, ReplacementPolicy::Overwrite); },
        [&] { provider.moveFile(at(u"file"), iri, ReplacementPolicy::Overwrite); },
        [&] { provider.moveFolder(iri, to, ReplacementPolicy::Overwrite); },
        [&] { provider.moveFolder(at(u"folder"), iri, ReplacementPolicy::Overwrite); },
        [&] { provider.copyFile(iri, to, ReplacementPolicy::Overwrite); },
        [&] { provider.copyFile(at(u"file"), iri, ReplacementPolicy::Overwrite); },
        [&] { provider.publishFolderEventsFor(iri, {}, {}); },
        [&] { provider.publishFileEventsFor(iri, {}, {}); },
        [&] { provider.stopPublishingFolderEventsFor(iri); },
        [&] { provider.stopPublishingFileEventsFor(iri); },
    };
    for (std::size_t i = 0; i < operations.size(); ++i) {
        std::string const actual = failureOf(operations[i]);
        EXPECT_TRUE(actual.starts_with("ErrorCode::InvalidLocation at file://example.org/")) << i << ": " << actual;
    }
    EXPECT_FALSE(isThere("new"));
}

} // namespace
} // namespace foundation::storage::local
