#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/FolderChain.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/ScopedMount.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/deepFolders.hpp>
#include <tests/support/failureOf.hpp>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <dirent.h>
#include <filesystem>
#include <iterator>
#include <set>
#include <string>
#include <string_view>
#include <sys/stat.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::makeDeepFolders;
using tests::support::ReplacedSystemCalls;
using tests::support::ScopedMount;
using tests::support::TemporaryFolder;

using Names = std::multiset<std::u16string>;

/// The names from where a listing stands, with '/' behind those of folders.
Names rest(IFolderEntryIterator& listing)
{
    Names names;
    for (FolderEntry const& entry : entries(listing))
        names.insert(entry.getName() + (entry.isFile() ? u"" : u"/"));
    return names;
}

class LocalProviderRecursiveListing : public testing::Test
{
protected:
    LocalProviderRecursiveListing()
    {
        fs::create_directories(folder / "a/b");
        folder.write("a/b/file", "");
        folder.write("file", "content");
    }

    Names all() const { return rest(*provider.listAllRecursive(folder.iri())); }
    Names allNamesOnly() const { return rest(*provider.listAllRecursiveNamesOnly(folder.iri())); }

    TemporaryFolder folder;
    LocalProvider provider;
    Names const content{u"a/", u"a/b/", u"a/b/file", u"file"};
};

TEST_F(LocalProviderRecursiveListing, GivesFoldersRightBeforeWhatTheyHold)
{
    std::u16string last;
    auto const listing = provider.listAllRecursiveNamesOnly(folder.iri());
    for (FolderEntry const& entry : entries(*listing)) {
        std::size_t const slash = entry.getName().rfind(u'/');
        if (slash != std::u16string::npos) {
            EXPECT_EQ(entry.getName().substr(0, slash), last);
        }
        last = entry.getName();
    }
}

TEST_F(LocalProviderRecursiveListing, StartsAgainFromWhereverItStands)
{
    auto const listing = provider.listAllRecursive(folder.iri());
    for (std::size_t steps = 0; steps <= content.size(); ++steps) {
        for (std::size_t i = 0; i < steps; ++i)
            listing->next();
        listing->reset();
        EXPECT_EQ(rest(*listing), content);
        listing->reset();
    }
}

TEST_F(LocalProviderRecursiveListing, FollowsALinkInThePlaceOfTheFolderAlone)
{
    fs::create_directory_symlink("a", folder / "link");
    fs::create_symlink("nowhere", folder / "a/broken");
    EXPECT_EQ(rest(*provider.listAllRecursive(folder.iri(u"link"))), (Names{u"b/", u"b/file", u"broken"}));
    EXPECT_EQ(all(), (Names{u"a/", u"a/b/", u"a/b/file", u"a/broken", u"file", u"link/"}));
}

TEST_F(LocalProviderRecursiveListing, KeepsEveryNameReachable)
{
    fs::create_directory(folder / "a/\xff?#%20");
    folder.write("a/\xff?#%20/\n\xfe", "content");
    std::size_t found = 0;
    auto const listing = provider.listAllRecursive(folder.iri());
    for (FolderEntry const& entry : entries(*listing)) {
        EXPECT_NE(provider.exists(folder.iri(entry.getName())), ExistenceType::AsNeither);
        ++found;
    }
    EXPECT_EQ(found, 6U);
}

TEST_F(LocalProviderRecursiveListing, KnowsWhetherAnEntryBelowCanBeWritten)
{
    ReplacedSystemCalls calls;
    calls->faccessat = [](int, char const* path, int, int) {
        return std::string_view(path).ends_with("/a/b/file") ? failWith(EACCES) : 0;
    };
    auto const listing = provider.listAllRecursive(folder.iri());
    for (FolderEntry const& entry : entries(*listing)) {
        if (entry.isFile()) {
            EXPECT_EQ(entry.getFileAttributes()->isWritable(), entry.getName() != u"a/b/file");
        }
    }
}

