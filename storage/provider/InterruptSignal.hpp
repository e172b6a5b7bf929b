#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// What the progress callback of a copy answers.
enum class InterruptSignal : std::int32_t
{
    Continue,
    Abort, ///< stop after the chunk just written
};

/// Writes "InterruptSignal::" and the enumerator; nothing for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, InterruptSignal const& value);

} // namespace foundation::storage::provider
