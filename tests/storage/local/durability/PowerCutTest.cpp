#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/durability/MountedFileSystem.hpp>
#include <tests/storage/local/durability/SharedMemory.hpp>
#include <tests/storage/local/durability/WrittenContent.hpp>

#include <boost/property_tree/ptree.hpp>
#include <fl/filesystem/native_name.hpp>

#include <array>
#include <atomic>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <random>
#include <sstream>
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
using tests::support::MountedFileSystem;
using tests::support::numberOfContent;
using tests::support::SharedMemory;

constexpr int powerCuts = 25;
constexpr std::size_t fileCount = 5;

/// For each file the number of the content that was written last and acknowledged.
struct Written
{
    std::array<std::atomic<std::uint64_t>, fileCount> numbers{};
    std::atomic<std::uint64_t> count{0};
    std::atomic<std::uint64_t> folders{0}; ///< the number of the last folder that was made and written into
    std::atomic<bool> isPowerOff{false};   ///< whoever is told of something after that is not there any more
};

StorageIRI iriOf(fs::path const& path)
{
    return StorageIRI(StorageIRI(u"file:///"), fl::filesystem::from_native_bytes(path.native()));
}

void write(LocalProvider const& provider, StorageIRI const& file, std::string const& content)
{
    auto const stream = provider.openTransactionalStream(file, {});
    for (std::size_t done = 0; done < content.size();)
        done +=
            static_cast<std::size_t>(stream->write(content.data() + done, static_cast<long>(content.size() - done)));
    stream->close(StreamClosePolicy::Commit);
}

/// Has the content copied from another file.
void copy(LocalProvider const& provider, fs::path const& folder, StorageIRI const& file, std::string const& content)
{
    fs::path const source = folder / "source";
    std::ofstream(source, std::ios::binary | std::ios::trunc) << content;
    provider.copyFileAtomic(iriOf(source), file, ReplacementPolicy::Overwrite, {});
}

fs::path pathOfFolder(fs::path const& folder, std::uint64_t number)
{
    return folder / ("folder " + std::to_string(number));
}

void makeFolder(LocalProvider const& provider, fs::path const& folder, std::uint64_t number)
{
    fs::path const path = pathOfFolder(folder, number);
    provider.createFolder(iriOf(path));
    write(provider, iriOf(path / "file"), madeContent(number));
}

/// Writes to one file after the other until the power goes, copies to the last of them, and makes a folder with a file
/// each tenth time.
[[noreturn]] void writeUntilTheEnd(LocalProvider const& provider, fs::path const& folder, Written& written)
{
    try {
        for (std::uint64_t turn = 0;; ++turn) {
            std::size_t const i = turn % fileCount;
            std::uint64_t const number = written.numbers[i] + 1;
            StorageIRI const file = iriOf(folder / std::to_string(i));
            bool const makes = turn % 10 == 9;
            if (i + 1 == fileCount)
                copy(provider, folder, file, madeContent(number));
            else
                write(provider, file, madeContent(number));
            if (written.isPowerOff)
                ::_exit(EXIT_SUCCESS);
            written.numbers[i] = number;
            if (makes)
                makeFolder(provider, folder, written.folders + 1);
            if (written.isPowerOff)
                ::_exit(EXIT_SUCCESS);
            written.folders += makes ? 1 : 0;
            ++written.count;
        }
    } catch (std::exception const&) {
        ::_exit(EXIT_SUCCESS);
    }
}

class PowerCut : public testing::TestWithParam<char const*>
{
protected:
    void SetUp() override
    {
        if (std::string const objection = MountedFileSystem::objection(GetParam()); !objection.empty())
            GTEST_SKIP() << objection;
    }

    static void configure(LocalProvider& provider, std::string const& durability)
    {
        boost::property_tree::ptree settings;
        settings.put("durability", durability);
        provider.configure(settings);
    }
};

/// What power cuts left behind, counted in files.
struct Losses
{
    int kept = 0;
    int lost = 0; ///< an older content than was acknowledged
    int torn = 0;
    int foldersKept = 0; ///< with the file in them
    int foldersLost = 0;
};

