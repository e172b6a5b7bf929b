#include <tools/storage/OrderedWorkers.hpp>

#include <tools/storage/interrupt.hpp>
#include <tools/storage/readSome.hpp>

#include <algorithm>
#include <chrono>
#include <utility>

namespace foundation::storage::tool {

namespace {

/// How long an interrupt may go unseen while the caller waits.
constexpr std::chrono::milliseconds patience{20};

} // namespace

OrderedWorkers::OrderedWorkers(std::size_t threads, std::function<void()> onWait)
    : onWait_(std::move(onWait)), positions_(threads)
{
    HeldInterrupts const held;
    for (Position& position : positions_)
        threads_.emplace_back([this, &position](std::stop_token const& stop) { work(stop, position); });
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
        slots_.push_back({std::move(job), {}, {}, group_});
        ++waiting_;
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
    waiting_ = done_ = 0;
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
            ++removed_;
            --done_;
        }
        if (slot.failure)
            std::rethrow_exception(slot.failure);
        slot.report();
    }
}

void OrderedWorkers::work(std::stop_token const& stop, Position& position)
{
    WorkerContext context{makeTransferBuffer(), stop};
    while (Slot* const slot = takeJob(stop, position)) {
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
OrderedWorkers::Slot* OrderedWorkers::takeJob(std::stop_token const& stop, Position& position)
{
    std::unique_lock lock(mutex_);
    isWaiting_.wait(lock, stop, [this] { return waiting_ > 0; });
    if (stop.stop_requested())
        return nullptr;
    std::size_t const index = chooseJob(position);
    Slot& slot = slots_[index];
    slot.hasBegun = true;
    --waiting_;
    position = {slot.group, removed_ + index};
    return &slot;
}

/// As a rule the next job of a group stands behind the last, so that others are seldom looked for.
std::size_t OrderedWorkers::chooseJob(Position const& position) const
{
    // The slot of the last job may be gone.
    std::size_t const next = position.number < removed_ ? 0 : static_cast<std::size_t>(position.number - removed_) + 1;
    if (next < slots_.size() && !slots_[next].hasBegun && slots_[next].group == position.group)
        return next;
    std::size_t first = slots_.size();
    for (std::size_t i = done_; i < slots_.size(); ++i) {
        if (slots_[i].hasBegun)
            continue;
        if (slots_[i].group == position.group || !isTaken(slots_[i].group))
            return i;
        first = std::min(first, i);
    }
    return first;
}

bool OrderedWorkers::isTaken(std::uint64_t group) const
{
    return std::any_of(positions_.begin(), positions_.end(),
                       [&](Position const& position) { return position.group == group; });
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
