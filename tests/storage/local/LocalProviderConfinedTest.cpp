#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ChangeEventExceptions.hpp>
#include <tests/support/ScopedMount.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <boost/date_time/posix_time/posix_time.hpp>
#include <filesystem>
#include <functional>
#include <iterator>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::ScopedMount;
using tests::support::TemporaryFolder;

/// What is done to a location, which needs another one that works.
struct Operation
{
    char const* name;
    std::function<void(LocalProvider const&, StorageIRI const& location, StorageIRI const& sound)> run;
};

constexpr auto preserve = ReplacementPolicy::Preserve;
constexpr auto overwrite = ReplacementPolicy::Overwrite;
constexpr ByteStreamOpenOptions creating{.access = ByteStreamAccess::ReadWrite};

void ignoreEvent(events::Kind const&, StorageIRI const&, StorageIRI const&, events::EntryType const&,
                 boost::property_tree::ptree)
{}

std::vector<Operation> const operations{
    {"createFile", [](auto& provider, auto& iri, auto&) { provider.createFile(iri); }},
    {"createFolder", [](auto& provider, auto& iri, auto&) { provider.createFolder(iri); }},
    {"createFolderRecursive", [](auto& provider, auto& iri, auto&) { provider.createFolderRecursive(iri); }},
    {"fileExists", [](auto& provider, auto& iri, auto&) { provider.fileExists(iri); }},
    {"folderExists", [](auto& provider, auto& iri, auto&) { provider.folderExists(iri); }},
    {"exists", [](auto& provider, auto& iri, auto&) { provider.exists(iri); }},
    {"existsExtended", [](auto& provider, auto& iri, auto&) { provider.existsExtended(iri); }},
    {"removeFile", [](auto& provider, auto& iri, auto&) { provider.removeFile(iri); }},
    {"removeFolder", [](auto& provider, auto& iri, auto&) { provider.removeFolder(iri); }},
    {"removeFolderRecursively", [](auto& provider, auto& iri, auto&) { provider.removeFolderRecursively(iri); }},
    {"moveFile from", [](auto& provider, auto& iri, auto& sound) { provider.moveFile(iri, sound, overwrite); }},
    {"moveFile to", [](auto& provider, auto& iri, auto& sound) { provider.moveFile(sound, iri, overwrite); }},
    {"moveFolder from", [](auto& provider, auto& iri, auto& sound) { provider.moveFolder(iri, sound, preserve); }},
    {"moveFolder to", [](auto& provider, auto& iri, auto& sound) { provider.moveFolder(sound, iri, preserve); }},
    {"copyFile from", [](auto& provider, auto& iri, auto& sound) { provider.copyFile(iri, sound, overwrite); }},
    {"copyFile to", [](auto& provider, auto& iri, auto& sound) { provider.copyFile(sound, iri, overwrite); }},
    {"copyFileAtomic from",
     [](auto& provider, auto& iri, auto& sound) { provider.copyFileAtomic(iri, sound, overwrite, {}); }},
    {"copyFileAtomic to",
     [](auto& provider, auto& iri, auto& sound) { provider.copyFileAtomic(sound, iri, overwrite, {}); }},
    {"getFileAttributes", [](auto& provider, auto& iri, auto&) { provider.getFileAttributes(iri); }},
    {"getFolderAttributes", [](auto& provider, auto& iri, auto&) { provider.getFolderAttributes(iri); }},
    {"getExtendedAttributes", [](auto& provider, auto& iri, auto&) { provider.getExtendedAttributes(iri); }},
    {"setLastModified",
     [](auto& provider, auto& iri, auto&) {
         provider.setLastModified(iri, boost::posix_time::ptime(boost::gregorian::date(2001, 2, 3)));
     }},
    {"setWritable", [](auto& provider, auto& iri, auto&) { provider.setWritable(iri, false); }},
    {"openStream", [](auto& provider, auto& iri, auto&) { provider.openStream(iri, creating); }},
    {"openReadOnlyStream", [](auto& provider, auto& iri, auto&) { provider.openReadOnlyStream(iri); }},
    {"openTransactionalStream",
     [](auto& provider, auto& iri, auto&) {
         provider.openTransactionalStream(iri, creating)->close(StreamClosePolicy::Commit);
     }},
    {"listAll", [](auto& provider, auto& iri, auto&) { provider.listAll(iri); }},
    {"listFiles", [](auto& provider, auto& iri, auto&) { provider.listFiles(iri); }},
    {"listFolders", [](auto& provider, auto& iri, auto&) { provider.listFolders(iri); }},
    {"listAllNamesOnly", [](auto& provider, auto& iri, auto&) { provider.listAllNamesOnly(iri); }},
    {"listFilesNamesOnly", [](auto& provider, auto& iri, auto&) { provider.listFilesNamesOnly(iri); }},
    {"listFoldersNamesOnly", [](auto& provider, auto& iri, auto&) { provider.listFoldersNamesOnly(iri); }},
    {"listAllRecursive", [](auto& provider, auto& iri, auto&) { provider.listAllRecursive(iri); }},
    {"listAllRecursiveNamesOnly", [](auto& provider, auto& iri, auto&) { provider.listAllRecursiveNamesOnly(iri); }},
    {"listAll by pattern", [](auto& provider, auto& iri, auto&) { provider.listAll(iri, u"*"); }},
    {"listAllRecursive by pattern", [](auto& provider, auto& iri, auto&) { provider.listAllRecursive(iri, u"*"); }},
};

