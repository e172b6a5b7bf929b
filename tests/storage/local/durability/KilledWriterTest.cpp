#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/scratchName.hpp>
#include <tests/storage/local/durability/WrittenContent.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <boost/property_tree/ptree.hpp>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <filesystem>
#include <random>
#include <stdexcept>
#include <string>
#include <sys/mman.h>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::madeContent;
using tests::support::numberOfContent;
using tests::support::TemporaryFolder;

constexpr int kills = 1000;

/// The number of the last content whose commit returned, told by the writer to those who outlive it.
class Acknowledged
{
public:
    Acknowledged()
        : number_(static_cast<std::uint64_t volatile*>(
              ::mmap(nullptr, sizeof(std::uint64_t), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0)))
    {}
    ~Acknowledged() { ::munmap(const_cast<std::uint64_t*>(number_), sizeof(std::uint64_t)); }
    Acknowledged(Acknowledged const&) = delete;
    Acknowledged& operator=(Acknowledged const&) = delete;

    std::uint64_t get() const { return *number_; }
    void set(std::uint64_t number) const { *number_ = number; }

private:
    std::uint64_t volatile* number_;
};

[[noreturn]] void writeForEver(StorageIRI const& file, Acknowledged const& acknowledged)
{
    LocalProvider provider;
    boost::property_tree::ptree settings;
    settings.put("durability", "none"); // What a process leaves behind is not a matter of the disk.
    provider.configure(settings);
    for (std::uint64_t number = acknowledged.get() + 1;; ++number) {
        std::string const content = madeContent(number);
        auto const stream = provider.openTransactionalStream(file, {});
        for (std::size_t written = 0; written < content.size();) {
            long const count = std::min<long>(1000, static_cast<long>(content.size() - written));
            written += static_cast<std::size_t>(stream->write(content.data() + written, count));
        }
        stream->close(StreamClosePolicy::Commit);
        acknowledged.set(number);
    }
}

/// Lets a writer run for a moment, and kills it.
void killAWriter(StorageIRI const& file, Acknowledged const& acknowledged, std::chrono::microseconds moment)
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
    Acknowledged const acknowledged;
    std::minstd_rand random(20240229);
    int interrupted = 0;
    for (int i = 0; i < kills; ++i) {
        killAWriter(folder.iri(u"file"), acknowledged, std::chrono::microseconds(random() % 3000));
        std::uint64_t const found = numberOfContent(folder.read("file"));
        ASSERT_TRUE(found == acknowledged.get() || found == acknowledged.get() + 1)
            << "found " << found << ", acknowledged " << acknowledged.get();
        acknowledged.set(found);
        for (fs::directory_entry const& entry : fs::directory_iterator(folder.path())) {
            std::string const name = entry.path().filename();
            if (name == "file")
                continue;
            ASSERT_TRUE(detail::isScratchName(name)) << name;
            ++interrupted;
            fs::remove(entry.path());
        }
    }
    EXPECT_GT(acknowledged.get(), 0u) << "no writer got to the end of a write";
    EXPECT_GT(interrupted, kills / 20) << "the writers were not killed while they wrote";
}

} // namespace
} // namespace foundation::storage::local
