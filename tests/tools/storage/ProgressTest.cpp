#include <tools/storage/Progress.hpp>

#include <gtest/gtest.h>
#include <tests/support/inThreads.hpp>

namespace {

using namespace foundation::storage::tool;

constexpr std::uint64_t mebibyte = 1 << 20;
constexpr std::size_t wide = 200;

ProgressState knownState()
{
    return {{120, 300 * mebibyte}, {400, 1024 * mebibyte}, true, 35.0 * mebibyte, 83};
}

TEST(ProgressLine, TellsFilesBytesRateAndTimeLeft)
{
    EXPECT_EQ(progressLine(knownState(), wide), "120 of 400 files, 300 MiB of 1.0 GiB, 35 MiB/s, 1:23 left");
}

TEST(ProgressLine, TellsHoursAndWholeSeconds)
{
    ProgressState state = knownState();
    for (auto const& [seconds, text] :
         {std::pair{0.0, "0:00"}, {0.1, "0:01"}, {3600.0, "1:00:00"}, {36061.0, "10:01:01"}}) {
        state.secondsLeft = seconds;
        EXPECT_TRUE(progressLine(state, wide).ends_with(std::string(", ") + text + " left")) << text;
    }
}

TEST(ProgressLine, SaysThatThereMayBeMoreFilesWhileTheyAreCounted)
{
    ProgressState state = knownState();
    state.isAllFound = false;
    state.secondsLeft = -1;
    EXPECT_EQ(progressLine(state, wide), "120 of 400+ files, 300 MiB, 35 MiB/s");
}

TEST(ProgressLine, LeavesOutWhatIsNotKnown)
{
    EXPECT_EQ(progressLine({{1, 0}, {}, false, 0, -1}, wide), "1 file");
    EXPECT_EQ(progressLine({{0, mebibyte}, {}, false, mebibyte, -1}, wide), "1.0 MiB, 1.0 MiB/s");
    EXPECT_EQ(progressLine({}, wide), "");
}

TEST(ProgressLine, LeavesOutTheLastPartsWhereThereIsNoRoom)
{
    EXPECT_EQ(progressLine(knownState(), 57), "120 of 400 files, 300 MiB of 1.0 GiB, 35 MiB/s, 1:23 left");
    EXPECT_EQ(progressLine(knownState(), 56), "120 of 400 files, 300 MiB of 1.0 GiB, 35 MiB/s");
    EXPECT_EQ(progressLine(knownState(), 16), "120 of 400 files");
    EXPECT_EQ(progressLine(knownState(), 15), "");
}

TEST(ProgressLine, NeverTellsLessFoundThanDone)
{
    EXPECT_EQ(progressLine({{5, 10}, {4, 9}, true, 0, -1}, wide), "5 of 5 files, 10 B of 10 B, 0 B/s");
}

/// What a progress that waits for nothing writes to a standard error that is no terminal.
template <typename Work>
std::string written(Work const& work)
{
    testing::internal::CaptureStderr();
    {
        Progress progress(std::chrono::milliseconds(0));
        work(progress);
    }
    return testing::internal::GetCapturedStderr();
}

TEST(Progress, IsHiddenWhereStandardErrorIsNoTerminal)
{
    EXPECT_EQ(written([](Progress& progress) { progress.addFile(); }), "");
}

TEST(Progress, WritesALineASecondWhereThatIsAskedFor)
{
    EXPECT_EQ(written([](Progress& progress) {
                  progress.showLines();
                  progress.setFound({3, 4096}, false);
                  progress.addFile();
                  progress.addFile();
              }),
              "1 of 3+ files, 0 B, 0 B/s\n");
}

TEST(Progress, CountsFilesThatNeededNoWorkAsDone)
{
    EXPECT_EQ(written([](Progress& progress) {
                  progress.showLines();
                  progress.setFound({3, 4096}, true);
                  progress.skipFile(1024);
              }),
              "1 of 3 files, 1.0 KiB of 4.0 KiB, 0 B/s\n");
}

TEST(Progress, TellsNothingOfShortWork)
{
    testing::internal::CaptureStderr();
    {
        Progress progress(std::chrono::hours(1));
        progress.showLines();
        EXPECT_FALSE(progress.isSoon());
        progress.addFile();
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST(Progress, IsSoonToldHowMuchThereIsToDo)
{
    testing::internal::CaptureStderr();
    Progress progress(std::chrono::milliseconds(0));
    EXPECT_FALSE(progress.isSoon()) << "nobody would see it";
    progress.showLines();
    EXPECT_TRUE(progress.isSoon());
    testing::internal::GetCapturedStderr();
}

TEST(ProgressConcurrency, WritesInTheThreadThatMadeItAlone)
{
    EXPECT_EQ(written([](Progress& progress) {
                  progress.showLines();
                  foundation::tests::support::inThreads(4, [&](int) {
                      for (int i = 0; i < 1000; ++i) {
                          progress.addFile();
                          progress.addBytes(1);
                      }
                  });
                  progress.setFound({4000, 4000}, true);
                  progress.update();
              }).substr(0, 18),
              "4000 of 4000 files");
}

} // namespace
