#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/scratchName.hpp>
#include <tests/storage/local/durability/SharedMemory.hpp>
#include <tests/storage/local/durability/WrittenContent.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <boost/property_tree/ptree.hpp>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <filesystem>
#include <random>
#include <stdexcept>
#include <string>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::madeContent;
using tests::support::numberOfContent;
using tests::support::SharedMemory;
using tests::support::TemporaryFolder;

constexpr int kills = 1000;

/// The number of the last content whose commit returned.
using Acknowledged = std::atomic<std::uint64_t>;

[[noreturn]] void writeForEver(StorageIRI const& file, Acknowledged& acknowledged)
{
    LocalProvider provider;
    boost::property_tree::ptree settings;
    settings.put("durability", "none"); // What a process leaves behind is not a matter of the disk.
    provider.configure(settings);
    for (std::uint64_t number = acknowledged.load() + 1;; ++number) {
        std::string const content = madeContent(number);
        auto const stream = provider.openTransactionalStream(file, {});
        for (std::size_t written = 0; written < content.size();) {
            long const count = std::min<long>(1000, static_cast<long>(content.size() - written));
            written += static_cast<std::size_t>(stream->write(content.data() + written, count));
        }
        stream->close(StreamClosePolicy::Commit);
        acknowledged = number;
    }
}

/// Lets a writer run for a moment, and kills it.
void killAWriter(StorageIRI const& file, Acknowledged& acknowledged, std::chrono::microseconds moment)
{
    pid_t const writer = ::fork();
    if (writer == 0)
        writeForEver(file, acknowledged);
    if (writer == -1)
        throw std::runtime_error("no process for the writer");
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
    SharedMemory<Acknowledged> const shared;
    Acknowledged& acknowledged = *shared;
    std::minstd_rand random(20240229);
    int interrupted = 0;
    for (int i = 0; i < kills; ++i) {
        killAWriter(folder.iri(u"file"), acknowledged, std::chrono::microseconds(random() % 3000));
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
            fs::remove(entry.path());
        }
    }
    EXPECT_GT(acknowledged.load(), 0u) << "no writer got to the end of a write";
    EXPECT_GT(interrupted, kills / 20) << "the writers were not killed while they wrote";
}

} // namespace
} // namespace foundation::storage::local
