#pragma once

#include <storage/provider/ErrorCode.hpp>

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <optional>
#include <string>

namespace foundation::storage::conformance {

/// What a `FaultInjectingProvider` does wrong; as it stands, nothing.
///
/// What counts as an operation, each under its public name: the operations of the provider that have a location; of its
/// streams `read`, `write`, `seek` and `close`, of a transactional stream `commit` and `abort` in place of `close`; of
/// its listings `next` and `reset`.
struct FaultPlan
{
    /// The operation that fails, counted from 1, without reaching the wrapped provider; 0 for none.
    std::size_t failing = 0;

    /// Count operations of this name alone.
    std::string counted = {};

    /// Whether everything counted that comes after the failing operation fails as well.
    bool broken = false;

    provider::ErrorCode code = provider::ErrorCode::IOError;

    /// Before every operation.
    std::chrono::microseconds delay = {};

    /// How many bytes a stream moves at most with one call.
    long longestRead = std::numeric_limits<long>::max();
    long longestWrite = std::numeric_limits<long>::max();

    /// How many bytes each stream moves before it fails.
    std::optional<std::uint64_t> readFailsAfter = {};
    std::optional<std::uint64_t> writeFailsAfter = {};

    /// Whether closing a stream fails, when it has closed the wrapped one.
    bool closeFails = false;

    /// The size of every file, as attributes tell it and as seeking to the end finds it.
    std::optional<std::uint64_t> claimedSize = {};

    /// Whether a transactional stream is made as every provider's is unless it has its own, of operations that may
    /// fail, rather than by the wrapped provider in one piece.
    bool composeTransactions = false;
};

} // namespace foundation::storage::conformance
