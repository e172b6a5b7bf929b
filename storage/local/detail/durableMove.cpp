#include <storage/local/detail/durableMove.hpp>

#include <storage/local/detail/MoveWatch.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/move.hpp>
#include <storage/local/detail/nativePath.hpp>
#include <storage/local/detail/scratchName.hpp>
#include <storage/local/detail/sync.hpp>

#include <cerrno>

namespace foundation::storage::local::detail {

using provider::ReplacementPolicy;
using provider::StorageIRI;
using provider::TransactionStatus;

namespace {

/// Nothing is to be synced of what is missing, a link or a socket; the move tells whether that matters.
int syncContent(Root const& root, std::string const& path)
{
    constexpr int flags = O_NOFOLLOW | O_NOCTTY | O_NONBLOCK;
    FileDescriptor file;
    int error = root.open(path, O_RDONLY | flags, file);
    if (error == EACCES)
        error = root.open(path, O_WRONLY | flags, file);
    if (error == 0)
        return sync(file, file);
    return meansMissing(error) || error == ELOOP || error == ENXIO ? 0 : error;
}

/// Who writes to a scratch file and moves it to its place relies on it as on a transaction.
void syncScratchFile(Settings const& settings, StorageIRI const& from)
{
    std::string const path = settings.root.pathOf(from);
    if (settings.durability == Durability::None || !isScratchName(nameOf(path)))
        return;
    if (int const error = syncContent(settings.root, path))
        throwError(error, from);
}

template <typename Action>
TransactionStatus unlessInterrupted(Action const& action)
{
    try {
        action();
    } catch (MoveInterrupted const&) {
        return TransactionStatus::Aborted;
    }
    return TransactionStatus::Completed;
}

} // namespace

TransactionStatus moveFileDurably(Settings const& settings, StorageIRI const& from, StorageIRI const& to,
                                  ReplacementPolicy policy, MoveObserver const& observer)
{
    return unlessInterrupted([&] {
        syncScratchFile(settings, from);
        moveFile(settings, from, to, policy, MoveWatch(observer));
    });
}

TransactionStatus moveFolderDurably(Settings const& settings, StorageIRI const& from, StorageIRI const& to,
                                    ReplacementPolicy policy, MoveObserver const& observer)
{
    return unlessInterrupted([&] { moveFolder(settings, from, to, policy, MoveWatch(observer)); });
}

} // namespace foundation::storage::local::detail
