#include <tests/tools/storage/ToolTest.hpp>

#include <algorithm>
#include <array>
#include <chrono>
#include <csignal>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <functional>
#include <nlohmann/json.hpp>
#include <optional>
#include <sstream>
#include <thread>
#include <unistd.h>

namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;

/// Runs `watch` in the background, with its output in a file that the test reads meanwhile.
class Watch : public ToolTest
{
protected:
    void SetUp() override { makeFolder("d"); }

    void start(Arguments const& arguments, std::string const& probe = "d/probe")
    {
        Arguments all{"watch"};
        all.insert(all.end(), arguments.begin(), arguments.end());
        ProcessOptions options = inFolder();
        options.output = output.write("output", "");
        process.emplace(command(all), options);
        probe_ = probe;
        awaitProbe();
    }

    /// Makes and removes a new file where it is watched, until that is told: all that happened before is told by then.
    void awaitProbe()
    {
        std::string const probe = probe_ + std::to_string(++probeCount_);
        auto const name = std::filesystem::path(probe).filename().native();
        bool const isSeen = waitFor([&] {
            folder.write(probe, "");
            std::filesystem::remove(folder / probe);
            return output.read("output").find(name) != std::string::npos;
        });
        EXPECT_TRUE(isSeen);
    }

    bool waitFor(std::function<bool()> const& condition)
    {
        auto const deadline = std::chrono::steady_clock::now() + 60s;
        while (!condition()) {
            if (!process->isRunning() || std::chrono::steady_clock::now() > deadline)
                return false;
            std::this_thread::yield();
        }
        return true;
    }

    /// What was printed, without what tells of the probe.
    Lines printed() const
    {
        Lines lines;
        std::istringstream text(output.read("output"));
        for (std::string line; std::getline(text, line);) {
            if (line.find("probe") == std::string::npos)
                lines.push_back(line);
        }
        return lines;
    }

    /// What happened until now.
    Lines told()
    {
        awaitProbe();
        return printed();
    }

    /// How the command ends when it is told to, or by itself.
    ProgramResult finish(std::optional<int> signal = std::nullopt)
    {
        if (signal)
            process->send(*signal);
        return process->finish();
    }

    void rename(std::string const& from, std::string const& to) const
    {
        std::filesystem::rename(folder / from, folder / to);
    }

    void remove(std::string const& name) const { std::filesystem::remove(folder / name); }

    foundation::tests::support::TemporaryFolder output;
    std::optional<Process> process;

private:
    std::string probe_;
    int probeCount_ = 0;
};

TEST_F(Watch, PrintsALineForEachEvent)
{
    start({"d"});
    folder.write("d/a", "");
    rename("d/a", "d/b");
    std::filesystem::permissions(folder / "d/b", std::filesystem::perms::owner_read);
    remove("d/b");
    EXPECT_EQ(told(), (Lines{"created     d/a", "moved       d/a -> d/b", "attributes  d/b", "removed     d/b"}));
}

TEST_F(Watch, EndsWhenItIsInterrupted)
{
    for (int const signal : {SIGINT, SIGTERM}) {
        start({"d"});
        ProgramResult const result = finish(signal);
        EXPECT_EQ(result.status, 128 + signal);
        EXPECT_EQ(result.errors, "storage: watch: interrupted\n");
    }
}

TEST_F(Watch, PrintsObjects)
{
    start({"--json", "d"});
    folder.write("d/\xff", "");
    rename("d/\xff", "d/b");
    Lines const lines = told();
    ASSERT_EQ(lines.size(), 2U);
    std::string const base = "file://" + (folder / "d").native();
    EXPECT_EQ(nlohmann::json::parse(lines[0]),
              (nlohmann::json{{"kind", "created"}, {"location", base + "/%EE%BF%BF"}, {"type", "file"}}));
    EXPECT_EQ(
        nlohmann::json::parse(lines[1]),
        (nlohmann::json{{"kind", "moved"}, {"location", base + "/%EE%BF%BF"}, {"to", base + "/b"}, {"type", "file"}}));
}

TEST_F(Watch, TellsTheTime)
{
    start({"--time", "d"});
    makeFolder("d/a");
    Lines const lines = told();
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].find("Z  created     d/a"), std::string("2024-02-29T12:34:56.123456").size()) << lines[0];
}

TEST_F(Watch, TellsOfTheKindsAskedForAlone)
{
    start({"-k", "created", "-k", "removed", "d"});
    folder.write("d/a", "content");
    rename("d/a", "d/b");
    remove("d/b");
    EXPECT_EQ(told(), (Lines{"created     d/a", "removed     d/b"}));
}

TEST_F(Watch, EndsAfterAsManyEventsAsAskedFor)
{
    start({"-k", "created", "-c", "3", "d", "."}, "d/other");
    while (process->isRunning()) {
        folder.write("d/more", "");
        remove("d/more");
    }
    ProgramResult const result = finish();
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.errors, "");
    EXPECT_EQ(printed().size(), 3U);
}

