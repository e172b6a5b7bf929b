#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <array>
#include <boost/property_tree/ptree.hpp>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <functional>
#include <grp.h>
#include <stdexcept>
#include <string>
#include <sys/wait.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::TemporaryFolder;

constexpr uid_t nobody = 65534;

void becomeNobody()
{
    if (::geteuid() != 0)
        return;
    if (::setgroups(0, nullptr) != 0 || ::setresgid(nobody, nobody, nobody) != 0 ||
        ::setresuid(nobody, nobody, nobody) != 0)
        throw std::runtime_error("cannot become nobody");
}

[[noreturn]] void answer(int pipe, std::function<std::string()> const& question)
{
    std::string text;
    try {
        becomeNobody();
        text = question();
    } catch (std::exception const& error) {
        text = error.what();
    }
    ssize_t const written = ::write(pipe, text.data(), text.size());
    ::_exit(written == static_cast<ssize_t>(text.size()) ? EXIT_SUCCESS : EXIT_FAILURE);
}

/// What a question answers to a user whom permissions bind, in another process: nobody where this user is root.
std::string askedByNobody(std::function<std::string()> const& question)
{
    std::array<int, 2> pipe;
    if (::pipe(pipe.data()) != 0)
        throw std::runtime_error("no pipe");
    pid_t const child = ::fork();
    if (child == 0)
        answer(pipe[1], question);
    ::close(pipe[1]);
    std::array<char, 4096> text;
    ssize_t const size = ::read(pipe[0], text.data(), text.size());
    ::close(pipe[0]);
    int status = 0;
    if (child == -1 || ::waitpid(child, &status, 0) != child || status != 0 || size < 0)
        return "the other process failed";
    return std::string(text.data(), static_cast<std::size_t>(size));
}

/// Folders and files that deny each permission in turn, and an open one in which everybody may do anything.
class LocalProviderPermissions : public testing::Test
{
protected:
    LocalProviderPermissions()
    {
        fs::permissions(folder.path(), fs::perms(0755));
        make("open");
        make("closed");
        make("unwritable");
        make("unsearchable");
        folder.write("unreadable file", "secret");
        folder.write("unwritable file", "content");
        folder.write("writable file", "content");
        fs::permissions(folder / "unreadable file", fs::perms(0));
        fs::permissions(folder / "unwritable file", fs::perms(0444));
        fs::permissions(folder / "writable file", fs::perms(0666));
        fs::create_symlink("closed/file", folder / "link into closed");
        fs::permissions(folder / "open", fs::perms(0777));
        fs::permissions(folder / "unwritable", fs::perms(0555));
        fs::permissions(folder / "unsearchable", fs::perms(0444));
        fs::permissions(folder / "closed", fs::perms(0));
    }

    ~LocalProviderPermissions() override
    {
        for (char const* const name : {"closed", "unwritable", "unsearchable"})
            fs::permissions(folder / name, fs::perms(0755));
    }

    void make(std::string const& name) const
    {
        fs::create_directory(folder / name);
        folder.write(name + "/file", "content");
    }

    StorageIRI at(std::u16string const& name) const { return folder.iri(name); }

    /// Expects that an action of nobody is denied at a location.
    void expectDenied(std::function<void()> const& action, std::u16string const& name) const
    {
        EXPECT_EQ(askedByNobody([&] { return failureOf(action); }), failure(ErrorCode::PermissionDenied, at(name)));
    }

    TemporaryFolder folder;
    LocalProvider const provider;
};

TEST_F(LocalProviderPermissions, AreNeededToKnowWhatExists)
{
    std::u16string const name = u"closed/file";
    expectDenied([&] { provider.fileExists(at(name)); }, name);
    expectDenied([&] { provider.folderExists(at(name)); }, name);
    expectDenied([&] { provider.exists(at(name)); }, name);
    expectDenied([&] { provider.existsExtended(at(name)); }, name);
    expectDenied([&] { provider.existsExtended(at(u"link into closed")); }, u"link into closed");
    expectDenied([&] { provider.getFileAttributes(at(name)); }, name);
    expectDenied([&] { provider.getFolderAttributes(at(name)); }, name);
}

TEST_F(LocalProviderPermissions, OfAStickyFolderKeepFilesOfOthers)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root has another user";
    make("sticky");
    fs::permissions(folder / "sticky", fs::perms(01777));
    std::u16string const name = u"sticky/file";
    expectDenied([&] { provider.moveFile(at(name), at(u"open/new"), ReplacementPolicy::Preserve); }, name);
    expectDenied([&] { provider.moveFile(at(u"open/file"), at(name), ReplacementPolicy::Overwrite); }, name);
}

TEST_F(LocalProviderPermissions, AreNeededToChangeAFolder)
{
    expectDenied([&] { provider.createFile(at(u"unwritable/new")); }, u"unwritable/new");
    expectDenied([&] { provider.createFolder(at(u"unwritable/new")); }, u"unwritable/new");
    expectDenied([&] { provider.removeFile(at(u"unwritable/file")); }, u"unwritable/file");
    expectDenied([&] { provider.removeFolder(at(u"open")); }, u"open");
    expectDenied([&] { provider.openStream(at(u"unwritable/new"), {}); }, u"unwritable/new");
}

