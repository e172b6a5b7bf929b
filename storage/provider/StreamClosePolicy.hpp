#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// What becomes of the bytes written to a transactional stream when it is closed.
enum class StreamClosePolicy : std::int32_t
{
    Commit, ///< they take effect at the target
    Abort,  ///< they are thrown away
};

/// Writes "StreamClosePolicy::" and the enumerator; nothing for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, StreamClosePolicy const& value);

} // namespace foundation::storage::provider