TEST_F(Watch, WatchesSingleFiles)
{
    folder.write("d/a", "");
    folder.write("d/b", "");
    makeFolder("other");
    start({"-k", "removed", "-k", "created", "d/a", "other"}, "other/probe");
    remove("d/b");
    remove("d/a");
    folder.write("d/a", "");
    EXPECT_EQ(told(), (Lines{"removed     d/a", "created     d/a"}));
}

TEST_F(Watch, TellsOnceWhatIsWatchedTwice)
{
    makeFolder("d/sub");
    folder.write("d/a", "");
    start({"-k", "removed", "-k", "moved", "-k", "created", "d", "d/sub", "d/a", "d"});
    rename("d/a", "d/sub/a");
    folder.write("d/a", "");
    remove("d/a");
    EXPECT_EQ(told(), (Lines{"moved       d/a -> d/sub/a", "created     d/a", "removed     d/a"}));
}

TEST_F(Watch, LeavesOutScratchFiles)
{
    constexpr char const* scratch = "d/01234567-89ab-4def-8123-456789abcdef.tmp.bak";
    start({"d"});
    folder.write(scratch, "content");
    rename(scratch, "d/target");
    rename("d/target", scratch);
    remove(scratch);
    EXPECT_EQ(told(), (Lines{"created     d/target", "removed     d/target"}));
}

TEST_F(Watch, TellsOfScratchFilesWhenAsked)
{
    std::string const scratch = "d/01234567-89ab-4def-8123-456789abcdef.tmp.bak";
    start({"--all", "d"});
    folder.write(scratch, "");
    rename(scratch, "d/target");
    EXPECT_EQ(told(), (Lines{"created     " + scratch, "moved       " + scratch + " -> d/target"}));
}

TEST_F(Watch, TellsOfAFileThatTheToolPutsThere)
{
    folder.write("source", "content");
    start({"-k", "created", "-k", "moved", "-k", "removed", "d"});
    runWell({"cp", "source", "d/target"});
    EXPECT_EQ(told(), Lines{"created     d/target"});
}

TEST_F(Watch, LeavesOutWhatLiesDeeper)
{
    makeFolder("d/sub");
    start({"d"});
    folder.write("d/sub/a", "");
    EXPECT_EQ(told(), Lines());
}

TEST_F(Watch, TellsOfFoldersBelow)
{
    makeFolder("d/sub/deep");
    makeFolder("d/other");
    start({"-r", "d"}, "d/sub/deep/probe");
    awaitProbe();
    folder.write("d/a", "");
    folder.write("d/sub/b", "");
    rename("d/sub/b", "d/other/b");
    remove("d/sub/deep/none");
    EXPECT_EQ(told(), (Lines{"created     d/a", "created     d/sub/b", "moved       d/sub/b -> d/other/b"}));
}

TEST_F(Watch, TellsOfWhatLiesInNewFoldersOnce)
{
    start({"-r", "-k", "created", "-k", "removed", "d"});
    makeFolder("d/new/inner");
    folder.write("d/new/a", "");
    folder.write("d/new/inner/b", "");
    Lines const expected{"created     d/new", "created     d/new/a", "created     d/new/inner",
                         "created     d/new/inner/b"};
    auto const sorted = [&] {
        Lines lines = told();
        std::sort(lines.begin(), lines.end());
        return lines;
    };
    EXPECT_TRUE(waitFor([&] { return sorted() == expected; })) << ::testing::PrintToString(sorted());
    folder.write("d/new/inner/c", "");
    EXPECT_TRUE(waitFor([&] { return told().back() == "created     d/new/inner/c"; }));
}

TEST_F(Watch, TellsOfWhatComesWithAFolderThatIsMovedIn)
{
    makeFolder("outside/inner");
    folder.write("outside/inner/a", "");
    start({"-r", "d"});
    rename("outside", "d/in");
    EXPECT_EQ(told(), (Lines{"created     d/in", "created     d/in/inner", "created     d/in/inner/a"}));
    remove("d/in/inner/a");
    EXPECT_EQ(told().back(), "removed     d/in/inner/a");
}

TEST_F(Watch, FollowsFoldersThatAreMoved)
{
    makeFolder("d/a/b");
    start({"-r", "d"}, "d/a/b/probe");
    rename("d/a", "d/c");
    EXPECT_TRUE(waitFor([&] { return !printed().empty(); }));
    ASSERT_EQ(printed(), Lines{"moved       d/a -> d/c"});
    EXPECT_TRUE(waitFor([&] {
        folder.write("d/c/b/new", "");
        remove("d/c/b/new");
        return printed().size() > 1;
    }));
    EXPECT_EQ(printed()[1], "created     d/c/b/new");
}

