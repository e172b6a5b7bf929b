#include <tools/storage/leaveBehind.hpp>

#include <tools/storage/interrupt.hpp>

#include <chrono>
#include <condition_variable>
#include <exception>
#include <memory>
#include <mutex>
#include <thread>
#include <utility>

namespace foundation::storage::tool {

namespace {

/// How long an interrupt may go unseen.
constexpr std::chrono::milliseconds patience{20};

struct Outcome
{
    std::mutex mutex;
    std::condition_variable isKnown;
    bool isDone = false;
    std::exception_ptr failure;
};

void doStep(std::function<void()> const& step, Outcome& outcome)
{
    std::exception_ptr failure;
    try {
        step();
    } catch (...) {
        failure = std::current_exception();
    }
    std::lock_guard const lock(outcome.mutex);
    outcome.failure = std::move(failure);
    outcome.isDone = true;
    outcome.isKnown.notify_one();
}

void throwInterrupted()
{
    try {
        checkInterrupt();
    } catch (Interrupted& interrupted) {
        interrupted.leavesWork = true;
        throw;
    }
}

} // namespace

void doOrLeaveBehind(std::function<void()> step)
{
    auto const outcome = std::make_shared<Outcome>();
    {
        HeldInterrupts const held;
        std::thread([outcome, step = std::move(step)] { doStep(step, *outcome); }).detach();
    }
    std::unique_lock lock(outcome->mutex);
    while (!outcome->isKnown.wait_for(lock, patience, [&] { return outcome->isDone; }))
        throwInterrupted();
    if (outcome->failure)
        std::rethrow_exception(std::exchange(outcome->failure, nullptr));
}

} // namespace foundation::storage::tool