/// A folder "root" that the provider is confined to, beside "outside" and "rooted", and links in it that lead out.
class LocalProviderConfined : public testing::Test
{
protected:
    LocalProviderConfined()
    {
        for (char const* const name : {"root/folder/inner", "outside/folder/inner", "rooted/folder"})
            fs::create_directories(folder / name);
        for (char const* const name : {"root/file", "root/folder/file", "outside/file", "outside/folder/file",
                                       "rooted/file", "rooted/folder/file"})
            folder.write(name, name);
        fs::create_directory_symlink("folder", folder / "root/within");
        fs::create_directory_symlink("folder/../folder", folder / "root/roundabout");
        fs::create_directory_symlink(folder / "outside", folder / "root/absolute");
        fs::create_directory_symlink(folder / "root/folder", folder / "root/absolute to within");
        fs::create_directory_symlink("../outside", folder / "root/up");
        fs::create_directory_symlink("/", folder / "root/all");
        confine();
    }

    void confine()
    {
        boost::property_tree::ptree settings;
        settings.put("root", (folder / "root").native());
        provider.configure(settings);
    }

    StorageIRI at(std::u16string const& name) const { return folder.iri(name); }

    /// All content that is not the provider's business, by path, with the times of the files.
    std::map<std::string, std::string> outside() const
    {
        std::map<std::string, std::string> found;
        for (char const* const top : {"outside", "rooted"}) {
            for (auto const& entry : fs::recursive_directory_iterator(folder / top)) {
                std::string const name = entry.path().lexically_relative(folder.path());
                auto const time = entry.last_write_time().time_since_epoch().count();
                found[name] = std::to_string(time) + ' ' + std::to_string(int(entry.status().permissions())) +
                              (entry.is_regular_file() ? ' ' + folder.read(name) : "");
            }
        }
        return found;
    }

    /// What an operation fails with at a location; nothing where it succeeds.
    std::optional<ErrorCode> codeOf(Operation const& operation, StorageIRI const& location) const
    {
        try {
            operation.run(provider, location, at(u"root/file"));
        } catch (Exception const& error) {
            return error.getErrorCode();
        }
        return std::nullopt;
    }

    void expectRefused(std::vector<std::u16string> const& places) const
    {
        auto const before = outside();
        for (std::u16string const& place : places) {
            for (Operation const& operation : operations) {
                for (auto const* const name : {u"/file", u"/folder", u"/new", u"/folder/inner"})
                    EXPECT_EQ(codeOf(operation, at(place + name)), ErrorCode::PermissionDenied)
                        << operation.name << ' ' << at(place + name);
            }
        }
        EXPECT_EQ(outside(), before);
        EXPECT_EQ(folder.read("root/file"), "root/file");
    }

    TemporaryFolder folder;
    LocalProvider provider;
};

TEST_F(LocalProviderConfined, DoesEverythingInside)
{
    for (auto const* const place : {u"root/folder", u"root/within", u"root/roundabout", u"root/folder/../folder"}) {
        StorageIRI const file = at(std::u16string(place) + u"/made");
        provider.createFile(file);
        provider.openStream(file, {.access = ByteStreamAccess::WriteOnly})->write("content", 7);
        EXPECT_EQ(provider.getFileAttributes(file).getSize(), 7U);
        EXPECT_TRUE(provider.getFileAttributes(file).isWritable());
        provider.copyFile(file, at(u"root/copy"), preserve);
        provider.removeFile(file);
        provider.moveFile(at(u"root/copy"), file, preserve);
        auto const stream = provider.openTransactionalStream(file, {});
        stream->write("replaced", 8);
        stream->close(StreamClosePolicy::Commit);
        EXPECT_EQ(folder.read("root/folder/made"), "replaced");
        StorageIRI const inner = at(std::u16string(place) + u"/a/b");
        provider.createFolderRecursive(inner);
        provider.moveFolder(inner, at(u"root/moved"), preserve);
        provider.removeFolder(at(u"root/moved"));
        provider.removeFile(file);
        provider.removeFolderRecursively(at(std::u16string(place) + u"/a"));
        EXPECT_EQ(std::distance(fs::directory_iterator(folder / "root/folder"), {}), 2);
    }
}

