#include <tests/tools/storage/ToolTest.hpp>

#include <array>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <fcntl.h>
#include <string_view>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

/// The slower the program, the less it does in its time; a sanitizer looks for other faults.
#ifdef __SANITIZE_THREAD__
constexpr auto duration = 1s;
#else
constexpr auto duration = 3s;
#endif

/// How long what must happen at some time is waited for.
constexpr auto patience = 60s;

/// Exchanges two entries, again and again, while it lives.
class Swapper
{
public:
    Swapper(fs::path left, fs::path right)
        : thread_([this, left = std::move(left), right = std::move(right)](std::stop_token const& stop) {
              while (!stop.stop_requested()) {
                  ::renameat2(AT_FDCWD, left.c_str(), AT_FDCWD, right.c_str(), RENAME_EXCHANGE);
                  ++swaps_;
              }
          })
    {
        while (swaps_ == 0)
            std::this_thread::yield();
    }

private:
    std::atomic<std::uint64_t> swaps_ = 0;
    std::jthread thread_;
};

/// A folder "tree/swapped" that is exchanged with the link "link" to the folder "outside", which the tool must not
/// enter.
class SwapConcurrency : public ToolTest
{
protected:
    static constexpr char const* scratch = "7e9f4b5e-0d6c-4a57-8f2e-1b9d3c5a7e90.tmp.bak";

    SwapConcurrency()
    {
        makeFolder("tree/swapped/deep");
        makeFolder("outside/deep");
        for (char const* const name : {"who", "within", "deep/within"})
            folder.write(std::string("tree/swapped/") + name, "within");
        for (char const* const name : {"who", "known outside", "deep/known outside", scratch})
            folder.write(std::string("outside/") + name, "outside");
        setTime(std::string("outside/") + scratch, 1'000'000'000);
        makeLink((folder / "outside").string(), "link");
    }

    Swapper swap() const { return Swapper(folder / "tree/swapped", folder / "link"); }

    /// Whether a program is led outside that first makes sure that no link stands there, and then goes by the path.
    bool isLedOutsideByPath() const
    {
        std::string const path = folder / "tree/swapped";
        struct stat status = {};
        if (::lstat(path.c_str(), &status) != 0 || !S_ISDIR(status.st_mode))
            return false;
        int const file = ::openat(AT_FDCWD, (path + "/who").c_str(), O_RDONLY | O_CLOEXEC);
        std::array<char, 16> content{};
        ssize_t const size = ::read(file, content.data(), content.size());
        ::close(file);
        return size > 0 && std::string_view(content.data(), static_cast<std::size_t>(size)) == "outside";
    }

    void expectSwappingToMatter() const
    {
        Swapper const swapper = swap();
        auto const end = Clock::now() + patience;
        bool isLedOutside = false;
        while (!isLedOutside && Clock::now() < end)
            isLedOutside = isLedOutsideByPath();
        ASSERT_TRUE(isLedOutside) << "nothing would be proved: looking before each access was enough";
    }

    /// Runs the tool while the folder is swapped, until it has met the folder and the link, and expects that `mark`,
    /// which stands for what is outside, is never written.
    void expectNeverWritten(Arguments const& arguments, std::string const& mark, std::string const& within) const
    {
        expectSwappingToMatter();
        Swapper const swapper = swap();
        int met = 0;
        int passed = 0;
        auto const end = Clock::now() + duration;
        while (Clock::now() < end || met == 0 || passed == 0) {
            ASSERT_LT(Clock::now(), end + patience) << met << " times the folder was met, " << passed << " times not";
            ProgramResult const result = run(arguments);
            ASSERT_EQ(result.output.find(mark), std::string::npos) << result.output;
            ++(result.output.find(within) != std::string::npos ? met : passed);
        }
    }
};

TEST_F(SwapConcurrency, LeadsNoSearchOutside)
{
    expectNeverWritten({"find", "tree"}, "known outside", "within");
}

TEST_F(SwapConcurrency, LeadsNoDrawingOutside)
{
    expectNeverWritten({"tree", "tree"}, "known outside", "within");
}

TEST_F(SwapConcurrency, LeadsNoSumOutside)
{
    folder.write("outside/deep/known outside", std::string(7'654'321, 'x'));
    expectNeverWritten({"du", "-s", "tree"}, "7654", "          18  ");
}

TEST_F(SwapConcurrency, LeadsNoCopyFromOutside)
{
    expectSwappingToMatter();
    Swapper const swapper = swap();
    int met = 0;
    auto const end = Clock::now() + duration;
    while (Clock::now() < end || met == 0) {
        ASSERT_LT(Clock::now(), end + patience);
        run({"cp", "-r", "tree", "copy"});
        if (exists("copy/swapped/who")) {
            ++met;
            ASSERT_EQ(folder.read("copy/swapped/who"), "within");
        }
        ASSERT_FALSE(exists("copy/swapped/known outside"));
        ASSERT_FALSE(exists("copy/swapped/deep/known outside"));
        fs::remove_all(folder / "copy");
    }
}

TEST_F(SwapConcurrency, LeadsNoCopyToTheOutside)
{
    makeFolder("source/swapped/deep");
    for (char const* const name : {"swapped/new", "swapped/deep/new"})
        folder.write(std::string("source/") + name, "new");
    expectSwappingToMatter();
    std::size_t const outside = countEntries("outside");
    Swapper const swapper = swap();
    int met = 0;
    auto const end = Clock::now() + duration;
    while (Clock::now() < end || met == 0) {
        ASSERT_LT(Clock::now(), end + patience);
        met += run({"cp", "-rp", "--replace", "source/.", "tree"}).status == 0 ? 1 : 0;
        ASSERT_EQ(countEntries("outside"), outside);
        ASSERT_EQ(countEntries("outside/deep"), 1U);
    }
}

TEST_F(SwapConcurrency, LeadsNoCleaningOutside)
{
    expectSwappingToMatter();
    Swapper const swapper = swap();
    int cleaned = 0;
    auto const end = Clock::now() + duration;
    std::string const inside = std::string("tree/") + scratch;
    while (Clock::now() < end) {
        folder.write(inside, "");
        setTime(inside, 1'000'000'000);
        ASSERT_EQ(run({"clean", "-r", "tree"}).status, 0);
        cleaned += exists(inside) ? 0 : 1;
        ASSERT_TRUE(exists(std::string("outside/") + scratch));
    }
    EXPECT_GT(cleaned, 0);
}

} // namespace