TEST_F(Watch, ForgetsFoldersThatAreMovedAway)
{
    makeFolder("d/a/b");
    makeFolder("elsewhere");
    start({"-r", "-k", "removed", "-k", "created", "d"}, "d/probe");
    rename("d/a", "elsewhere/a");
    EXPECT_EQ(told(), Lines{"removed     d/a"});
    folder.write("elsewhere/a/b/file", "");
    makeFolder("d/a");
    EXPECT_EQ(told(), (Lines{"removed     d/a", "created     d/a"}));
}

TEST_F(Watch, DoesNotFollowLinks)
{
    makeFolder("outside");
    makeLink("../outside", "d/before");
    start({"-r", "d"});
    makeLink("../outside", "d/link");
    folder.write("outside/a", "");
    EXPECT_EQ(told(), Lines{"created     d/link"});
}

TEST_F(Watch, EndsWithTheFoldersThatItWatches)
{
    start({"d"});
    remove("d");
    ProgramResult const result = finish();
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: watch: d: no longer watched, because the folder has gone\n");
    EXPECT_EQ(printed(), Lines{"removed     d"});
}

TEST_F(Watch, GoesOnWithTheOthers)
{
    makeFolder("e");
    start({"e", "d"});
    remove("e");
    EXPECT_EQ(told(), Lines{"removed     e"});
    EXPECT_EQ(finish(SIGTERM).errors, "storage: watch: e: no longer watched, because the folder has gone\n"
                                      "storage: watch: interrupted\n");
}

TEST_F(Watch, RefusesWhatIsNotThere)
{
    runFailing({"watch", "missing"}, "storage: watch: missing: no such file or folder\n");
    EXPECT_EQ(run({"watch"}).status, 2);
}

TEST_F(Watch, WatchesTheRestWhenSomethingIsNotThere)
{
    start({"missing", "d"});
    ProgramResult const result = finish(SIGTERM);
    EXPECT_EQ(result.errors, "storage: watch: missing: no such file or folder\nstorage: watch: interrupted\n");
}

TEST_F(Watch, RefusesAFolderThatMayNotBeRead)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "the tool cannot be run by another user";
    std::filesystem::permissions(folder / "d", std::filesystem::perms::none);
    ProgramResult const result = runUnprivileged({"watch", "d"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: watch: d: cannot be watched (it may not be read, or the system is out of "
                             "watches)\n");
}

TEST_F(Watch, EndsWhenNobodyReadsTheOutput)
{
    makePipe("pipe");
    ProcessOptions options = inFolder();
    options.output = folder / "pipe";
    int const reader = ::open(options.output.c_str(), O_RDWR | O_CLOEXEC);
    process.emplace(command({"watch", "d"}), options);
    char byte = 0;
    ::fcntl(reader, F_SETFL, O_NONBLOCK);
    EXPECT_TRUE(waitFor([&] {
        folder.write("d/a", "");
        return ::read(reader, &byte, 1) == 1;
    }));
    ::close(reader);
    EXPECT_EQ(finish().status, 128 + SIGPIPE);
}

/// As much as the queues of the tool, of the store and of the kernel hold, while nobody reads what is printed.
TEST_F(Watch, SaysThatChangesWereMissedAndFindsFoldersThatCameMeanwhile)
{
    int limit = 0;
    std::ifstream("/proc/sys/fs/inotify/max_queued_events") >> limit;
    if (limit <= 0 || limit > 20'000)
        GTEST_SKIP() << "the queue is too long to be filled";
    makePipe("pipe");
    ProcessOptions options = inFolder();
    options.output = folder / "pipe";
    int const reader = ::open(options.output.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK);
    process.emplace(command({"watch", "-r", "d"}), options);
    std::string text;
    auto const readAll = [&] {
        std::array<char, 65536> buffer{};
        for (ssize_t count = 1; count > 0;
             text.append(buffer.data(), static_cast<std::size_t>(std::max(count, ssize_t{}))))
            count = ::read(reader, buffer.data(), buffer.size());
    };
    ASSERT_TRUE(waitFor([&] {
        folder.write("d/a", "");
        readAll();
        return !text.empty();
    }));
    for (int round = 0; round < 20'000; ++round) {
        rename("d/a", "d/b");
        rename("d/b", "d/a");
    }
    makeFolder("d/late");
    EXPECT_TRUE(waitFor([&] {
        folder.write("d/late/file", "");
        readAll();
        return text.find("d/late/file") != std::string::npos;
    }));
    ProgramResult const result = finish(SIGTERM);
    EXPECT_NE(result.errors.find("storage: watch: d: changes were missed, because too many came at once\n"),
              std::string::npos);
    ::close(reader);
}

TEST_F(Watch, EscapesNamesOnATerminal)
{
    ProcessOptions options = inFolder();
    options.onTerminal = true;
    process.emplace(command({"watch", "-k", "created", "-c", "1", "d"}), options);
    while (process->isRunning()) {
        folder.write("d/a\033b", "");
        remove("d/a\033b");
    }
    EXPECT_EQ(finish().output, "created     d/a\\033b\r\n");
}

} // namespace
