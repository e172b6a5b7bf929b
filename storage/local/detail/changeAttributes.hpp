#pragma once

#include <storage/local/detail/Root.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>

namespace foundation::storage::local::detail {

// Of files and folders, and of what a link leads to. They throw `Exception` for the location.

/// Keeps the time of the last access. A time that the file system cannot hold becomes the nearest that it can; a
/// special one is refused with `UnsupportedOperation`.
void setLastModified(Root const& root, provider::StorageIRI const& iri, boost::posix_time::ptime const& time);

/// Lets the owner write, or nobody.
void setWritable(Root const& root, provider::StorageIRI const& iri, bool writable);

} // namespace foundation::storage::local::detail
