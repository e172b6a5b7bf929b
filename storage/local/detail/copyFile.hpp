#pragma once

#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Settings.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/TransactionStatus.hpp>

namespace foundation::storage::local::detail {

// A file that the copy makes has the permission bits of its source less the umask; one that was there keeps its own. A
// file copied onto itself, also through a link or another name, stays as it is. What the setting `preserve` names is
// kept too; what the target cannot keep fails there.
//
// Errors: `Exception`. What stands in the way at the target comes before what is wrong with the source.

/// Writes into the target itself. What fails half-way leaves half of it, and names `from`, whichever end it was.
void copyFile(Settings const& settings, provider::StorageIRI const& from, provider::StorageIRI const& to,
              provider::ReplacementPolicy policy);

/// Writes beside the target, which then takes the new content whole or stays as it is. Failures name the end that
/// failed.
provider::TransactionStatus copyFileAtomic(Settings const& settings, provider::StorageIRI const& from,
                                           provider::StorageIRI const& to, provider::ReplacementPolicy policy,
                                           provider::IProvider::Interrupt const& interrupt);

} // namespace foundation::storage::local::detail
