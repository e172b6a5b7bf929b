#pragma once

#include <storage/local/detail/Settings.hpp>
#include <storage/local/interruptibleMoves.hpp>

namespace foundation::storage::local::detail {

// Moves, as durable as the settings say: under `Durability::Full` they return when both folders are on the disk. A file
// with the name of a scratch file is synced before it gets another one, whatever else is, unless nothing is.
//
// Errors: `Exception`; `DurabilityException` when all was moved and a folder could not be synced.

provider::TransactionStatus moveFileDurably(Settings const& settings, provider::StorageIRI const& from,
                                            provider::StorageIRI const& to, provider::ReplacementPolicy policy,
                                            MoveObserver const& observer = {});
provider::TransactionStatus moveFolderDurably(Settings const& settings, provider::StorageIRI const& from,
                                              provider::StorageIRI const& to, provider::ReplacementPolicy policy,
                                              MoveObserver const& observer = {});

} // namespace foundation::storage::local::detail
