#pragma once

#include <deque>

namespace foundation::tests::support {

/// While one lives, `getrandom` of this thread fails with the given error numbers, one a call, and then works again.
/// One at a time.
class FailingGetrandom
{
public:
    explicit FailingGetrandom(std::deque<int> errors);
    FailingGetrandom(FailingGetrandom const&) = delete;
    FailingGetrandom& operator=(FailingGetrandom const&) = delete;
    ~FailingGetrandom();

    /// Whether every error has been reported.
    bool hasFailed() const;
};

} // namespace foundation::tests::support
