#include <storage/local/detail/move.hpp>

#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/moveAcross.hpp>
#include <storage/local/detail/nativePath.hpp>
#include <storage/local/detail/scratchName.hpp>
#include <storage/local/detail/sync.hpp>

#include <cerrno>
#include <cstdio>
#include <optional>
#include <unistd.h>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::ReplacementPolicy;
using provider::StorageIRI;

namespace {

/// Both ends of a move, as the client named them and as the system calls do.
struct Move
{
    Move(Settings const& settings, StorageIRI const& fromIRI, StorageIRI const& toIRI)
        : root(settings.root),
          isDurable(settings.durability == Durability::Full),
          from(fromIRI),
          to(toIRI),
          fromPath(root.pathOf(from)),
          toPath(root.pathOf(to))
    {
        if (int const error = find(fromPath, source))
            throwError(error, from);
        missing = find(toPath, target);
        if (missing != 0 && !meansMissing(missing))
            throwError(missing, to);
    }

    /// A source that is missing, too, is complained of first.
    void requireTargetFolder() const
    {
        if (missing != 0)
            throwError(missing, to);
    }

    int find(std::string const& path, Located& entry) const
    {
        return isDurable ? root.locateInFolder(path, entry) : root.locate(path, entry);
    }

    Root const& root;
    bool const isDurable;
    StorageIRI const& from;
    StorageIRI const& to;
    std::string fromPath;
    std::string toPath;
    Located source;
    Located target;
    int missing = 0; ///< the `errno` for which there is no folder to hold the target
};

/// Whether a file has to stay in its folder, although this user may write there: it is fixed, or of somebody else in a
/// folder of somebody else that is sticky.
bool hasToStay(Move const& move)
{
    constexpr auto fixed = STATX_ATTR_IMMUTABLE | STATX_ATTR_APPEND;
    Located parent;
    Status folder;
    Status file;
    if (move.root.locate(parentOf(move.fromPath), parent) != 0 ||
        getFullStatus(parent.at(), Links::Follow, folder) != 0 ||
        getFullStatus(move.source.at(), Links::Keep, file) != 0)
        return false;
    uid_t const user = ::geteuid();
    bool const isOurs = user == 0 || file.stx_uid == user || folder.stx_uid == user;
    return (file.stx_attributes & fixed) != 0 || ((folder.stx_mode & S_ISVTX) != 0 && !isOurs);
}

/// The end of a move that is to blame for an error that does not say.
StorageIRI const& culprit(int error, Move const& move)
{
    bool const forbidden = error == EACCES || error == EPERM;
    Status status;
    bool const atSource = forbidden
                              ? move.root.checkAccess(parentOf(move.fromPath), W_OK | X_OK) != 0 || hasToStay(move)
                              : meansMissing(getStatus(move.source.at(), Links::Keep, status));
    return atSource ? move.from : move.to;
}

void requireMoved(int error, Move const& move)
{
    if (error != 0)
        throwError(error, culprit(error, move));
}

Status requireSource(Move const& move)
{
    Status status;
    if (int const error = getStatus(move.source.at(), Links::Keep, status))
        throwError(error, move.from);
    return status;
}

/// Whether two paths lead to the same name in the same folder, rather than to two names of one file.
bool isSameEntry(Move const& move)
{
    Status from;
    Status to;
    return nameOf(move.fromPath) == nameOf(move.toPath) &&
           move.root.getStatus(parentOf(move.fromPath), Links::Follow, from) == 0 &&
           move.root.getStatus(parentOf(move.toPath), Links::Follow, to) == 0 && isSameFile(from, to);
}

bool lacksNoReplace(int error)
{
    return error == EINVAL || error == ENOSYS;
}

/// The other name may have become the only one, or mean something else.
void removeSecondName(At const& first, At const& second)
{
    Status status;
    Status other;
    if (getStatus(first, Links::Keep, status) == 0 && getStatus(second, Links::Keep, other) == 0 &&
        isSameFile(status, other))
        removeName(second);
}

/// For a file system without `RENAME_NOREPLACE`: a second name is never made over an existing one either.
int addSecondName(At const& from, At const& to)
{
    int const error = addName(from, to);
    return error == EPERM ? EOPNOTSUPP : error;
}

int removeFirstName(At const& from, At const& to)
{
    int const error = removeName(from);
    if (error != 0)
        removeSecondName(from, to);
    return error;
}

/// For a file system without `RENAME_NOREPLACE`: a folder is renamed over an empty folder only, and this one is ours.
int moveFolderOntoNewFolder(At const& from, At const& to)
{
    if (int const error = makeFolder(to))
        return error;
    int const error = renameEntry(from, to, 0);
    if (error != 0)
        removeEmptyFolder(to);
    return error;
}

/// It is gone when the target had become another file.
int removeScratch(Located const& scratch)
{
    int const error = removeName(scratch.at());
    return error == ENOENT ? 0 : error;
}

/// From one name of a file to another, which `rename` leaves both as they are. Once it has a name that nobody else
/// knows, neither name can have come to mean another file when it goes.
int moveBetweenNames(Move const& move)
{
    if (isSameEntry(move))
        return 0;
    Located scratch;
    if (int const error = move.root.locate(parentOf(move.toPath) + scratchName(), scratch))
        return error;
    if (int const error = renameEntry(move.source.at(), scratch.at(), RENAME_NOREPLACE))
        return error;
    int error = renameEntry(scratch.at(), move.target.at(), 0);
    if (error == 0)
        error = removeScratch(scratch);
    if (error != 0)
        renameEntry(scratch.at(), move.source.at(), RENAME_NOREPLACE);
    return error;
}

/// What stands at the target; nothing where nothing is. Not to know is a failure: what a guess replaces is lost.
std::optional<Status> findTarget(Move const& move, Links links)
{
    Status status;
    int const error = links == Links::Keep ? getStatus(move.target.at(), Links::Keep, status)
                                           : move.root.getStatus(move.toPath, Links::Follow, status);
    if (meansMissing(error))
        return std::nullopt;
    if (error != 0)
        throwError(error, move.to);
    return status;
}

/// Renamed over that file the link would lead to itself, and the content be lost.
bool isLinkTo(Status const& target, Move const& move, Status const& source)
{
    if (!isLink(source) || isFolder(target))
        return false;
    Status followed;
    int const error = move.root.getStatus(move.fromPath, Links::Follow, followed);
    if (error != 0 && !meansMissing(error))
        throwError(error, move.from);
    return error == 0 && isSameFile(followed, target);
}

/// Also by a link, if it leads where this user may look.
bool isFolderAtTarget(Status const& target, Move const& move)
{
    if (!isLink(target))
        return isFolder(target);
    Status followed;
    int const error = move.root.getStatus(move.toPath, Links::Follow, followed);
    if (error != 0 && !isUnreachable(error))
        throwError(error, move.to);
    return error == 0 && isFolder(followed);
}

int moveFilePreserving(Move const& move)
{
    At const from = move.source.at();
    At const to = move.target.at();
    int error = renameEntry(from, to, RENAME_NOREPLACE);
    if (!lacksNoReplace(error))
        return error;
    error = addSecondName(from, to);
    if (error == 0)
        if (int const cannotGo = removeFirstName(from, to))
            throwError(cannotGo, move.from);
    return error;
}

int moveFileReplacing(Move const& move, Status const& source)
{
    std::optional<Status> const target = findTarget(move, Links::Keep);
    if (target && isSameFile(source, *target))
        return moveBetweenNames(move);
    if (target && isLinkTo(*target, move, source))
        return removeName(move.source.at());
    if (target && isFolderAtTarget(*target, move))
        return EEXIST;
    int const error = renameEntry(move.source.at(), move.target.at(), 0);
    return error == EISDIR ? EEXIST : error;
}

void syncFolders(Move const& move)
{
    int error = move.isDurable ? syncFolder(move.target.folder()) : 0;
    if (move.isDurable && error == 0 && parentOf(move.fromPath) != parentOf(move.toPath))
        error = syncFolder(move.source.folder());
    if (error != 0)
        throwNotDurable(error, move.to);
}

/// That of the target is synced before anything goes.
void syncFolderOfSource(Move const& move)
{
    if (int const error = move.isDurable ? syncFolder(move.source.folder()) : 0)
        throwNotDurable(error, move.to);
}

bool isOntoItself(Move const& move, Status const& source)
{
    std::optional<Status> const target = findTarget(move, Links::Follow);
    return target && isSameFile(source, *target);
}

} // namespace

