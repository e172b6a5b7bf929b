#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/SystemCalls.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>
#include <tests/support/printed.hpp>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <string_view>
#include <sys/stat.h>
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
using tests::support::printed;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

constexpr ReplacementPolicy policies[] = {ReplacementPolicy::Preserve, ReplacementPolicy::Overwrite,
                                          ReplacementPolicy::Clobber, ReplacementPolicy::NoClobber};

bool isReplacing(ReplacementPolicy policy)
{
    return policy == ReplacementPolicy::Overwrite || policy == ReplacementPolicy::Clobber;
}

/// A file and a folder to be moved, and one of each kind of entry that can be in their way.
class Entries
{
public:
    Entries()
    {
        folder.write("source", "content");
        fs::create_directory(folder / "source folder");
        folder.write("source folder/inside", "inside");
        folder.write("file", "old");
        fs::create_directory(folder / "empty folder");
        fs::create_directory(folder / "folder");
        folder.write("folder/kept", "kept");
        fs::create_symlink("file", folder / "link to file");
        fs::create_symlink("folder", folder / "link to folder");
        fs::create_symlink("nothing", folder / "broken link");
        ::mkfifo((folder / "pipe").c_str(), 0600);
    }

    TemporaryFolder folder;
    LocalProvider const provider;

    StorageIRI at(std::u16string const& name) const { return folder.iri(name); }
    bool isThere(std::string const& name) const { return fs::exists(fs::symlink_status(folder / name)); }

    std::string moveFile(std::u16string const& from, std::u16string const& to, ReplacementPolicy policy) const
    {
        return failureOf([&] { provider.moveFile(at(from), at(to), policy); });
    }
    std::string moveFolder(std::u16string const& from, std::u16string const& to, ReplacementPolicy policy) const
    {
        return failureOf([&] { provider.moveFolder(at(from), at(to), policy); });
    }

    /// Whether everything is as it was, but for "source" and "source folder".
    bool othersAreIntact() const
    {
        return folder.read("file") == "old" && folder.read("folder/kept") == "kept" && isThere("empty folder") &&
               fs::read_symlink(folder / "link to file") == "file" &&
               fs::read_symlink(folder / "link to folder") == "folder" &&
               fs::read_symlink(folder / "broken link") == "nothing" && fs::is_fifo(folder / "pipe");
    }

    std::size_t count() const
    {
        return static_cast<std::size_t>(std::distance(fs::directory_iterator(folder.path()), {}));
    }
};

std::string const moved = "no failure";

class LocalProviderMoves : public testing::TestWithParam<ReplacementPolicy>, protected Entries
{};

INSTANTIATE_TEST_SUITE_P(, LocalProviderMoves, testing::ValuesIn(policies), [](auto const& policy) {
    std::string const name = printed(policy.param);
    return name.substr(name.rfind(':') + 1);
});

TEST_P(LocalProviderMoves, AFileToAFreeName)
{
    EXPECT_EQ(moveFile(u"source", u"folder/new", GetParam()), moved);
    EXPECT_EQ(folder.read("folder/new"), "content");
    EXPECT_FALSE(isThere("source"));
    EXPECT_TRUE(othersAreIntact());
}

TEST_P(LocalProviderMoves, AFolderToAFreeName)
{
    EXPECT_EQ(moveFolder(u"source folder", u"folder/new", GetParam()), moved);
    EXPECT_EQ(folder.read("folder/new/inside"), "inside");
    EXPECT_FALSE(isThere("source folder"));
    EXPECT_TRUE(othersAreIntact());
}

TEST_P(LocalProviderMoves, AFileOverWhatIsNoFolderIfThePolicySaysSo)
{
    for (std::u16string const name : {u"file", u"link to file", u"broken link", u"pipe"}) {
        Entries const entries;
        std::string const plainName(name.begin(), name.end());
        std::string const result = entries.moveFile(u"source", name, GetParam());
        if (isReplacing(GetParam())) {
            EXPECT_EQ(result, moved);
            EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(entries.folder / plainName))) << plainName;
            EXPECT_EQ(entries.folder.read(plainName), "content");
            EXPECT_EQ(entries.folder.read("file"), name == u"file" ? "content" : "old");
            EXPECT_FALSE(entries.isThere("source"));
        } else {
            EXPECT_EQ(result, failure(ErrorCode::ResourceAlreadyExists, entries.at(name)));
            EXPECT_EQ(entries.folder.read("source"), "content");
            EXPECT_TRUE(entries.othersAreIntact());
        }
        EXPECT_FALSE(entries.isThere("nothing"));
    }
}