TEST_F(LocalProviderConfined, RefusesWhatLiesOutside)
{
    expectRefused({u"outside", u"rooted", u"root/../outside", u"root/folder/../../outside"});
}

/// Some paths are refused for what they are, before anybody asks whether they lead out.
ErrorCode expectedAbove(Operation const& operation, StorageIRI const& above)
{
    bool const endsInDots = above.getName() == u"..";
    std::string const name = operation.name;
    if (endsInDots ? name == "removeFolderRecursively" : name == "moveFolder from")
        return ErrorCode::InvalidLocation;
    bool const isFolderInPlaceOfAFile = endsInDots && name == "openTransactionalStream";
    return isFolderInPlaceOfAFile ? ErrorCode::ResourceAlreadyExists : ErrorCode::PermissionDenied;
}

TEST_F(LocalProviderConfined, RefusesAllAboveTheRoot)
{
    auto const before = outside();
    for (StorageIRI const& above : {folder.iri(), StorageIRI(u"file:///"), at(u"root/..")}) {
        for (Operation const& operation : operations) {
            EXPECT_EQ(codeOf(operation, above), expectedAbove(operation, above)) << operation.name << ' ' << above;
        }
    }
    EXPECT_EQ(outside(), before);
    EXPECT_EQ(folder.read("root/folder/file"), "root/folder/file");
}

TEST_F(LocalProviderConfined, RefusesLinksThatLeadOut)
{
    expectRefused({u"root/absolute", u"root/absolute to within", u"root/up", u"root/within/../up", u"root/all"});
}

/// Why there are no events for a location.
template <typename Subscribe>
std::string refusalOf(Subscribe const& subscribe)
{
    try {
        return failureOf(subscribe);
    } catch (ChangeEventsSubscriptionException const&) {
        return "no subscription";
    }
}

TEST_F(LocalProviderConfined, SubscribesToNothingOutside)
{
    auto const refusalsOf = [&](std::u16string const& name) {
        StorageIRI const file = at(name + u"/file");
        return std::pair(refusalOf([&] { provider.publishFolderEventsFor(at(name), &ignoreEvent, {}); }),
                         refusalOf([&] { provider.publishFileEventsFor(file, &ignoreEvent, {}); }));
    };
    EXPECT_EQ(refusalsOf(u"root/folder"), std::pair(std::string("no failure"), std::string("no failure")));
    for (std::u16string const name : {u"root/absolute", u"root/up", u"root/../outside"})
        EXPECT_EQ(refusalsOf(name), std::pair(std::string("no subscription"), std::string("no subscription")))
            << at(name);
    EXPECT_EQ(refusalsOf(u"outside"), std::pair(failure(ErrorCode::PermissionDenied, at(u"outside")),
                                                failure(ErrorCode::PermissionDenied, at(u"outside/file"))));
    provider.shutdown();
}

TEST_F(LocalProviderConfined, ListsLinksThatLeadOutAsWhatTheyAre)
{
    std::map<std::u16string, bool> isFile;
    auto const listing = provider.listAllRecursive(at(u"root"));
    for (FolderEntry const& entry : entries(*listing))
        isFile.emplace(entry.getName(), entry.isFile());
    EXPECT_EQ(isFile, (std::map<std::u16string, bool>{{u"absolute", true},
                                                      {u"absolute to within", true},
                                                      {u"all", true},
                                                      {u"file", true},
                                                      {u"folder", false},
                                                      {u"folder/file", true},
                                                      {u"folder/inner", false},
                                                      {u"roundabout", false},
                                                      {u"up", true},
                                                      {u"within", false}}));
}

TEST_F(LocalProviderConfined, MovesAndRemovesLinksThemselves)
{
    auto const before = outside();
    provider.moveFile(at(u"root/absolute"), at(u"root/folder/moved"), preserve);
    EXPECT_TRUE(fs::is_symlink(folder / "root/folder/moved"));
    provider.removeFile(at(u"root/folder/moved"));
    provider.removeFile(at(u"root/up"));
    provider.removeFolderRecursively(at(u"root/folder"));
    EXPECT_EQ(outside(), before);
}

