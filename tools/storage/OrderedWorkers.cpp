#include <tools/storage/OrderedWorkers.hpp>

#include <tools/storage/interrupt.hpp>
#include <tools/storage/readSome.hpp>

#include <chrono>
#include <utility>

namespace foundation::storage::tool {

namespace {

/// How long an interrupt may go unseen while the caller waits.
constexpr std::chrono::milliseconds patience{20};

} // namespace

OrderedWorkers::OrderedWorkers(std::size_t threads, std::function<void()> onWait) : onWait_(std::move(onWait))
{
    HeldInterrupts const held;
    for (std::size_t i = 0; i < threads; ++i)
        threads_.emplace_back([this](std::stop_token const& stop) { work(stop); });
}

OrderedWorkers::~OrderedWorkers()
{
    endThreads();
}

void OrderedWorkers::endThreads()
{
    for (std::jthread& thread : threads_)
        thread.request_stop();
    threads_.clear();
}

void OrderedWorkers::add(Job job)
{
    awaitAtMost(slots_.size() < window ? window - 1 : window / 2);
    {
        std::lock_guard const lock(mutex_);
        slots_.push_back({std::move(job), {}, {}});
    }
    isWaiting_.notify_one();
}

void OrderedWorkers::finish()
{
    awaitAtMost(0);
}

void OrderedWorkers::stop()
{
    endThreads();
    for (; !slots_.empty(); slots_.pop_front()) {
        if (slots_.front().report)
            slots_.front().report();
    }
    begun_ = done_ = 0;
}

/// Only this side adds and removes slots, so that it may look at their number without the mutex.
void OrderedWorkers::awaitAtMost(std::size_t count)
{
    for (reportDone(); slots_.size() > count; reportDone()) {
        onWait_();
        std::unique_lock lock(mutex_);
        wanted_ = slots_.size() - count;
        areDone_.wait_for(lock, patience, [this] { return done_ >= wanted_; });
        wanted_ = 0;
    }
}

void OrderedWorkers::reportDone()
{
    for (;;) {
        Slot slot;
        {
            std::lock_guard const lock(mutex_);
            if (done_ == 0)
                return;
            slot = std::move(slots_.front());
            slots_.pop_front();
            --begun_;
            --done_;
        }
        if (slot.failure)
            std::rethrow_exception(slot.failure);
        slot.report();
    }
}

void OrderedWorkers::work(std::stop_token const& stop)
{
    WorkerContext context{makeTransferBuffer(), stop};
    while (Slot* const slot = takeJob(stop)) {
        try {
            slot->report = slot->job(context);
        } catch (...) {
            slot->failure = std::current_exception();
        }
        slot->job = nullptr;
        markDone(*slot);
    }
}

/// A slot stays where it is while others are added behind it and removed before it.
OrderedWorkers::Slot* OrderedWorkers::takeJob(std::stop_token const& stop)
{
    std::unique_lock lock(mutex_);
    isWaiting_.wait(lock, stop, [this] { return begun_ < slots_.size(); });
    return stop.stop_requested() ? nullptr : &slots_[begun_++];
}

void OrderedWorkers::markDone(Slot& slot)
{
    std::lock_guard const lock(mutex_);
    slot.isDone = true;
    while (done_ < slots_.size() && slots_[done_].isDone)
        ++done_;
    if (wanted_ != 0 && done_ >= wanted_)
        areDone_.notify_one();
}

} // namespace foundation::storage::tool