TEST_P(LocalProviderMoves, NoFileOverAFolder)
{
    for (std::u16string const name : {u"empty folder", u"folder", u"link to folder", u"/", u"folder/."})
        EXPECT_EQ(moveFile(u"source", name, GetParam()), failure(ErrorCode::ResourceAlreadyExists, at(name)));
    EXPECT_EQ(folder.read("source"), "content");
    EXPECT_TRUE(othersAreIntact());
}

TEST_P(LocalProviderMoves, NoFolderOverAnything)
{
    for (std::u16string const name :
         {u"file", u"empty folder", u"folder", u"link to file", u"link to folder", u"broken link", u"pipe"})
        EXPECT_EQ(moveFolder(u"source folder", name, GetParam()), failure(ErrorCode::ResourceAlreadyExists, at(name)));
    EXPECT_EQ(folder.read("source folder/inside"), "inside");
    EXPECT_TRUE(othersAreIntact());
}

TEST_P(LocalProviderMoves, NoFileThatIsMissing)
{
    for (std::u16string const name : {u"missing", u"missing/name", u"file/name", u"source folder", u"folder"})
        for (std::u16string const target : {u"file", u"new", u"missing/new"})
            EXPECT_EQ(moveFile(name, target, GetParam()), failure(ErrorCode::ResourceNotFound, at(name)));
    EXPECT_TRUE(othersAreIntact());
}

TEST_P(LocalProviderMoves, NoFolderThatIsMissing)
{
    for (std::u16string const name : {u"missing", u"missing/name", u"file/name", u"source", u"link to file", u"pipe"})
        EXPECT_EQ(moveFolder(name, u"new", GetParam()), failure(ErrorCode::ResourceNotFound, at(name)));
    EXPECT_TRUE(othersAreIntact());
}

TEST_P(LocalProviderMoves, NothingIntoAFolderThatIsMissing)
{
    for (std::u16string const name : {u"missing/new", u"file/new", u"broken link/new"}) {
        EXPECT_EQ(moveFile(u"source", name, GetParam()), failure(ErrorCode::ResourceNotFound, at(name)));
        EXPECT_EQ(moveFolder(u"source folder", name, GetParam()), failure(ErrorCode::ResourceNotFound, at(name)));
    }
    EXPECT_EQ(folder.read("source"), "content");
    EXPECT_EQ(folder.read("source folder/inside"), "inside");
}

TEST_P(LocalProviderMoves, LinksAsFilesWithoutFollowingThem)
{
    for (std::string const name : {"link to file", "link to folder", "broken link"}) {
        fs::path const target = fs::read_symlink(folder / name);
        EXPECT_EQ(moveFile(std::u16string(name.begin(), name.end()), u"new", GetParam()), moved);
        EXPECT_EQ(fs::read_symlink(folder / "new"), target);
        EXPECT_FALSE(isThere(name));
        fs::remove(folder / "new");
    }
    EXPECT_EQ(folder.read("folder/kept"), "kept");
}

TEST_P(LocalProviderMoves, NoLinkAsAFolder)
{
    EXPECT_EQ(moveFolder(u"link to folder", u"new", GetParam()),
              failure(ErrorCode::InvalidLocation, at(u"link to folder")));
    EXPECT_TRUE(othersAreIntact());
}

TEST_P(LocalProviderMoves, NoFolderIntoItself)
{
    fs::create_symlink("source folder", folder / "link to source");
    for (std::u16string const name : {u"source folder/new", u"link to source/new", u"folder/../source folder/new"})
        EXPECT_EQ(moveFolder(u"source folder", name, GetParam()), failure(ErrorCode::InvalidLocation, at(name)));
    EXPECT_EQ(folder.read("source folder/inside"), "inside");
    EXPECT_FALSE(isThere("source folder/new"));
}