TEST_F(LocalProviderConfined, RemovesNeitherItsRootNorWhatIsInIt)
{
    for (auto const* const root : {u"root", u"root/", u"root//"}) {
        EXPECT_EQ(failureOf([&] { provider.removeFolderRecursively(at(root)); }),
                  failure(ErrorCode::ResourceInUse, at(root)));
        EXPECT_NE(failureOf([&] { provider.removeFolder(at(root)); }), "no failure");
    }
    EXPECT_EQ(folder.read("root/folder/file"), "root/folder/file");
}

TEST_F(LocalProviderConfined, EntersWhatIsMountedInsideByItsPathAndByNoLink)
{
    fs::create_directory(folder / "root/mounted");
    ScopedMount const mount = ScopedMount::fileSystem(folder / "root/mounted");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    confine(); // a folder knows what is mounted where it was opened
    fs::create_directory_symlink("mounted", folder / "root/to mounted");
    folder.write("root/mounted/file", "content");
    EXPECT_TRUE(provider.fileExists(at(u"root/mounted/file")));
    EXPECT_EQ(provider.getFileAttributes(at(u"root/mounted/file")).getSize(), 7U);
    provider.createFile(at(u"root/mounted/made"));
    EXPECT_EQ(failureOf([&] { provider.fileExists(at(u"root/to mounted/file")); }),
              failure(ErrorCode::PermissionDenied, at(u"root/to mounted/file")));
    EXPECT_EQ(failureOf([&] { provider.createFile(at(u"root/to mounted/new")); }),
              failure(ErrorCode::PermissionDenied, at(u"root/to mounted/new")));
    EXPECT_FALSE(fs::exists(folder / "root/mounted/new"));
}

TEST_F(LocalProviderConfined, FollowsLinksInWhatIsMountedInsideThatStayThere)
{
    fs::create_directory(folder / "root/mounted");
    ScopedMount const mount = ScopedMount::fileSystem(folder / "root/mounted");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    fs::create_directories(folder / "root/mounted/a/inner");
    ScopedMount const inner = ScopedMount::fileSystem(folder / "root/mounted/a/inner");
    confine();
    folder.write("root/mounted/a/file", "content");
    folder.write("root/mounted/a/inner/file", "inner content");
    fs::create_symlink("a/file", folder / "root/mounted/link");
    fs::create_directory_symlink("a", folder / "root/mounted/to a");
    fs::create_symlink("file", folder / "root/mounted/a/inner/link");
    fs::create_symlink("../file", folder / "root/mounted/out");
    fs::create_symlink("/etc/passwd", folder / "root/mounted/absolute");
    fs::create_directory_symlink("a/inner", folder / "root/mounted/to inner");
    EXPECT_EQ(provider.getFileAttributes(at(u"root/mounted/link")).getSize(), 7U);
    EXPECT_EQ(provider.getFileAttributes(at(u"root/mounted/to a/file")).getSize(), 7U);
    EXPECT_EQ(provider.getFileAttributes(at(u"root/mounted/a/inner/link")).getSize(), 13U);
    provider.createFile(at(u"root/mounted/to a/made"));
    EXPECT_TRUE(fs::exists(folder / "root/mounted/a/made"));
    for (auto const* const name : {u"root/mounted/out", u"root/mounted/absolute", u"root/mounted/to inner/file",
                                   u"root/mounted/to a/../../file"})
        EXPECT_EQ(failureOf([&] { provider.openReadOnlyStream(at(name)); }),
                  failure(ErrorCode::PermissionDenied, at(name)));
}

TEST_F(LocalProviderConfined, CountsNoSlashTwice)
{
    std::u16string path = at(u"root/file").getPath();
    path.insert(path.rfind(u"/root/"), u"//");
    StorageIRI const file(StorageIRI(u"file:///"), path);
    ASSERT_NE(file.getPath().find(u"///root/"), std::u16string::npos);
    EXPECT_TRUE(provider.fileExists(file));
}

TEST_F(LocalProviderConfined, StaysInAFolderThatIsRenamed)
{
    fs::rename(folder / "root", folder / "elsewhere");
    fs::create_directory_symlink("outside", folder / "root");
    provider.createFile(at(u"root/new"));
    EXPECT_TRUE(fs::exists(folder / "elsewhere/new"));
    EXPECT_FALSE(fs::exists(folder / "outside/new"));
}

} // namespace
} // namespace foundation::storage::local
