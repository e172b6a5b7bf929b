#include <tools/storage/OrderedWorkers.hpp>

#include <algorithm>
#include <array>
#include <atomic>
#include <barrier>
#include <gtest/gtest.h>
#include <latch>
#include <numeric>
#include <set>
#include <stdexcept>
#include <thread>

namespace {

using foundation::storage::tool::OrderedWorkers;
using foundation::storage::tool::WorkerContext;

void waitForNothing() {}

class OrderedWorkersConcurrency : public testing::TestWithParam<std::size_t>
{
protected:
    /// A job whose report notes its number.
    OrderedWorkers::Job numbered(int number)
    {
        return [this, number](WorkerContext&) { return [this, number] { reported.push_back(number); }; };
    }

    std::vector<int> reported;
    OrderedWorkers workers{GetParam(), &waitForNothing};
};

INSTANTIATE_TEST_SUITE_P(Threads, OrderedWorkersConcurrency, testing::Values(1U, 2U, 8U));

TEST_P(OrderedWorkersConcurrency, ReportInTheOrderOfBeingAsked)
{
    constexpr int count = 20'000;
    for (int i = 0; i < count; ++i)
        workers.add(numbered(i));
    workers.finish();
    std::vector<int> expected(count);
    std::iota(expected.begin(), expected.end(), 0);
    EXPECT_EQ(reported, expected);
}

TEST_P(OrderedWorkersConcurrency, KeepNoMoreJobsThanTheWindow)
{
    std::atomic<std::size_t> begun = 0;
    std::size_t ended = 0;
    std::size_t most = 0;
    for (std::size_t i = 0; i < 5 * OrderedWorkers::window; ++i) {
        workers.add([&](WorkerContext&) {
            ++begun;
            return [&] { ++ended; };
        });
        most = std::max(most, i + 1 - ended);
    }
    EXPECT_LE(most, OrderedWorkers::window);
    workers.finish();
    EXPECT_EQ(begun, ended);
}

TEST_P(OrderedWorkersConcurrency, ThrowWhatAJobThrewWhenItsTurnHasCome)
{
    workers.add(numbered(0));
    workers.add([](WorkerContext&) -> OrderedWorkers::Report { throw std::runtime_error("failed"); });
    workers.add(numbered(2));
    EXPECT_THROW(workers.finish(), std::runtime_error);
    EXPECT_EQ(reported, std::vector<int>{0});
    workers.finish();
    EXPECT_EQ(reported, (std::vector<int>{0, 2}));
}

TEST_P(OrderedWorkersConcurrency, GoOnAfterFinishing)
{
    workers.add(numbered(0));
    workers.finish();
    workers.add(numbered(1));
    workers.finish();
    EXPECT_EQ(reported, (std::vector<int>{0, 1}));
}

TEST_P(OrderedWorkersConcurrency, GiveEachThreadABuffer)
{
    std::atomic<std::size_t> smallest = ~std::size_t{0};
    for (int i = 0; i < 100; ++i)
        workers.add([&](WorkerContext& context) {
            smallest = std::min(smallest.load(), context.buffer.size());
            return waitForNothing;
        });
    workers.finish();
    EXPECT_GE(smallest, 4096U);
}

TEST_P(OrderedWorkersConcurrency, StopByReportingWhatWasDoneAndDroppingTheRest)
{
    std::latch hasBegun(1);
    for (std::size_t i = 0; i < GetParam(); ++i)
        workers.add([&, i](WorkerContext& context) -> OrderedWorkers::Report {
            if (i == 0)
                hasBegun.count_down();
            while (!context.stop.stop_requested())
                std::this_thread::yield();
            throw std::runtime_error("stopped");
        });
    workers.add(numbered(1));
    hasBegun.wait();
    workers.stop();
    EXPECT_TRUE(reported.empty());
}

TEST(OrderedWorkersGroupsConcurrency, KeepThreadsApart)
{
    constexpr std::size_t jobsInAGroup = 50;
    OrderedWorkers workers(2, &waitForNothing);
    std::latch allAreAdded(1);
    for (int thread = 0; thread < 2; ++thread) {
        workers.beginGroup();
        workers.add([&](WorkerContext&) {
            allAreAdded.wait();
            return waitForNothing;
        });
    }
    std::barrier bothAreAtIt(2);
    std::array<std::set<std::thread::id>, 2> threads;
    for (std::set<std::thread::id>& ofGroup : threads) {
        workers.beginGroup();
        for (std::size_t i = 0; i < jobsInAGroup; ++i)
            workers.add([&](WorkerContext&) {
                ofGroup.insert(std::this_thread::get_id());
                bothAreAtIt.arrive_and_wait();
                return waitForNothing;
            });
    }
    allAreAdded.count_down();
    workers.finish();
    EXPECT_EQ(threads[0].size(), 1U);
    EXPECT_EQ(threads[1].size(), 1U);
    EXPECT_NE(threads[0], threads[1]);
}

TEST(OrderedWorkersGroupsConcurrency, AreSharedWhenThereIsNoOther)
{
    OrderedWorkers workers(2, &waitForNothing);
    std::barrier bothAreAtIt(2);
    std::atomic<int> count = 0;
    workers.beginGroup();
    for (int i = 0; i < 10; ++i)
        workers.add([&](WorkerContext&) {
            bothAreAtIt.arrive_and_wait();
            ++count;
            return waitForNothing;
        });
    workers.finish();
    EXPECT_EQ(count, 10);
}

TEST(OrderedWorkersStopConcurrency, TellsWhatWasDoneBehindWhatWasNot)
{
    OrderedWorkers workers(2, &waitForNothing);
    std::latch isDone(1);
    bool isReported = false;
    workers.add([&](WorkerContext& context) -> OrderedWorkers::Report {
        while (!context.stop.stop_requested())
            std::this_thread::yield();
        throw std::runtime_error("stopped");
    });
    workers.add([&](WorkerContext&) { return [&] { isReported = true; }; });
    workers.add([&](WorkerContext&) {
        isDone.count_down();
        return waitForNothing;
    });
    isDone.wait();
    workers.stop();
    EXPECT_TRUE(isReported);
}

TEST(OrderedWorkersStopConcurrency, HappensWhenTheWaitIsEndedByAnException)
{
    std::latch hasBegun(1);
    bool hasStopped = false;
    {
        OrderedWorkers workers(1, [] { throw std::runtime_error("interrupted"); });
        workers.add([&](WorkerContext& context) {
            hasBegun.count_down();
            while (!context.stop.stop_requested())
                std::this_thread::yield();
            hasStopped = true;
            return waitForNothing;
        });
        hasBegun.wait();
        EXPECT_THROW(workers.finish(), std::runtime_error);
    }
    EXPECT_TRUE(hasStopped);
}

} // namespace
