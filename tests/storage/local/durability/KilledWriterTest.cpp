#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/scratchName.hpp>
#include <storage/local/scratchFiles.hpp>
#include <tests/storage/local/durability/SharedMemory.hpp>
#include <tests/storage/local/durability/WrittenContent.hpp>
#include <tests/storage/local/namelessFiles.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <boost/property_tree/ptree.hpp>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <filesystem>
#include <functional>
#include <random>
#include <sched.h>
#include <stdexcept>
#include <string>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using namespace std::chrono_literals;
using tests::support::madeContent;
using tests::support::numberOfContent;
using tests::support::SharedMemory;
using tests::support::TemporaryFolder;

constexpr int kills = 1000;

/// Few bytes at a time, so that writing takes long enough beside a rename that waits for the disk.
constexpr std::size_t pieceLength = 16;

/// What a writer tells.
struct Progress
{
    std::atomic<std::uint64_t> acknowledged; ///< the number of the last content whose commit returned
    std::atomic<bool> hasBegun;
};

/// What a process leaves behind is not a matter of the disk.
void neverSync(LocalProvider& provider)
{
    boost::property_tree::ptree settings;
    settings.put("durability", "none");
    provider.configure(settings);
}

[[noreturn]] void writeForEver(StorageIRI const& file, Progress& progress)
{
    LocalProvider provider;
    neverSync(provider);
    progress.hasBegun = true;
    for (std::uint64_t number = progress.acknowledged.load() + 1;; ++number) {
        std::string const content = madeContent(number);
        auto const stream = provider.openTransactionalStream(file, {});
        for (std::size_t written = 0; written < content.size();) {
            auto const count = static_cast<long>(std::min(pieceLength, content.size() - written));
            written += static_cast<std::size_t>(stream->write(content.data() + written, count));
        }
        stream->close(StreamClosePolicy::Commit);
        progress.acknowledged = number;
    }
}

/// Copies a file to new names, which are numbers.
[[noreturn]] void copyForEver(StorageIRI const& file, StorageIRI const& folder, Progress& progress)
{
    LocalProvider provider;
    neverSync(provider);
    progress.hasBegun = true;
    for (std::uint64_t number = progress.acknowledged.load() + 1;; ++number) {
        std::string const name = std::to_string(number);
        StorageIRI const copy(folder, std::u16string(name.begin(), name.end()));
        provider.copyFileAtomic(file, copy, ReplacementPolicy::Preserve, {});
        progress.acknowledged = number;
    }
}

/// Lets a writer run for a moment from its first write on, however late the system starts it, and kills it.
void killAWriter(std::function<void()> const& writeForEver, Progress& progress, std::chrono::microseconds moment)
{
    progress.hasBegun = false;
    pid_t const writer = ::fork();
    if (writer == 0)
        writeForEver();
    if (writer == -1)
        throw std::runtime_error("no process for the writer");
    while (!progress.hasBegun && ::waitpid(writer, nullptr, WNOHANG) == 0)
        ::sched_yield();
    timespec const wait{.tv_sec = 0, .tv_nsec = std::chrono::nanoseconds(moment).count()};
    ::clock_nanosleep(CLOCK_MONOTONIC, 0, &wait, nullptr);
    ::kill(writer, SIGKILL);
    int status = 0;
    if (::waitpid(writer, &status, 0) != writer || !WIFSIGNALED(status) || WTERMSIG(status) != SIGKILL)
        throw std::runtime_error("the writer ended by itself");
}

TEST(KilledWriter, LeavesOldOrNewContentWholeAndNothingElseButScratchFiles)
{
    TemporaryFolder const folder;
    folder.write("file", madeContent(0));
    SharedMemory<Progress> const shared;
    std::atomic<std::uint64_t>& acknowledged = shared->acknowledged;
    std::minstd_rand random(20240229);
    int interrupted = 0;
    for (int i = 0; i < kills; ++i) {
        killAWriter([&] { writeForEver(folder.iri(u"file"), *shared); }, *shared,
                    std::chrono::microseconds(random() % 3000));
        std::uint64_t const found = numberOfContent(folder.read("file"));
        ASSERT_TRUE(found == acknowledged.load() || found == acknowledged.load() + 1)
            << "found " << found << ", acknowledged " << acknowledged.load();
        acknowledged = found;
        for (fs::directory_entry const& entry : fs::directory_iterator(folder.path())) {
            std::string const name = entry.path().filename();
            if (name == "file")
                continue;
            ASSERT_TRUE(detail::isScratchName(name)) << name;
            ++interrupted;
            EXPECT_EQ(removeAbandonedScratchFile(folder.iri(std::u16string(name.begin(), name.end())), 0s),
                      ScratchFileState::Abandoned);
            EXPECT_FALSE(fs::exists(entry.path()));
        }
    }
    EXPECT_GT(acknowledged.load(), 0u) << "no writer got to the end of a write";
    EXPECT_GT(interrupted, kills / 20) << "the writers were not killed while they wrote";
}

TEST(KilledWriter, LeavesNothingOfACopyToANewName)
{
    TemporaryFolder const folder;
    if (!tests::support::hasNamelessFiles(folder.path()))
        GTEST_SKIP() << "the file system has no files without names";
    std::string const content(std::size_t{1} << 20U, 'x');
    folder.write("file", content);
    fs::create_directory(folder / "copies");
    SharedMemory<Progress> const shared;
    std::minstd_rand random(20240229);
    std::uint64_t before = 0;
    int interrupted = 0;
    for (int i = 0; i < kills / 5; ++i) {
        killAWriter([&] { copyForEver(folder.iri(u"file"), folder.iri(u"copies"), *shared); }, *shared,
                    std::chrono::microseconds(random() % 3000));
        std::uint64_t const acknowledged = shared->acknowledged;
        std::uint64_t found = before;
        for (std::string name; fs::exists(folder / (name = "copies/" + std::to_string(found + 1))); ++found) {
            ASSERT_TRUE(folder.read(name) == content) << name << " is torn";
            fs::remove(folder / name);
        }
        ASSERT_TRUE(found == acknowledged || found == acknowledged + 1)
            << "found " << found << ", acknowledged " << acknowledged;
        ASSERT_TRUE(fs::is_empty(folder / "copies"));
        interrupted += found == acknowledged ? 1 : 0;
        shared->acknowledged = before = found;
    }
    EXPECT_GT(before, 0u) << "no writer got to the end of a copy";
    EXPECT_GT(interrupted, 0) << "the writers were not killed while they copied";
}

} // namespace
} // namespace foundation::storage::local
