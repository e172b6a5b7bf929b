#pragma once

#include <cstddef>
#include <new>

namespace foundation::tests::support {

/// How often this thread has called `operator new` so far.
std::size_t allocations();

/// How many more blocks this thread has taken from `operator new` than it has given back.
std::ptrdiff_t livingAllocations();

/// The bytes of those blocks.
std::ptrdiff_t livingBytes();

/// How often `action` calls `operator new`.
template <class Action>
std::size_t allocationsOf(Action action)
{
    std::size_t const before = allocations();
    action();
    return allocations() - before;
}

/// While one lives, the allocation of this thread with the given number, counted from 1, fails. One at a time.
class FailingAllocation
{
public:
    explicit FailingAllocation(std::size_t number);
    FailingAllocation(FailingAllocation const&) = delete;
    FailingAllocation& operator=(FailingAllocation const&) = delete;
    ~FailingAllocation();
};

/// Runs `action` again and again, with its first, second, third … allocation failing, until none is left to fail, and
/// `afterFailure` after each run that ended with `std::bad_alloc`. Answers how many did.
template <class Action, class Check>
std::size_t failEachAllocationOf(Action action, Check afterFailure)
{
    for (std::size_t failed = 0;; ++failed) {
        try {
            FailingAllocation const failing(failed + 1);
            action();
            return failed;
        } catch (std::bad_alloc const&) {
        }
        afterFailure();
    }
}

} // namespace foundation::tests::support
