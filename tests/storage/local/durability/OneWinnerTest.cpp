#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/Exception.hpp>
#include <tests/storage/local/durability/SharedMemory.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <boost/property_tree/ptree.hpp>

#include <algorithm>
#include <array>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <pthread.h>
#include <stdexcept>
#include <string>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::SharedMemory;
using tests::support::TemporaryFolder;

constexpr unsigned processCount = 64;
constexpr int rounds = 1000;

enum class Outcome
{
    Won,
    Lost,
    Failed
};

/// Where processes meet: before each round, and after it.
struct Meeting
{
    Meeting()
    {
        pthread_barrierattr_t attributes;
        pthread_barrierattr_init(&attributes);
        pthread_barrierattr_setpshared(&attributes, PTHREAD_PROCESS_SHARED);
        pthread_barrier_init(&barrier, &attributes, processCount + 1);
    }

    void wait() { pthread_barrier_wait(&barrier); }

    pthread_barrier_t barrier;
    std::array<Outcome, processCount> outcomes{};
};

/// What a process does in a round to get the name.
using Attempt = std::function<void(unsigned process, int round)>;

Outcome outcomeOf(Attempt const& attempt, StorageIRI const& target, unsigned process, int round)
{
    try {
        attempt(process, round);
        return Outcome::Won;
    } catch (Exception const& error) {
        bool const isTold = error.getErrorCode() == ErrorCode::ResourceAlreadyExists && error.getStorageIRI() == target;
        return isTold ? Outcome::Lost : Outcome::Failed;
    } catch (std::exception const&) {
        return Outcome::Failed;
    }
}

[[noreturn]] void compete(Meeting& meeting, Attempt const& attempt, StorageIRI const& target, unsigned process)
{
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    for (int round = 0; round < rounds; ++round) {
        meeting.wait();
        meeting.outcomes.at(process) = outcomeOf(attempt, target, process, round);
        meeting.wait();
    }
    ::_exit(EXIT_SUCCESS);
}

class OneWinnerAmongProcesses : public testing::Test
{
protected:
    OneWinnerAmongProcesses()
    {
        boost::property_tree::ptree settings;
        settings.put("durability", "none"); // Who wins is not a matter of the disk.
        provider.configure(settings);
        for (unsigned process = 0; process < processCount; ++process)
            for (char const* const name : {"source", "copied"})
                folder.write(name + std::to_string(process), contentOf(process));
    }

    /// Its number, for every other one far behind a single write.
    static std::string contentOf(unsigned process)
    {
        return std::string(process % 2 == 0 ? 0 : 65536, '.') + std::to_string(process);
    }

    static std::u16string nameOf(std::string const& prefix, unsigned process)
    {
        std::string const name = prefix + std::to_string(process);
        return std::u16string(name.begin(), name.end());
    }

    static ReplacementPolicy policyOf(unsigned process)
    {
        return process % 2 == 0 ? ReplacementPolicy::Preserve : ReplacementPolicy::NoClobber;
    }

    void create() const { provider.createFile(target); }

    void move(unsigned process) const
    {
        provider.moveFile(folder.iri(nameOf("source", process)), target, policyOf(process));
    }

    void copy(unsigned process) const
    {
        auto const status =
            provider.copyFileAtomic(folder.iri(nameOf("copied", process)), target, policyOf(process), {});
        if (status != TransactionStatus::Completed)
            throw std::logic_error("a copy that was not aborted is not completed");
    }

    /// Lets all processes attempt to get the name, round after round, and looks at each outcome.
    void run(Attempt const& attempt)
    {
        std::vector<pid_t> processes;
        for (unsigned process = 0; process < processCount; ++process) {
            processes.push_back(::fork());
            if (processes.back() == 0)
                compete(*meeting, attempt, target, process);
            if (processes.back() == -1)
                throw std::runtime_error("not enough processes");
        }
        for (int round = 0; round < rounds; ++round) {
            meeting->wait();
            meeting->wait();
            judge(round);
        }
        for (pid_t const process : processes) {
            int status = 0;
            EXPECT_EQ(::waitpid(process, &status, 0), process);
            EXPECT_EQ(status, 0);
        }
        EXPECT_EQ(badRounds, 0);
    }

    /// The next round starts as this one did.
    void judge(int round)
    {
        auto const& outcomes = meeting->outcomes;
        auto const winner = std::find(outcomes.begin(), outcomes.end(), Outcome::Won);
        long const losers = std::count(outcomes.begin(), outcomes.end(), Outcome::Lost);
        auto const process = static_cast<unsigned>(winner - outcomes.begin());
        bool const isGood = winner != outcomes.end() && losers == processCount - 1 && holdsContentOf(process, round);
        if (!isGood && ++badRounds == 1)
            ADD_FAILURE() << "round " << round << ": " << std::count(outcomes.begin(), outcomes.end(), Outcome::Won)
                          << " winners, " << losers << " losers";
        fs::remove(folder / "target");
        std::string const source = "source" + std::to_string(process);
        if (winner != outcomes.end() && !fs::exists(folder / source))
            folder.write(source, contentOf(process));
    }

    bool holdsContentOf(unsigned process, int round) const
    {
        return fs::exists(folder / "target") &&
               folder.read("target") == (creates(process, round) ? "" : contentOf(process));
    }

    /// Whether a process makes an empty file rather than putting its content in place.
    std::function<bool(unsigned process, int round)> creates = [](unsigned, int) { return false; };

    TemporaryFolder const folder;
    LocalProvider provider;
    StorageIRI const target = folder.iri(u"target");
    SharedMemory<Meeting> const meeting;
    int badRounds = 0;
};

TEST_F(OneWinnerAmongProcesses, CreatesAFile)
{
    creates = [](unsigned, int) { return true; };
    run([this](unsigned, int) { create(); });
}

TEST_F(OneWinnerAmongProcesses, MovesItsFileThere)
{
    run([this](unsigned process, int) { move(process); });
}

TEST_F(OneWinnerAmongProcesses, CopiesAFileThere)
{
    run([this](unsigned process, int) { copy(process); });
    EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 2 * processCount) << "scratch files are left";
}

TEST_F(OneWinnerAmongProcesses, WinsAgainstOthersThatDoOtherwise)
{
    auto const way = [](unsigned process, int round) { return (process + static_cast<unsigned>(round)) % 3; };
    creates = [=](unsigned process, int round) { return way(process, round) == 0; };
    run([this, way](unsigned process, int round) {
        switch (way(process, round)) {
        case 0:
            return create();
        case 1:
            return move(process);
        default:
            return copy(process);
        }
    });
}

} // namespace
} // namespace foundation::storage::local