TEST_P(LocalProviderMoves, AFileOntoItselfWithoutChange)
{
    fs::create_hard_link(folder / "source", folder / "second name");
    fs::create_symlink(".", folder / "here");
    for (std::u16string const name : {u"source", u"folder/../source", u"here/source"}) {
        std::string const expected =
            isReplacing(GetParam()) ? moved : failure(ErrorCode::ResourceAlreadyExists, at(name));
        EXPECT_EQ(moveFile(u"source", name, GetParam()), expected);
        EXPECT_EQ(moveFile(name, u"source", GetParam()).starts_with("no failure"), isReplacing(GetParam()));
        EXPECT_EQ(folder.read("source"), "content");
        EXPECT_EQ(folder.read("second name"), "content");
    }
}

TEST_P(LocalProviderMoves, AFolderOntoItselfWithoutChange)
{
    fs::create_symlink(".", folder / "here");
    for (std::u16string const name : {u"source folder", u"folder/../source folder", u"here/source folder"}) {
        std::string const expected =
            isReplacing(GetParam()) ? moved : failure(ErrorCode::ResourceAlreadyExists, at(name));
        EXPECT_EQ(moveFolder(u"source folder", name, GetParam()), expected);
        EXPECT_EQ(folder.read("source folder/inside"), "inside");
    }
}

TEST_P(LocalProviderMoves, AFileOntoAnotherNameOfIts)
{
    fs::create_hard_link(folder / "source", folder / "second name");
    fs::create_hard_link(folder / "source", folder / "folder/source");
    std::size_t const entries = count();
    for (std::u16string const name : {u"second name", u"folder/source"}) {
        if (isReplacing(GetParam())) {
            EXPECT_EQ(moveFile(u"source", name, GetParam()), moved);
            EXPECT_FALSE(isThere("source"));
            EXPECT_EQ(count(), entries - 1) << "nothing may be left of the way there";
            fs::create_hard_link(folder / "second name", folder / "source");
        } else
            EXPECT_EQ(moveFile(u"source", name, GetParam()), failure(ErrorCode::ResourceAlreadyExists, at(name)));
        EXPECT_EQ(folder.read("second name"), "content");
        EXPECT_EQ(folder.read("folder/source"), "content");
        EXPECT_EQ(fs::hard_link_count(folder / "second name"), 3u);
    }
}

TEST_P(LocalProviderMoves, ALinkOntoWhatItLeadsToWithoutLosingThat)
{
    fs::create_symlink("link to file", folder / "link to link");
    for (std::u16string const name : {u"link to link", u"link to file"}) {
        EXPECT_EQ(moveFile(name, u"file", GetParam()),
                  isReplacing(GetParam()) ? moved : failure(ErrorCode::ResourceAlreadyExists, at(u"file")));
        EXPECT_EQ(folder.read("file"), "old");
        EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(folder / "file")));
    }
    EXPECT_EQ(isThere("link to file"), !isReplacing(GetParam()));
    EXPECT_EQ(isThere("link to link"), !isReplacing(GetParam()));
}

/// As a file system answers that has no way to rename without replacing.
int renameWithoutFlags(int fromFolder, char const* from, int toFolder, char const* to, unsigned flags)
{
    return flags != 0 ? failWith(EINVAL) : realSystemCalls.renameat2(fromFolder, from, toFolder, to, flags);
}

bool isSource(std::string_view path)
{
    return path == "source" || path.ends_with("/source");
}

class LocalProviderMovesWithoutNoReplace : public testing::Test, protected Entries
{
protected:
    LocalProviderMovesWithoutNoReplace() { replaced->renameat2 = renameWithoutFlags; }

    ReplacedSystemCalls replaced;
};

TEST_F(LocalProviderMovesWithoutNoReplace, AFileToAFreeName)
{
    EXPECT_EQ(moveFile(u"source", u"new", ReplacementPolicy::Preserve), moved);
    EXPECT_EQ(folder.read("new"), "content");
    EXPECT_FALSE(isThere("source"));
}

