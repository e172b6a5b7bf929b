#pragma once

#include <fl/filesystem/upath.hpp>
#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>

namespace foundation::storage::provider {

/// The location of a file-system path under a scheme, the path taken as it is.
///
/// Errors: `std::runtime_error` for a relative path; an empty one is accepted.
[[nodiscard]] FOUNDATION_API StorageIRI toStorageIRI(std::u16string const& scheme, fl::filesystem::upath const& path);

/// The location of the one path that a file or folder has: absolute, without links, "." and "..".
///
/// Errors: `Exception` that names the location of the path as given: `PermissionDenied`, `ResourceNotFound`,
/// `InvalidLocation` (a path that cannot be one, or leads in circles) or `IOError`. `std::runtime_error` for a relative
/// path, and for any failure that is none of the file system, with its diagnostic text.
/// Cost: asks the file system.
[[nodiscard]] FOUNDATION_API StorageIRI toCanonicalizedStorageIRI(std::u16string const& scheme,
                                                                  fl::filesystem::upath const& path);

/// The file-system path of a location.
///
/// Errors: `std::logic_error` for a location inside a container.
[[nodiscard]] FOUNDATION_API fl::filesystem::upath fromStorageIRI(StorageIRI const& iri);

} // namespace foundation::storage::provider
