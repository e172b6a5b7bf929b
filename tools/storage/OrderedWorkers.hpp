#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <exception>
#include <functional>
#include <mutex>
#include <stop_token>
#include <thread>
#include <vector>

namespace foundation::storage::tool {

/// What a thread keeps for its jobs.
struct WorkerContext
{
    std::vector<char> buffer;
    std::stop_token stop; ///< asked to stop when nobody waits for the jobs any more
};

/// Does jobs in a few threads, and calls what they answer in the order in which they were added.
///
/// At most `window` jobs are kept, be they waiting, running or done and not yet reported: `add` waits when there are so
/// many. Memory therefore does not grow with the number of jobs, and a long job holds those back that came long after
/// it.
/// Jobs come in groups, such as the files of one folder. A thread goes on with the group that it is at, and keeps away
/// from those of the others while there is a job elsewhere: threads that make files in one folder wait for each other.
/// Threads: all but the jobs happens in the thread that made the object and calls it.
class OrderedWorkers
{
public:
    using Report = std::function<void()>;
    using Job = std::function<Report(WorkerContext& context)>;

    static constexpr std::size_t window = 1024;

    /// `onWait` is called again and again while this waits for jobs, and may end the wait by an exception.
    OrderedWorkers(std::size_t threads, std::function<void()> onWait);

    /// Drops jobs that have not begun, and waits for the others.
    ~OrderedWorkers();
    OrderedWorkers(OrderedWorkers const&) = delete;
    OrderedWorkers& operator=(OrderedWorkers const&) = delete;

    /// Takes a job on. Reports what is done; throws what a job threw when its turn to report has come.
    void add(Job job);

    /// Jobs added from now on are a group of their own.
    void beginGroup() { ++group_; }

    /// Waits until all are done and reported; throws as `add` does.
    void finish();

    /// Drops the jobs that have not begun, waits for the others, and reports those that ended well.
    void stop();

private:
    struct Slot
    {
        Job job;
        Report report;
        std::exception_ptr failure;
        std::uint64_t group = 0;
        bool hasBegun = false;
        bool isDone = false;
    };

    /// What a thread is at; the number is that of a slot, counted from the first ever.
    struct Position
    {
        std::uint64_t group = 0;
        std::uint64_t number = 0;
    };

    void work(std::stop_token const& stop, Position& position);
    Slot* takeJob(std::stop_token const& stop, Position& position);
    std::size_t chooseJob(Position const& position) const;
    bool isTaken(std::uint64_t group) const;
    void markDone(Slot& slot);
    void awaitAtMost(std::size_t count);
    void reportDone();
    void endThreads();

    std::function<void()> onWait_;
    std::mutex mutex_;
    std::condition_variable_any isWaiting_; ///< a job waits, for the threads
    std::condition_variable areDone_;       ///< enough jobs are done, for the caller
    std::deque<Slot> slots_;
    std::uint64_t removed_ = 0;       ///< the number of the first slot
    std::size_t waiting_ = 0;         ///< how many of the slots no thread has taken
    std::size_t done_ = 0;            ///< how many of the slots, from the first on, are done without a gap
    std::size_t wanted_ = 0;          ///< of `done_`, for the caller to go on; 0 when it does not wait
    std::uint64_t group_ = 1;         ///< of the next job; the caller's own
    std::vector<Position> positions_; ///< one for each thread, which alone changes it, under the mutex
    std::vector<std::jthread> threads_;
};

} // namespace foundation::storage::tool
