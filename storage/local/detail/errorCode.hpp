#pragma once

#include <foundation/export.hpp>
#include <storage/provider/ErrorCode.hpp>
#include <storage/provider/StorageIRI.hpp>

namespace foundation::storage::local::detail {

/// What an `errno` means to the caller; 0 and every number that is not known here is `Unknown`.
FOUNDATION_API provider::ErrorCode toErrorCode(int error);

/// Throws the `Exception` for an `errno` at a location.
[[noreturn]] void throwError(int error, provider::StorageIRI const& iri);

[[noreturn]] void throwError(provider::ErrorCode code, provider::StorageIRI const& iri);

/// The same, with words for what the code does not tell; see `ReasonInfo`.
[[noreturn]] void throwError(int error, provider::StorageIRI const& iri, char16_t const* reason);

/// Whether an `errno` says that nothing is there to which the path leads, be it for a missing name, a file in the place
/// of a folder, links that loop, or a name longer than any name can be.
bool meansMissing(int error);

/// Whether an `errno` says that a link leads nowhere, or where this user may not look.
bool isUnreachable(int error);

} // namespace foundation::storage::local::detail
