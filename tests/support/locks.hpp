#pragma once

#include <cstddef>

namespace foundation::tests::support {

/// How often this thread has locked a mutex so far.
std::size_t locks();

/// How often `action` locks a mutex.
template <class Action>
std::size_t locksOf(Action action)
{
    std::size_t const before = locks();
    action();
    return locks() - before;
}

/// While one lives, the next mutex that this thread locks fails with the given error number, once. One at a time.
class FailingLock
{
public:
    explicit FailingLock(int error);
    FailingLock(FailingLock const&) = delete;
    FailingLock& operator=(FailingLock const&) = delete;
    ~FailingLock();
};

} // namespace foundation::tests::support