class PowerCuts
{
public:
    PowerCuts(std::string const& type, LocalProvider const& provider)
        : disk_(type, 512u << 20), provider_(provider), random_(987654321)
    {
        LocalProvider const durable;
        for (std::size_t i = 0; i < fileCount; ++i)
            write(durable, iriOf(disk_.path() / std::to_string(i)), madeContent(0));
    }

    /// Cuts the power in the middle of writing, and looks at what is left.
    void cutOnce()
    {
        std::uint64_t const before = written_->count;
        pid_t const writer = ::fork();
        if (writer == 0)
            writeUntilTheEnd(provider_, disk_.path(), *written_);
        while (written_->count < before + 2 * fileCount)
            if (int status = 0; ::waitpid(writer, &status, WNOHANG) != 0)
                throw std::runtime_error("the writer does not write");
        timespec const moment{.tv_sec = 0, .tv_nsec = static_cast<long>(random_() % 10'000'000)};
        ::clock_nanosleep(CLOCK_MONOTONIC, 0, &moment, nullptr);
        written_->isPowerOff = true;
        disk_.cutPower();
        int status = 0;
        if (::waitpid(writer, &status, 0) != writer || status != 0)
            throw std::runtime_error("the writer crashed");
        disk_.restart();
        written_->isPowerOff = false;
        for (std::size_t i = 0; i < fileCount; ++i)
            judge(i);
        judgeFolders();
    }

    Losses const& losses() const { return losses_; }

private:
    void judge(std::size_t i)
    {
        std::uint64_t const acknowledged = written_->numbers[i];
        try {
            std::uint64_t const found = numberOfContent(contentOf(disk_.path() / std::to_string(i)));
            bool const isKept = found == acknowledged || found == acknowledged + 1;
            ++(isKept ? losses_.kept : losses_.lost);
            written_->numbers[i] = found;
        } catch (std::runtime_error const&) {
            ++losses_.torn;
        }
    }

    static std::string contentOf(fs::path const& file)
    {
        std::ostringstream content;
        content << std::ifstream(file, std::ios::binary).rdbuf();
        return content.str();
    }

    /// All that were ever made; the next one may have been, too, and is made anew.
    void judgeFolders()
    {
        for (std::uint64_t number = 1; number <= written_->folders; ++number) {
            bool const isThere = contentOf(pathOfFolder(disk_.path(), number) / "file") == madeContent(number);
            ++(isThere ? losses_.foldersKept : losses_.foldersLost);
        }
        fs::remove_all(pathOfFolder(disk_.path(), written_->folders + 1));
    }

    MountedFileSystem disk_;
    LocalProvider const& provider_;
    SharedMemory<Written> written_;
    std::minstd_rand random_;
    Losses losses_;
};

TEST_P(PowerCut, LosesNothingThatAFullCommitAcknowledged)
{
    LocalProvider const provider;
    PowerCuts cuts(GetParam(), provider);
    for (int i = 0; i < powerCuts; ++i)
        cuts.cutOnce();
    EXPECT_EQ(cuts.losses().lost, 0);
    EXPECT_EQ(cuts.losses().torn, 0);
    EXPECT_EQ(cuts.losses().foldersLost, 0);
    EXPECT_GE(cuts.losses().foldersKept, powerCuts);
    EXPECT_EQ(cuts.losses().kept, powerCuts * static_cast<int>(fileCount));
}

TEST_P(PowerCut, LosesContentThatWasNotSynced)
{
    LocalProvider provider;
    configure(provider, "none");
    PowerCuts cuts(GetParam(), provider);
    for (int i = 0; i < powerCuts / 5; ++i)
        cuts.cutOnce();
    EXPECT_GT(cuts.losses().lost + cuts.losses().torn, 0)
        << "cutting the power cuts nothing: the other test says nothing";
}

INSTANTIATE_TEST_SUITE_P(FileSystems, PowerCut, testing::Values("ext4", "xfs"));

} // namespace
} // namespace foundation::storage::local
