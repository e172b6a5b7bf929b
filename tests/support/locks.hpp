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

} // namespace foundation::tests::support
