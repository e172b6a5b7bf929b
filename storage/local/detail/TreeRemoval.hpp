#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/checkedRemoval.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>
#include <vector>

namespace foundation::storage::local::detail {

struct RemovalFailure
{
    int error;
    std::string path; ///< from the folder; empty for the folder itself
};

enum class Failures
{
    First,
    All,
};

/// Removes a folder with all it holds, and never what a link leads to or what is mounted on a folder below.
///
/// What cannot be removed stays, with the folders on the way to it, and all else goes; then throws `Exception` for the
/// first entry that stays. What others remove meanwhile is no failure.
/// Cost: one call for each file, about six for each folder. Memory for the names of a batch of entries, and for those
/// of folders beside the way to where it works.
void removeTree(Root const& root, provider::StorageIRI const& folder);

/// The same, but answers the failures that are wanted instead of throwing for entries that stay.
std::vector<RemovalFailure> removeTree(Root const& root, provider::StorageIRI const& folder, Failures wanted);

/// The same for a folder by its name in an open one; failures are told of below `folder`. `mayRemove`, if any, is asked
/// of each file, link and emptied folder; nothing goes that it has not seen.
void removeTree(FileDescriptor parent, std::string const& name, provider::StorageIRI const& folder,
                MayRemove mayRemove = {});

} // namespace foundation::storage::local::detail
