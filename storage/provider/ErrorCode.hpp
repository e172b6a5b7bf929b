#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>
#include <string>

namespace foundation::storage::provider {

/// The kind of failure that an `Exception` carries; each is named for what the caller can do about it.
enum class ErrorCode : std::int32_t
{
    FolderNotEmpty,        ///< remove the contents first
    InvalidLocation,       ///< the location cannot name what was asked for; asking again will not help
    PermissionDenied,      ///< the store forbids it to this user
    ResourceAlreadyExists, ///< choose another target or a replacing policy
    ResourceNotFound,      ///< nothing of the wanted kind is there
    FileTooLarge,          ///< the store cannot hold a file of this size
    ResourceInUse,         ///< somebody holds it; may succeed later
    ReadOnlyProvider,      ///< this store never changes
    NoSpaceLeft,           ///< may succeed once space is freed
    IOError,               ///< the transfer failed
    InternalError,         ///< a defect of the provider
    UnsupportedOperation,  ///< this provider cannot do it; ask another way
    Unknown,               ///< none of the above
};

/// The text that the printer writes: "ErrorCode::" and the enumerator, or "Unhandled ErrorCode" for any other value.
FOUNDATION_API std::string toString(ErrorCode code);

FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ErrorCode const& code);

} // namespace foundation::storage::provider