TEST_F(LocalProviderRecursiveListing, GoesAsDeepAsItGetsWithFewDescriptors)
{
    static int open;
    static int highest;
    open = highest = 0;
    makeDeepFolders(folder.path(), 5000);
    {
        ReplacedSystemCalls calls;
        calls->openat = [](int at, char const* path, int flags, mode_t mode) {
            highest = std::max(highest, ++open);
            return realSystemCalls.openat(at, path, flags, mode);
        };
        calls->close = [](int descriptor) {
            --open;
            return realSystemCalls.close(descriptor);
        };
        std::size_t longest = 0;
        std::size_t count = 0;
        auto const listing = provider.listAllRecursiveNamesOnly(folder.iri());
        for (FolderEntry const& entry : entries(*listing)) {
            longest = std::max(longest, entry.getName().size());
            ++count;
        }
        EXPECT_EQ(count, 5000U + 1 + content.size());
        EXPECT_EQ(longest, 5000U * 2 + 4);
        EXPECT_LE(highest, static_cast<int>(detail::FolderChain::maximumOpen) + 2);
    }
    provider.removeFolderRecursively(folder.iri(u"d"));
}

TEST_F(LocalProviderRecursiveListing, AsksNothingForNamesAndOncePerEntryForAttributes)
{
    static int asked;
    asked = 0;
    ReplacedSystemCalls calls;
    calls->statx = [](int at, char const* path, int flags, unsigned mask, struct statx* result) {
        ++asked;
        return realSystemCalls.statx(at, path, flags, mask, result);
    };
    EXPECT_EQ(allNamesOnly(), content);
    EXPECT_EQ(asked, 0);
    EXPECT_EQ(all(), content);
    EXPECT_EQ(asked, static_cast<int>(content.size()));
}

TEST_F(LocalProviderRecursiveListing, EndsWhereTheTreeIsRemovedAroundIt)
{
    constexpr std::size_t depth = 3 * detail::FolderChain::maximumOpen;
    for (bool const withAttributes : {true, false}) {
        makeDeepFolders(folder.path(), depth);
        auto const listing =
            withAttributes ? provider.listAllRecursive(folder.iri()) : provider.listAllRecursiveNamesOnly(folder.iri());
        while (listing->entry().getName().size() < 2 * depth - 1)
            listing->next();
        provider.removeFolderRecursively(folder.iri(u"d"));
        EXPECT_EQ(failureOf([&] { rest(*listing); }), "no failure");
    }
}

TEST_F(LocalProviderRecursiveListing, GoesAsDeepWithAttributesAndConfined)
{
    makeDeepFolders(folder.path(), 5000);
    LocalProvider confined;
    boost::property_tree::ptree settings;
    settings.put("root", folder.path().native());
    confined.configure(settings);
    for (LocalProvider const* const each : {&provider, &confined}) {
        std::size_t count = 0;
        std::size_t longest = 0;
        auto const listing = each->listAllRecursive(folder.iri());
        for (FolderEntry const& entry : entries(*listing)) {
            ++count;
            longest = std::max(longest, entry.getName().size());
            EXPECT_EQ(entry.isFile(), entry.getFileAttributes().has_value());
        }
        EXPECT_EQ(count, 5000U + 1 + content.size());
        EXPECT_EQ(longest, 5000U * 2 + 4);
    }
    confined.removeFolderRecursively(folder.iri(u"d"));
    EXPECT_EQ(allNamesOnly(), content);
}

TEST_F(LocalProviderRecursiveListing, PassesOverWhatIsMovedAwayMeanwhile)
{
    constexpr std::size_t depth = 100;
    TemporaryFolder const elsewhere;
    makeDeepFolders(folder.path(), depth);
    folder.write("d/later", "");
    auto const listing = provider.listAllRecursiveNamesOnly(folder.iri());
    std::multiset<std::u16string> names;
    for (; listing->entry().getName().size() < 2 * depth - 1; listing->next())
        names.insert(listing->entry().getName());
    fs::rename(folder / "d/d/d", elsewhere / "d");
    fs::rename(elsewhere / "d/d", elsewhere / "inner");
    EXPECT_EQ(failureOf([&] { names.merge(rest(*listing)); }), "no failure");
    EXPECT_EQ(names.count(u"d/later"), 1U);
    EXPECT_EQ(names.count(u"file"), 1U);
}