TEST_F(LocalProviderMovesWithoutNoReplace, ALinkToAFreeName)
{
    EXPECT_EQ(moveFile(u"link to folder", u"new", ReplacementPolicy::Preserve), moved);
    EXPECT_EQ(fs::read_symlink(folder / "new"), "folder");
    EXPECT_FALSE(isThere("link to folder"));
}

TEST_F(LocalProviderMovesWithoutNoReplace, AFolderToAFreeName)
{
    EXPECT_EQ(moveFolder(u"source folder", u"new", ReplacementPolicy::Preserve), moved);
    EXPECT_EQ(folder.read("new/inside"), "inside");
    EXPECT_FALSE(isThere("source folder"));
}

TEST_F(LocalProviderMovesWithoutNoReplace, NothingOverAnything)
{
    for (std::u16string const name :
         {u"file", u"empty folder", u"folder", u"link to file", u"link to folder", u"broken link", u"pipe"})
    {
        auto const expected = failure(ErrorCode::ResourceAlreadyExists, at(name));
        EXPECT_EQ(moveFile(u"source", name, ReplacementPolicy::NoClobber), expected);
        EXPECT_EQ(moveFolder(u"source folder", name, ReplacementPolicy::NoClobber), expected);
    }
    EXPECT_TRUE(othersAreIntact());
    EXPECT_EQ(folder.read("source"), "content");
}

TEST_F(LocalProviderMovesWithoutNoReplace, NoFolderIntoItself)
{
    fs::create_symlink("source folder", folder / "link to source");
    EXPECT_EQ(moveFolder(u"source folder", u"link to source/new", ReplacementPolicy::Preserve),
              failure(ErrorCode::InvalidLocation, at(u"link to source/new")));
    EXPECT_FALSE(isThere("source folder/new"));
}

TEST_F(LocalProviderMovesWithoutNoReplace, NoFileWhereThereAreNoSecondNamesEither)
{
    replaced->linkat = [](int, char const*, int, char const*, int) { return failWith(EPERM); };
    EXPECT_EQ(moveFile(u"source", u"new", ReplacementPolicy::Preserve),
              failure(ErrorCode::UnsupportedOperation, at(u"new")));
    EXPECT_EQ(folder.read("source"), "content");
    EXPECT_FALSE(isThere("new"));
}

TEST_F(LocalProviderMovesWithoutNoReplace, NoFileThatCannotGiveUpItsOldName)
{
    replaced->unlinkat = [](int at, char const* path, int flags) {
        return isSource(path) ? failWith(EBUSY) : realSystemCalls.unlinkat(at, path, flags);
    };
    EXPECT_EQ(moveFile(u"source", u"new", ReplacementPolicy::Preserve),
              failure(ErrorCode::ResourceInUse, at(u"source")));
    EXPECT_EQ(folder.read("source"), "content");
    EXPECT_FALSE(isThere("new"));
}

TEST_F(LocalProviderMovesWithoutNoReplace, AFileThatCannotGiveUpItsOldNameRemovesNothingElse)
{
    static fs::path target;
    target = folder / "new";
    replaced->unlinkat = [](int at, char const* path, int flags) {
        if (!isSource(path))
            return realSystemCalls.unlinkat(at, path, flags);
        fs::remove(target);
        std::ofstream(target) << "of somebody else";
        return failWith(EBUSY);
    };
    EXPECT_EQ(moveFile(u"source", u"new", ReplacementPolicy::Preserve),
              failure(ErrorCode::ResourceInUse, at(u"source")));
    EXPECT_EQ(folder.read("source"), "content");
    EXPECT_EQ(folder.read("new"), "of somebody else");
}

TEST_F(LocalProviderMovesWithoutNoReplace, AFileWhoseOldNameSomebodyHasRemovedStays)
{
    static fs::path source;
    source = folder / "source";
    replaced->unlinkat = [](int at, char const* path, int flags) {
        if (isSource(path))
            fs::remove(source);
        return realSystemCalls.unlinkat(at, path, flags);
    };
    failureOf([&] { moveFile(u"source", u"new", ReplacementPolicy::Preserve); });
    EXPECT_EQ(folder.read("new"), "content");
}