bool replaces(ReplacementPolicy policy)
{
    return policy == ReplacementPolicy::Overwrite || policy == ReplacementPolicy::Clobber;
}

int moveFileWithoutReplacing(At const& from, At const& to)
{
    int error = renameEntry(from, to, RENAME_NOREPLACE);
    if (!lacksNoReplace(error))
        return error;
    error = addSecondName(from, to);
    return error != 0 ? error : removeFirstName(from, to);
}

int moveFolderWithoutReplacing(At const& from, At const& to)
{
    int const error = renameEntry(from, to, RENAME_NOREPLACE);
    return lacksNoReplace(error) ? moveFolderOntoNewFolder(from, to) : error;
}

void moveFile(Settings const& settings, StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy,
              MoveWatch const& watch)
{
    Move const move(settings, from, to);
    Status const source = requireSource(move);
    if (isFolder(source))
        throwError(ErrorCode::ResourceNotFound, from);
    move.requireTargetFolder();
    int const error = replaces(policy) ? moveFileReplacing(move, source) : moveFilePreserving(move);
    if (error == EXDEV) {
        moveFileAcross(move.root, from, to, policy, watch);
        return syncFolderOfSource(move);
    }
    requireMoved(error, move);
    syncFolders(move);
}

void moveFolder(Settings const& settings, StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy,
                MoveWatch const& watch)
{
    Move const move(settings, from, to);
    Status const source = requireSource(move);
    if (!isFolder(source))
        throwNotAFolder(move.root, move.fromPath, from);
    move.requireTargetFolder();
    int error = moveFolderWithoutReplacing(move.source.at(), move.target.at());
    // Two file systems are told apart before anything is looked for.
    if (error == EXDEV && findTarget(move, Links::Keep))
        error = EEXIST;
    if (error == EEXIST && replaces(policy) && isOntoItself(move, source))
        return;
    if (error == EXDEV) {
        moveFolderAcross(move.root, from, to, watch);
        return syncFolderOfSource(move);
    }
    requireMoved(error, move);
    syncFolders(move);
}

void throwNotAFolder(Root const& root, std::string const& path, StorageIRI const& iri)
{
    throwError(root.leadsToFolder(path) ? ErrorCode::InvalidLocation : ErrorCode::ResourceNotFound, iri);
}

} // namespace foundation::storage::local::detail
