#include <tools/storage/leaveBehind.hpp>

#include <gtest/gtest.h>

#include <tools/storage/interrupt.hpp>

#include <csignal>
#include <cstdlib>
#include <future>
#include <memory>
#include <stdexcept>
#include <thread>
#include <unistd.h>

namespace foundation::storage::tool {
namespace {

TEST(LeaveBehind, WaitsForTheStep)
{
    bool isDone = false;
    std::thread::id thread;
    doOrLeaveBehind([&] {
        thread = std::this_thread::get_id();
        isDone = true;
    });
    EXPECT_TRUE(isDone);
    EXPECT_NE(thread, std::this_thread::get_id());
}

TEST(LeaveBehind, ThrowsWhatTheStepThrows)
{
    EXPECT_THROW(doOrLeaveBehind([] { throw std::out_of_range("failed"); }), std::out_of_range);
}

/// Ends with the signal as its exit status when that ended a wait for a step that never ends.
[[noreturn]] void interruptAnEndlessStep()
{
    catchInterrupts();
    auto const hasBegun = std::make_shared<std::promise<void>>();
    std::future<void> begun = hasBegun->get_future();
    std::jthread const user([&] {
        begun.wait();
        ::kill(::getpid(), SIGTERM);
    });
    try {
        doOrLeaveBehind([hasBegun] {
            hasBegun->set_value();
            for (;;)
                ::pause();
        });
    } catch (Interrupted const& interrupted) {
        std::_Exit(interrupted.leavesWork ? interrupted.signal : EXIT_FAILURE);
    }
    std::_Exit(EXIT_FAILURE);
}

TEST(LeaveBehindConcurrency, LeavesAnEndlessStepWhenInterrupted)
{
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    EXPECT_EXIT(interruptAnEndlessStep(), testing::ExitedWithCode(SIGTERM), "");
}

} // namespace
} // namespace foundation::storage::tool