class LocalProviderWatchedMoves : public testing::Test, protected Entries
{
protected:
    ReplacedSystemCalls replaced;
};

TEST_F(LocalProviderWatchedMoves, NameTheTargetWhenItIsOnAnotherFileSystem)
{
    replaced->renameat2 = [](int, char const*, int, char const*, unsigned) { return failWith(EXDEV); };
    for (ReplacementPolicy const policy : policies) {
        auto const expected = failure(ErrorCode::UnsupportedOperation, at(u"new"));
        EXPECT_EQ(moveFile(u"source", u"new", policy), expected);
        EXPECT_EQ(moveFolder(u"source folder", u"new", policy), expected);
    }
}

TEST_F(LocalProviderWatchedMoves, OfAFileOntoItselfNeverTakeItsNameAway)
{
    static int calls;
    calls = 0;
    replaced->renameat2 = [](int, char const*, int, char const*, unsigned) { return ++calls; };
    EXPECT_EQ(moveFile(u"source", u"folder/../source", ReplacementPolicy::Overwrite), moved);
    EXPECT_EQ(calls, 0);
}

TEST_F(LocalProviderWatchedMoves, NameTheSourceWhenItVanishesMeanwhile)
{
    static std::string source;
    source = (folder / "source").string();
    replaced->renameat2 = [](int fromFolder, char const* from, int toFolder, char const* to, unsigned flags) {
        fs::remove(source);
        return realSystemCalls.renameat2(fromFolder, from, toFolder, to, flags);
    };
    EXPECT_EQ(moveFile(u"source", u"new", ReplacementPolicy::Preserve),
              failure(ErrorCode::ResourceNotFound, at(u"source")));
}

TEST_F(LocalProviderWatchedMoves, ReplaceNoFolderThatAppearsMeanwhile)
{
    static fs::path target;
    target = folder / "new";
    replaced->renameat2 = [](int fromFolder, char const* from, int toFolder, char const* to, unsigned flags) {
        fs::create_directory(target);
        return realSystemCalls.renameat2(fromFolder, from, toFolder, to, flags);
    };
    EXPECT_EQ(moveFile(u"source", u"new", ReplacementPolicy::Overwrite),
              failure(ErrorCode::ResourceAlreadyExists, at(u"new")));
    EXPECT_EQ(folder.read("source"), "content");
}

TEST_F(LocalProviderWatchedMoves, LeaveBothNamesOfAFileAsTheyWere)
{
    fs::create_hard_link(folder / "source", folder / "second name");
    replaced->renameat2 = [](int fromFolder, char const* from, int toFolder, char const* to, unsigned flags) {
        bool const isTarget = std::string_view(to).ends_with("second name");
        return isTarget ? failWith(EIO) : realSystemCalls.renameat2(fromFolder, from, toFolder, to, flags);
    };
    std::size_t const entries = count();
    EXPECT_EQ(moveFile(u"source", u"second name", ReplacementPolicy::Overwrite),
              failure(ErrorCode::IOError, at(u"second name")));
    EXPECT_EQ(folder.read("source"), "content");
    EXPECT_EQ(folder.read("second name"), "content");
    EXPECT_EQ(count(), entries);
}

TEST_F(LocalProviderWatchedMoves, CannotLoseAFileThatTakesTheNameOfTheSourceMeanwhile)
{
    fs::create_hard_link(folder / "source", folder / "second name");
    static fs::path path;
    static bool done;
    path = folder.path();
    done = false;
    replaced->renameat2 = [](int fromFolder, char const* from, int toFolder, char const* to, unsigned flags) {
        if (!std::exchange(done, true))
            fs::rename(path / "file", path / "source");
        return realSystemCalls.renameat2(fromFolder, from, toFolder, to, flags);
    };
    EXPECT_EQ(moveFile(u"source", u"second name", ReplacementPolicy::Overwrite), moved);
    EXPECT_EQ(folder.read("second name"), "old");
}

} // namespace
} // namespace foundation::storage::local
