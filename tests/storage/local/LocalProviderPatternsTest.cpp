#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/SystemCalls.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <algorithm>
#include <filesystem>
#include <set>
#include <string>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

using Names = std::set<std::string>;

Names namesOf(IProvider::Listing const& listing)
{
    Names names;
    for (FolderEntry const& entry : entries(*listing))
        names.insert(fl::filesystem::to_native_bytes(entry.getName()) + (entry.isFile() ? "" : "/"));
    return names;
}

class LocalProviderPatterns : public testing::Test
{
protected:
    LocalProviderPatterns()
    {
        for (char const* const name : {"a.txt", "b.txt", "B.TXT", ".hidden.txt", "c.md"})
            folder.write(name, "");
        fs::create_directory(folder / "d.txt");
        fs::create_symlink("a.txt", folder / "link.txt");
        fs::create_symlink("d.txt", folder / "folder.txt");
        fs::create_symlink("nothing", folder / "broken.txt");
    }

    TemporaryFolder folder;
    LocalProvider const provider;
};

TEST_F(LocalProviderPatterns, SelectWhatEachOperationLists)
{
    Names const files{"a.txt", "b.txt", ".hidden.txt", "link.txt", "broken.txt"};
    Names const folders{"d.txt/", "folder.txt/"};
    Names all = files;
    all.insert(folders.begin(), folders.end());
    EXPECT_EQ(namesOf(provider.listAll(folder.iri(), u"*.txt")), all);
    EXPECT_EQ(namesOf(provider.listFiles(folder.iri(), u"*.txt")), files);
    EXPECT_EQ(namesOf(provider.listFolders(folder.iri(), u"*.txt")), folders);
    EXPECT_EQ(namesOf(provider.listAllNamesOnly(folder.iri(), u"*.txt")), all);
    EXPECT_EQ(namesOf(provider.listFilesNamesOnly(folder.iri(), u"*.txt")), files);
    EXPECT_EQ(namesOf(provider.listFoldersNamesOnly(folder.iri(), u"*.txt")), folders);
}

TEST_F(LocalProviderPatterns, CarryTheAttributesOfWhatTheySelect)
{
    auto const listing = provider.listAll(folder.iri(), u"[ad].txt");
    int entryCount = 0;
    for (FolderEntry const& entry : entries(*listing)) {
        ++entryCount;
        EXPECT_EQ(entry.getFileAttributes().has_value(), entry.isFile());
        EXPECT_EQ(entry.getFolderAttributes().has_value(), !entry.isFile());
    }
    EXPECT_EQ(entryCount, 2);
}

TEST_F(LocalProviderPatterns, SelectAgainAfterAReset)
{
    auto const listing = provider.listFiles(folder.iri(), u"?.txt");
    EXPECT_EQ(namesOf(listing), (Names{"a.txt", "b.txt"}));
    folder.write("e.txt", "");
    folder.write("e.md", "");
    listing->reset();
    EXPECT_EQ(namesOf(listing), (Names{"a.txt", "b.txt", "e.txt"}));
}

TEST_F(LocalProviderPatterns, TakeEachByteThatIsNotTextForACharacter)
{
    for (char const* const name : {"\xff", "\xff\xfe", "\xc3\xa9", "\xee\xbe\x80"})
        folder.write(name, "");
    EXPECT_EQ(namesOf(provider.listFiles(folder.iri(), u"?")), (Names{"\xff", "\xc3\xa9"}));
    EXPECT_EQ(namesOf(provider.listFiles(folder.iri(), u"??")), (Names{"\xff\xfe"}));
    EXPECT_EQ(namesOf(provider.listFiles(folder.iri(), u"*[\uEF80-\uEFFE]")), (Names{"\xff\xfe", "\xee\xbe\x80"}));
}

/// The last parts of the paths that were asked about.
std::vector<std::string> asked;

void noteWhatIsAskedAbout(ReplacedSystemCalls& replaced)
{
    asked.clear();
    replaced->statx = [](int at, char const* path, int flags, unsigned mask, struct statx* result) {
        asked.push_back(fs::path(path).filename());
        return realSystemCalls.statx(at, path, flags, mask, result);
    };
}

