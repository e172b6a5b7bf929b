#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// What a location holds.
enum class ExistenceType : std::int32_t
{
    AsFile,
    AsFolder,
    AsNeither,
};

/// What a location holds, with links and special files told apart.
enum class ExistenceTypeExtended : std::int32_t
{
    RegularFile,
    SpecialFile, ///< device, pipe, socket
    RegularFolder,
    SymlinkToFile,
    SymlinkToFolder,
    BrokenSymlink, ///< a link whose target is missing or loops
    None,          ///< nothing is there
};

/// Writes the bare enumerator; for any other value nothing, and sets `failbit`.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ExistenceType const& value);

/// Writes the bare enumerator; nothing for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ExistenceTypeExtended const& value);

} // namespace foundation::storage::provider
