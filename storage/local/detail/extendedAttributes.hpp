#pragma once

#include <storage/local/detail/Root.hpp>
#include <storage/provider/ExtendedAttributes.hpp>
#include <storage/provider/StorageIRI.hpp>

namespace foundation::storage::local::detail {

/// What the system knows of a file or folder, or of what a link leads to.
///
/// `std::uint32_t`: `mode` (permissions, set-user-id, set-group-id and sticky bit), `uid`, `gid`, `links`.
/// `std::uint64_t`: `inode`, `device`, `allocated` (bytes on the disk, which holes are not).
/// `boost::posix_time::ptime`, UTC: `accessTime`, `changeTime` (of attributes, too), and `birthTime` where the file
/// system keeps it.
/// `std::string`, any bytes: each extended attribute that this user may read, by its name that begins with `user.`.
///
/// Throws `Exception` for the location.
provider::ExtendedAttributes getExtendedAttributes(Root const& root, provider::StorageIRI const& iri);

} // namespace foundation::storage::local::detail