TEST_F(LocalProviderPermissions, OfAReadOnlyFileDoNotKeepItsCopyFromHavingAttributes)
{
    if (::setxattr((folder / "unwritable file").c_str(), "user.colour", "red", 3, 0) != 0)
        GTEST_SKIP() << "the folder for temporary files has no extended attributes";
    boost::property_tree::ptree settings;
    settings.put("preserve", "xattrs");
    LocalProvider keeping;
    keeping.configure(settings);
    EXPECT_EQ(askedByNobody([&] {
                  keeping.copyFileAtomic(at(u"unwritable file"), at(u"open/copy"), ReplacementPolicy::Preserve, {});
                  return std::string("done");
              }),
              "done");
    std::array<char, 8> value;
    EXPECT_EQ(::getxattr((folder / "open/copy").c_str(), "user.colour", value.data(), value.size()), 3);
    EXPECT_EQ(fs::status(folder / "open/copy").permissions(), fs::perms(0444));
}

/// All of it waits for the disk, for which such a folder cannot be opened.
TEST_F(LocalProviderPermissions, ToWriteToAFolderAreEnoughWithoutThoseToReadIt)
{
    fs::permissions(folder / "open", fs::perms(0333));
    folder.write("open/unreadable", "secret");
    fs::permissions(folder / "open/unreadable", fs::perms(0));
    make("writable");
    fs::permissions(folder / "writable", fs::perms(0777));
    fs::create_symlink("nothing", folder / "writable/link");
    auto const doneByNobody = [&](std::function<void()> const& action) {
        return askedByNobody([&] { return failureOf(action); });
    };
    std::string const done = "no failure";
    EXPECT_EQ(doneByNobody([&] {
                  auto const stream = provider.openTransactionalStream(at(u"open/new"), {});
                  stream->close(StreamClosePolicy::Commit);
              }),
              done);
    EXPECT_EQ(doneByNobody([&] { provider.createFolder(at(u"open/folder")); }), done);
    auto const move = [&](std::u16string const& from, std::u16string const& to) {
        return doneByNobody([&] { provider.moveFile(at(from), at(to), ReplacementPolicy::Preserve); });
    };
    EXPECT_EQ(move(u"writable/file", u"open/moved"), done);
    EXPECT_EQ(move(u"open/moved", u"writable/back"), done);
    EXPECT_EQ(move(u"writable/link", u"open/link"), done);
    EXPECT_EQ(move(u"open/unreadable", u"open/renamed"), done);
    for (char const* const name : {"open/new", "open/folder", "writable/back", "open/renamed"})
        EXPECT_TRUE(fs::exists(folder / name)) << name;
    EXPECT_TRUE(fs::is_symlink(folder / "open/link"));
}

TEST_F(LocalProviderPermissions, AreNeededToOpenAFile)
{
    expectDenied([&] { provider.openReadOnlyStream(at(u"unreadable file")); }, u"unreadable file");
    expectDenied([&] { provider.openStream(at(u"unwritable file"), {}); }, u"unwritable file");
    expectDenied([&] { provider.openReadOnlyStream(at(u"closed/file")); }, u"closed/file");
    EXPECT_EQ(folder.read("unwritable file"), "content");
}

TEST_F(LocalProviderPermissions, AreNeededToMoveAwayAndToMoveHere)
{
    for (ReplacementPolicy const policy : {ReplacementPolicy::Preserve, ReplacementPolicy::Overwrite}) {
        expectDenied([&] { provider.moveFile(at(u"unwritable/file"), at(u"open/new"), policy); }, u"unwritable/file");
        expectDenied([&] { provider.moveFile(at(u"open/file"), at(u"unwritable/new"), policy); }, u"unwritable/new");
        expectDenied([&] { provider.moveFile(at(u"closed/file"), at(u"open/new"), policy); }, u"closed/file");
    }
    EXPECT_EQ(folder.read("open/file"), "content");
    EXPECT_EQ(folder.read("unwritable/file"), "content");
}

TEST_F(LocalProviderPermissions, AreNeededToList)
{
    expectDenied([&] { provider.listAll(at(u"closed")); }, u"closed");
    expectDenied([&] { provider.listAllNamesOnly(at(u"closed")); }, u"closed");
}

TEST_F(LocalProviderPermissions, AreNeededToListAttributesButNotNames)
{
    expectDenied([&] { provider.listAll(at(u"unsearchable")); }, u"unsearchable/file");
    EXPECT_EQ(askedByNobody([&] {
                  std::u16string const name = provider.listAllNamesOnly(at(u"unsearchable"))->entry().getName();
                  return std::string(name.begin(), name.end());
              }),
              "file");
}

TEST_F(LocalProviderPermissions, AreWhatIsWritableSays)
{
    auto const isWritable = [&](char16_t const* name) {
        return askedByNobody(
            [&] { return provider.getFileAttributes(at(name)).isWritable() ? "writable" : "not writable"; });
    };
    EXPECT_EQ(isWritable(u"writable file"), "writable");
    EXPECT_EQ(isWritable(u"unwritable file"), "not writable");
    EXPECT_EQ(isWritable(u"unwritable/file"), "not writable");
    EXPECT_EQ(askedByNobody([&] {
                  std::string answers;
                  auto const listing = provider.listFolders(folder.iri());
                  for (FolderEntry const& entry : entries(*listing))
                      if (entry.getName() == u"open" || entry.getName() == u"unwritable")
                          answers += entry.getFolderAttributes()->isWritable() == (entry.getName() == u"open")
                                         ? "right "
                                         : "wrong ";
                  return answers;
              }),
              "right right ");
}

} // namespace
} // namespace foundation::storage::local
