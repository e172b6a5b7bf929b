#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/ReplacementPolicy.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/TransactionStatus.hpp>

#include <cstdint>
#include <functional>

namespace foundation::storage::local {

/// Hears of a move that has to copy, because it goes to another file system. What its functions throw passes, and ends
/// the move as an interruption does; an empty one is not called.
struct MoveObserver
{
    /// Asked before each MiB that is copied or read back, and for each entry of a folder.
    provider::IProvider::Interrupt interrupt = {};

    /// Told of bytes that are done: half of those of a file count as it is copied, the others as it is read back.
    std::function<void(std::uint64_t count)> onBytes = {};

    /// Told of each file that is copied and compared.
    std::function<void()> onFile = {};
};

struct MoveOptions
{
    provider::ReplacementPolicy policy = provider::ReplacementPolicy::NoClobber;
    bool isSynced = true; ///< as the setting `durability` says with `full`, else as with `none`
    MoveObserver observer = {};
};

// Moves of local files and folders, as `LocalProvider` makes them with `moveFile` and `moveFolder`, that can be
// interrupted: until the copy stands at the target, which is the end of asking, both ends are then as they were, and
// the answer is `Aborted`.
//
// Errors: `provider::Exception` as from the provider, with a `ReasonInfo` where the code does not tell.

FOUNDATION_API provider::TransactionStatus
moveFileInterruptibly(provider::StorageIRI const& from, provider::StorageIRI const& to, MoveOptions const& options);
FOUNDATION_API provider::TransactionStatus
moveFolderInterruptibly(provider::StorageIRI const& from, provider::StorageIRI const& to, MoveOptions const& options);

} // namespace foundation::storage::local
