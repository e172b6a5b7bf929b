#pragma once

#include <storage/local/detail/MoveWatch.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Settings.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>

namespace foundation::storage::local::detail {

bool replaces(provider::ReplacementPolicy policy);

/// Gives what is no folder another name, in one step where the file system can: `EEXIST` when that is taken, even by
/// somebody who was faster by a moment. Answers 0 or `errno`.
[[nodiscard]] int moveFileWithoutReplacing(At const& from, At const& to);

/// The same for a folder, which replaces nothing at all.
[[nodiscard]] int moveFolderWithoutReplacing(At const& from, At const& to);

// From one file system to another they copy, see `moveAcross.hpp`. Under `Durability::Full` both folders are synced,
// that of the target first: in this order a power failure can leave what is moved with both names, never without one.

void moveFile(Settings const& settings, provider::StorageIRI const& from, provider::StorageIRI const& to,
              provider::ReplacementPolicy policy, MoveWatch const& watch);
void moveFolder(Settings const& settings, provider::StorageIRI const& from, provider::StorageIRI const& to,
                provider::ReplacementPolicy policy, MoveWatch const& watch);

/// Throws what is wrong with a location where a folder itself, not a link to one, had to stand.
[[noreturn]] void throwNotAFolder(Root const& root, std::string const& path, provider::StorageIRI const& iri);

} // namespace foundation::storage::local::detail
