#include <tools/storage/Session.hpp>

#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/storage/local/namelessFiles.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>

#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <mutex>
#include <string>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace foundation::storage::tool {
namespace {

namespace fs = std::filesystem;
using local::detail::realSystemCalls;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;
using Told = std::vector<std::string>;

std::string shown(std::string const& path)
{
    std::string const name = fs::path(path).filename();
    return name.ends_with(".tmp.bak") ? "scratch" : name;
}

bool isFolder(int descriptor)
{
    struct stat status
    {};
    return ::fstat(descriptor, &status) == 0 && S_ISDIR(status.st_mode);
}

/// Runs commands in this process, and keeps what they sync, link, rename and remove on the disk, in order.
class SyncedCommands : public testing::Test
{
protected:
    SyncedCommands()
    {
        told.clear();
        foldersFail = false;
        calls->fsync = [](int descriptor) {
            tell("sync " + shown(fs::read_symlink("/proc/self/fd/" + std::to_string(descriptor))));
            return foldersFail && isFolder(descriptor) ? failWith(EIO) : realSystemCalls.fsync(descriptor);
        };
        calls->renameat2 = [](int from, char const* name, int to, char const* newName, unsigned flags) {
            tell("rename " + shown(name) + " to " + shown(newName));
            return realSystemCalls.renameat2(from, name, to, newName, flags);
        };
        calls->linkat = [](int from, char const* name, int to, char const* newName, int flags) {
            int const result = realSystemCalls.linkat(from, name, to, newName, flags);
            if (result == 0)
                tell("link to " + shown(newName));
            return result;
        };
        calls->unlinkat = [](int at, char const* path, int flags) {
            tell("remove " + shown(path));
            return realSystemCalls.unlinkat(at, path, flags);
        };
    }

    void run(std::string const& name, std::vector<std::string> arguments)
    {
        auto const all = commands();
        auto const command =
            std::find_if(all.begin(), all.end(), [&](Command const& each) { return each.name == name; });
        CLI::App app;
        Action const action = command->define(app);
        std::reverse(arguments.begin(), arguments.end());
        app.parse(arguments);
        action(session);
    }

    /// With this on standard input.
    void put(std::string const& content, std::vector<std::string> const& arguments)
    {
        TemporaryFolder const other;
        int const before = ::dup(STDIN_FILENO);
        int const input = ::open(other.write("input", content).c_str(), O_RDONLY | O_CLOEXEC);
        ::dup2(input, STDIN_FILENO);
        ::close(input);
        try {
            run("put", arguments);
        } catch (Failure const& failure) {
            reason = failure.reason;
        }
        ::dup2(before, STDIN_FILENO);
        ::close(before);
    }

    std::string path(std::string const& name) const { return folder / name; }
    std::string folderName() const { return folder.path().filename(); }
    auto entryCount() const { return std::distance(fs::directory_iterator(folder.path()), {}); }

    static inline Told told;
    static inline bool foldersFail = false;

    TemporaryFolder const folder;
    Session session{"test"};
    std::string reason; ///< why `put` failed
    ReplacedSystemCalls calls;

private:
    static void tell(std::string what)
    {
        static std::mutex mutex;
        std::lock_guard const lock(mutex);
        told.push_back(std::move(what));
    }
};

TEST_F(SyncedCommands, CopyWithoutWaitingUnlessTold)
{
    folder.write("a", "content");
    run("cp", {path("a"), path("b")});
    bool const isNameless = tests::support::hasNamelessFiles(folder.path());
    EXPECT_EQ(told, Told{isNameless ? "link to b" : "rename scratch to b"});
    told.clear();
    run("cp", {"--replace", path("a"), path("b")});
    EXPECT_EQ(told, Told{"rename scratch to b"});
}

TEST_F(SyncedCommands, CopyLocalFilesOntoTheDisk)
{
    folder.write("a", "content");
    Told const expected{"sync scratch", "rename scratch to b", "sync " + folderName()};
    run("cp", {"--sync", path("a"), path("b")});
    EXPECT_EQ(told, expected);
    told.clear();
    run("cp", {"--sync", "--replace", path("a"), path("b")});
    EXPECT_EQ(told, expected);
}

TEST_F(SyncedCommands, CopyFoldersOntoTheDisk)
{
    fs::create_directory(folder / "d");
    folder.write("d/a", "content");
    run("cp", {"--sync", "-r", path("d"), path("e")});
    EXPECT_EQ(told, (Told{"sync " + folderName(), "sync scratch", "rename scratch to a", "sync e"}));
}

TEST_F(SyncedCommands, PutFilesOntoTheDisk)
{
    Told const expected{"sync scratch", "rename scratch to a", "sync " + folderName()};
    put("content", {"--sync", path("a")});
    EXPECT_EQ(told, expected);
    told.clear();
    put("new", {"--sync", "--replace", path("a")});
    EXPECT_EQ(told, expected);
    EXPECT_EQ(folder.read("a"), "new");
}

TEST_F(SyncedCommands, PutWithoutWaitingUnlessTold)
{
    put("content", {path("a")});
    EXPECT_EQ(told, Told{"rename scratch to a"});
}

/// What is moved to another store lies on the disk before it goes.
TEST_F(SyncedCommands, MoveOntoTheDisk)
{
    auto const source = session.stores().openItem("mem:///a");
    source.openStream({})->write("content", 7);
    run("mv", {"mem:///a", path("a")});
    EXPECT_EQ(told, (Told{"sync scratch", "rename scratch to a", "sync " + folderName()}));
    EXPECT_EQ(folder.read("a"), "content");
    EXPECT_FALSE(source.fileExists());
}

TEST_F(SyncedCommands, KeepTheSourceOfAMoveThatIsNotCertainToLast)
{
    foldersFail = true;
    auto const source = session.stores().openItem("mem:///a");
    source.openStream({})->write("content", 7);
    run("mv", {"mem:///a", path("a")});
    EXPECT_EQ(session.status(), exitFailed);
    EXPECT_TRUE(source.fileExists());
}

TEST_F(SyncedCommands, SayWhatIsInPlaceAndNotCertainToLast)
{
    foldersFail = true;
    for (bool const isReplaced : {false, true}) {
        std::vector<std::string> arguments{"--sync", path("a")};
        if (isReplaced)
            arguments.insert(arguments.begin(), "--replace");
        put(isReplaced ? "new" : "old", arguments);
        EXPECT_EQ(reason, "the new content is in place, but it is not certain to survive a power failure");
        EXPECT_EQ(session.status(), exitFine) << "nothing else is complained about";
        EXPECT_EQ(folder.read("a"), isReplaced ? "new" : "old");
        EXPECT_EQ(entryCount(), 1);
    }
}

} // namespace
} // namespace foundation::storage::tool
