#pragma once

#include <storage/local/interruptibleMoves.hpp>

#include <cstdint>

namespace foundation::storage::local::detail {

/// Thrown through a move that somebody has interrupted, up to where it began; on the way nothing is left of its copy.
struct MoveInterrupted
{};

/// What a move that copies tells its observer, who may not be interested. Refers to the observer.
class MoveWatch
{
public:
    explicit MoveWatch(MoveObserver const& observer) : observer_(observer) {}

    /// Throws `MoveInterrupted`, or what the observer throws.
    void check() const
    {
        if (observer_.interrupt && observer_.interrupt() != provider::InterruptSignal::Continue)
            throw MoveInterrupted();
    }

    void tellBytes(std::uint64_t count) const
    {
        if (observer_.onBytes && count > 0)
            observer_.onBytes(count);
    }

    void tellFile() const
    {
        if (observer_.onFile)
            observer_.onFile();
    }

private:
    MoveObserver const& observer_;
};

} // namespace foundation::storage::local::detail
