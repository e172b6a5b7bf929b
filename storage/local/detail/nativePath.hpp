#pragma once

#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>

namespace foundation::storage::local::detail {

/// The path of a location for the system calls: absolute, without trailing slashes but the root's.
///
/// Throws `Exception` with `InvalidLocation` for what names no local file: another scheme or host, a query or fragment
/// (a name that holds `?` or `#` is written with `%3F` or `%23`), a place inside a container, no path, U+0000, a lone
/// surrogate.
FOUNDATION_API std::string nativePath(provider::StorageIRI const& iri);

/// Such a path up to its last slash, that slash included.
FOUNDATION_API std::string parentOf(std::string const& path);

/// What follows the last slash of such a path; empty for the root.
FOUNDATION_API std::string nameOf(std::string const& path);

} // namespace foundation::storage::local::detail