TEST_F(LocalProviderRecursiveListing, EntersWhatIsMountedBelow)
{
    ScopedMount const mount = ScopedMount::fileSystem(folder / "a/b");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    folder.write("a/b/mounted", "");
    EXPECT_EQ(all(), (Names{u"a/", u"a/b/", u"a/b/mounted", u"file"}));
}

TEST_F(LocalProviderRecursiveListing, PassesOverFoldersThatVanish)
{
    for (int const error : {ENOENT, ENOTDIR, ELOOP}) {
        static int answer;
        answer = error;
        ReplacedSystemCalls calls;
        calls->openat = [](int at, char const* path, int flags, mode_t mode) {
            return std::string_view(path) == "b" ? failWith(answer) : realSystemCalls.openat(at, path, flags, mode);
        };
        EXPECT_EQ(allNamesOnly(), (Names{u"a/", u"a/b/", u"file"}));
    }
}

TEST_F(LocalProviderRecursiveListing, FailsAtAFolderThatMayNotBeReadAndGoesOnBehindIt)
{
    fs::create_directory(folder / "a/c");
    folder.write("a/c/file", "");
    ReplacedSystemCalls calls;
    calls->openat = [](int at, char const* path, int flags, mode_t mode) {
        return std::string_view(path) == "b" ? failWith(EACCES) : realSystemCalls.openat(at, path, flags, mode);
    };
    auto const listing = provider.listAllRecursiveNamesOnly(folder.iri());
    Names names;
    std::string failed;
    while (listing->hasEntry()) {
        names.insert(listing->entry().getName());
        std::string const outcome = failureOf([&] { listing->next(); });
        if (outcome != "no failure") {
            failed += outcome;
            listing->next();
        }
    }
    EXPECT_EQ(failed, failure(ErrorCode::PermissionDenied, folder.iri(u"a/b")));
    EXPECT_EQ(names, (Names{u"a", u"a/b", u"a/c", u"a/c/file", u"file"}));
}

TEST_F(LocalProviderRecursiveListing, FailsAtAFolderThatCannotBeReadFurther)
{
    fs::remove(folder / "file");
    static ino_t broken;
    struct stat status;
    ASSERT_EQ(::stat((folder / "a").c_str(), &status), 0);
    broken = status.st_ino;
    ReplacedSystemCalls calls;
    calls->getdents64 = [](int descriptor, void* buffer, std::size_t size) -> ssize_t {
        struct stat opened;
        bool const isBroken = ::fstat(descriptor, &opened) == 0 && opened.st_ino == broken;
        return isBroken ? failWith(EIO) : realSystemCalls.getdents64(descriptor, buffer, size);
    };
    auto const listing = provider.listAllRecursiveNamesOnly(folder.iri());
    EXPECT_EQ(failureOf([&] { listing->next(); }), failure(ErrorCode::IOError, folder.iri(u"a")));
    listing->next();
    EXPECT_FALSE(listing->hasEntry());
}

TEST_F(LocalProviderRecursiveListing, MatchesPatternsBelowWhatDoesNotMatch)
{
    EXPECT_EQ(rest(*provider.listAllRecursive(folder.iri(), u"f*")), (Names{u"a/b/file", u"file"}));
    EXPECT_EQ(rest(*provider.listAllRecursiveNamesOnly(folder.iri(), u"b")), (Names{u"a/b/"}));
}

TEST_F(LocalProviderRecursiveListing, GetsAlongWithoutTypesOfEntries)
{
    ReplacedSystemCalls calls;
    calls->getdents64 = [](int descriptor, void* buffer, std::size_t size) {
        ssize_t const count = realSystemCalls.getdents64(descriptor, buffer, size);
        for (ssize_t i = 0; i < count;) {
            auto* const entry = reinterpret_cast<dirent64*>(static_cast<char*>(buffer) + i);
            entry->d_type = DT_UNKNOWN;
            i += entry->d_reclen;
        }
        return count;
    };
    fs::create_directory_symlink("..", folder / "a/link");
    Names expected = content;
    expected.insert(u"a/link/");
    EXPECT_EQ(all(), expected);
    EXPECT_EQ(allNamesOnly(), expected);
}

} // namespace
} // namespace foundation::storage::local
