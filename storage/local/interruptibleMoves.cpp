#include <storage/local/interruptibleMoves.hpp>

#include <storage/local/detail/Settings.hpp>
#include <storage/local/detail/durableMove.hpp>

namespace foundation::storage::local {

using provider::StorageIRI;
using provider::TransactionStatus;

namespace {

detail::Settings settingsOf(MoveOptions const& options)
{
    detail::Settings settings;
    settings.durability = options.isSynced ? detail::Durability::Full : detail::Durability::None;
    return settings;
}

} // namespace

TransactionStatus moveFileInterruptibly(StorageIRI const& from, StorageIRI const& to, MoveOptions const& options)
{
    return detail::moveFileDurably(settingsOf(options), from, to, options.policy, options.observer);
}

TransactionStatus moveFolderInterruptibly(StorageIRI const& from, StorageIRI const& to, MoveOptions const& options)
{
    return detail::moveFolderDurably(settingsOf(options), from, to, options.policy, options.observer);
}

} // namespace foundation::storage::local
