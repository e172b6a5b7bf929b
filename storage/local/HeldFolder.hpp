#pragma once

#include <foundation/export.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <memory>

namespace foundation::storage::local {

namespace detail {
class FileDescriptor;
} // namespace detail

/// A local folder that is held open: whatever is renamed or swapped on the path to it, what is done at its location,
/// and below, is done in this folder.
///
/// Ownership: a small value; copies share a descriptor, and the location is good while one of them lives.
/// Threads: any number at once.
/// Cost: a descriptor. Operations below need `/proc`, and are faster than those along a long path.
class FOUNDATION_API HeldFolder
{
public:
    explicit HeldFolder(detail::FileDescriptor folder);

    /// A location in `/proc`, for this process alone, which ends in "." so that it is no link.
    provider::StorageIRI location() const;

private:
    std::shared_ptr<detail::FileDescriptor const> folder_;
};

} // namespace foundation::storage::local
