#pragma once

#include <storage/local/detail/SystemCalls.hpp>

#include <cerrno>

namespace foundation::tests::support {

/// Calls of the operating system that a test puts in the place of the real ones, for as long as this lives.
class ReplacedSystemCalls
{
public:
    ReplacedSystemCalls() : previous_(storage::local::detail::replaceSystemCalls(calls_)) {}
    ~ReplacedSystemCalls() { storage::local::detail::replaceSystemCalls(previous_); }
    ReplacedSystemCalls(ReplacedSystemCalls const&) = delete;
    ReplacedSystemCalls& operator=(ReplacedSystemCalls const&) = delete;

    storage::local::detail::SystemCalls* operator->() { return &calls_; }

private:
    storage::local::detail::SystemCalls calls_ = storage::local::detail::realSystemCalls;
    storage::local::detail::SystemCalls const& previous_;
};

/// Puts `error` into `errno`, and answers the failure of a call.
inline int failWith(int error)
{
    errno = error;
    return -1;
}

} // namespace foundation::tests::support
