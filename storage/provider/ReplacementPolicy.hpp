#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// What a copy or move does when something stands at the target already.
enum class ReplacementPolicy : std::int32_t
{
    Preserve,  ///< refuse: what is there stays
    Overwrite, ///< replace an existing file, never a folder
    Clobber,   ///< replace an existing file, never a folder
    NoClobber, ///< refuse: what is there stays
};

/// Writes "ReplacementPolicy::" and the enumerator; nothing for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ReplacementPolicy value);

} // namespace foundation::storage::provider