TEST_F(LocalProviderPatterns, AskNothingAboutNamesThatDoNotMatch)
{
    ReplacedSystemCalls replaced;
    noteWhatIsAskedAbout(replaced);
    namesOf(provider.listAll(folder.iri(), u"*.md"));
    EXPECT_EQ(asked, std::vector<std::string>{"c.md"});
    asked.clear();
    namesOf(provider.listAllNamesOnly(folder.iri(), u"*.md"));
    namesOf(provider.listFilesNamesOnly(folder.iri(), u"l*.md"));
    EXPECT_EQ(asked, std::vector<std::string>{});
    namesOf(provider.listFoldersNamesOnly(folder.iri(), u"fold*"));
    EXPECT_EQ(asked, std::vector<std::string>{"folder.txt"});
}

/// Names that are patterns, each of which would match the one beside it.
class LocalProviderPatternLikeNames : public testing::TestWithParam<char const*>
{
protected:
    LocalProviderPatternLikeNames()
    {
        fs::create_directory(folder / "neighbour");
        fs::create_directory(folder / "n");
        folder.write("neighbour/kept", "kept");
        folder.write("n/kept", "kept");
    }

    ~LocalProviderPatternLikeNames() override
    {
        EXPECT_EQ(folder.read("neighbour/kept"), "kept");
        EXPECT_EQ(folder.read("n/kept"), "kept");
    }

    std::u16string name() const { return fl::filesystem::from_native_bytes(GetParam()); }

    TemporaryFolder folder;
    LocalProvider const provider;
};

TEST_P(LocalProviderPatternLikeNames, AreThoseOfFoldersThatAreListed)
{
    provider.createFolder(folder.iri(name()));
    EXPECT_EQ(namesOf(provider.listAll(folder.iri(name()))), Names{});
    folder.write(GetParam() + std::string("/inside"), "");
    EXPECT_EQ(namesOf(provider.listAll(folder.iri(name()))), Names{"inside"});
    EXPECT_EQ(namesOf(provider.listAllNamesOnly(folder.iri(name()), u"*")), Names{"inside"});
}

TEST_P(LocalProviderPatternLikeNames, AreThoseOfFoldersThatAreRemovedAndMoved)
{
    provider.createFolder(folder.iri(name()));
    provider.moveFolder(folder.iri(name()), folder.iri(name() + u"2"), ReplacementPolicy::Preserve);
    EXPECT_EQ(namesOf(provider.listAll(folder.iri())), (Names{"n/", "neighbour/", GetParam() + std::string("2/")}));
    provider.removeFolder(folder.iri(name() + u"2"));
    EXPECT_EQ(namesOf(provider.listAll(folder.iri())), (Names{"n/", "neighbour/"}));
}

TEST_P(LocalProviderPatternLikeNames, AreThoseOfFilesThatAreCopiedAndRemoved)
{
    provider.createFolder(folder.iri(u"other"));
    StorageIRI const file = folder.iri(name());
    StorageIRI const copy(folder.iri(u"other"), name());
    folder.write(GetParam(), "content");
    provider.copyFile(file, copy, ReplacementPolicy::Preserve);
    EXPECT_EQ(folder.read(GetParam()), "content");
    EXPECT_EQ(namesOf(provider.listAll(folder.iri(u"other"))), Names{GetParam()});
    provider.removeFile(file);
    EXPECT_FALSE(provider.fileExists(file));
    EXPECT_TRUE(provider.fileExists(copy));
}

TEST_P(LocalProviderPatternLikeNames, AreNotFoundWhereOnlyNeighboursAre)
{
    StorageIRI const iri = folder.iri(name());
    auto const missing = failure(ErrorCode::ResourceNotFound, iri);
    EXPECT_EQ(provider.exists(iri), ExistenceType::AsNeither);
    EXPECT_EQ(failureOf([&] { provider.listAll(iri); }), missing);
    EXPECT_EQ(failureOf([&] { provider.removeFolder(iri); }), missing);
    EXPECT_EQ(failureOf([&] { provider.removeFile(iri); }), missing);
}

INSTANTIATE_TEST_SUITE_P(Each, LocalProviderPatternLikeNames,
                         testing::Values("*", "?", "[n]", "[!a]", "n*", "**", "[", "\\n", "{n,neighbour}", "~", "$HOME",
                                         "%2A"));

} // namespace
} // namespace foundation::storage::local
