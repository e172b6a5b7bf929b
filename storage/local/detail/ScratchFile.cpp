#include <storage/local/detail/ScratchFile.hpp>

#include <storage/local/detail/copyContent.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/metadata.hpp>
#include <storage/local/detail/move.hpp>
#include <storage/local/detail/nativePath.hpp>
#include <storage/local/detail/scratchName.hpp>
#include <storage/local/detail/sync.hpp>

#include <cerrno>
#include <unistd.h>
#include <utility>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::ReplacementPolicy;
using provider::StorageIRI;

namespace {

constexpr unsigned permissionBits = 0777;

/// Not every file system that makes files without names can name them, and the system may lack /proc.
bool meansNeverNamed(int error)
{
    return error == ENOENT || error == EPERM || error == EOPNOTSUPP;
}

} // namespace

ScratchFile::ScratchFile(Root const& root, StorageIRI const& target, Durability durability, int flags, mode_t mode,
                         Permissions permissions)
    : root_(root),
      target_(target),
      scratch_(target),
      path_(root.pathOf(target)),
      name_(nameOf(path_)),
      durability_(durability),
      permissions_(permissions)
{
    openFolders(path_);
    std::optional<mode_t> const replaced = modeOfTarget();
    if (!replaced && openNameless(flags, mode))
        return;
    scratchName_ = detail::scratchName();
    int const error = openFile(scratchAt(), flags | O_CREAT | O_EXCL | O_NOFOLLOW, file_, replaced.value_or(mode));
    if (error != 0)
        throwError(error, scratch_);
}

ScratchFile::ScratchFile(Root const& root, StorageIRI const& target, StorageIRI const& scratch, Durability durability,
                         int flags)
    : root_(root),
      target_(target),
      scratch_(scratch),
      path_(root.pathOf(target)),
      name_(nameOf(path_)),
      durability_(durability)
{
    std::string const scratchPath = root.pathOf(scratch);
    scratchName_ = nameOf(scratchPath);
    openFolders(scratchPath);
    openScratch(flags);
}

ScratchFile::~ScratchFile()
{
    if (state_ == State::Writing && !isNameless())
        removeName(scratchAt());
}

At ScratchFile::scratchAt() const
{
    FileDescriptor const& folder = scratchFolder_.isOpen() ? scratchFolder_ : folder_;
    return {folder.get(), scratchName_.c_str()};
}

/// A folder can be synced only by who may read it.
void ScratchFile::openFolders(std::string const& scratchPath)
{
    if (root_.isTop(path_))
        throwError(ErrorCode::ResourceAlreadyExists, target_);
    std::string const parent = parentOf(path_);
    int error = EACCES;
    if (durability_ == Durability::Full)
        error = root_.open(parent, O_RDONLY | O_DIRECTORY, folder_);
    isFolderReadable_ = error == 0;
    if (error == EACCES)
        error = root_.open(parent, O_PATH | O_DIRECTORY, folder_);
    if (error == 0 && parentOf(scratchPath) != parent)
        error = root_.open(parentOf(scratchPath), O_PATH | O_DIRECTORY, scratchFolder_);
    if (error != 0)
        throwError(error, scratch_);
}

/// Not where a name has to be replaced in the end, which takes a name. Readable, too, for `copyToNamed`. Where it
/// fails, a file with a name does as well, or tells what is wrong.
bool ScratchFile::openNameless(int flags, mode_t mode)
{
    if (durability_ != Durability::None)
        return false;
    return openFile({folder_.get(), "."}, (flags & ~O_ACCMODE) | O_RDWR | O_TMPFILE, file_, mode) == 0;
}

/// A new name is nobody's: not a link that somebody has put there, and not another writer's file.
void ScratchFile::openScratch(int flags)
{
    int error = EEXIST;
    if ((flags & O_CREAT) != 0)
        error = openFile(scratchAt(), flags | O_EXCL | O_NOFOLLOW, file_, modeOfTarget().value_or(newFileMode));
    if (error == EEXIST)
        error = openExisting(flags & ~O_CREAT);
    if (error == EISDIR)
        throwError(ErrorCode::ResourceNotFound, scratch_);
    if (error != 0)
        throwError(error, scratch_);
}

int ScratchFile::openExisting(int flags)
{
    if (int const error = openFile(scratchAt(), flags | O_NOFOLLOW | O_NOCTTY | O_NONBLOCK, file_))
        return error;
    Status status;
    if (int const error = getStatus(file_, status))
        return error;
    return S_ISREG(status.stx_mode) ? 0 : EOPNOTSUPP;
}

/// What stands at the target, or what a link there leads to.
int ScratchFile::findTarget(Status& status) const
{
    if (int const error = getStatus(targetAt(), Links::Keep, status))
        return error;
    int const error = isLink(status) ? root_.getStatus(path_, Links::Follow, status) : 0;
    return isUnreachable(error) ? ENOENT : error;
}

/// The content of a file that others may not read is not for them while it is being written either. Nothing where no
/// file is replaced, or its permissions do not matter.
std::optional<mode_t> ScratchFile::modeOfTarget() const
{
    if (permissions_ == Permissions::Own)
        return std::nullopt;
    Status target;
    int const error = findTarget(target);
    if (error != 0 && !meansMissing(error))
        throwError(error, target_);
    return error == 0 && S_ISREG(target.stx_mode) ? std::optional(target.stx_mode & permissionBits) : std::nullopt;
}

void ScratchFile::commit(ReplacementPolicy policy)
{
    if (state_ == State::Writing) {
        if (replaces(policy))
            keepPermissions();
        // Before the name, or a power failure could leave the name without the content.
        writeContentBack();
        putInPlace(policy);
        state_ = State::InPlace;
    }
    // Until then a power failure can bring the old content back.
    int const error = durability_ == Durability::Full && state_ == State::InPlace ? syncFolder() : 0;
    if (error != 0)
        throwNotDurable(error, target_);
    finish();
}

/// Before the content is synced, which syncs the permissions too.
void ScratchFile::keepPermissions()
{
    Status target;
    int const error = findTarget(target);
    if (error != 0 && !meansMissing(error))
        throwError(error, target_);
    if (error == 0 && isFolder(target))
        throwError(ErrorCode::ResourceAlreadyExists, target_);
    if (error == 0 && S_ISREG(target.stx_mode) && permissions_ == Permissions::OfTarget)
        setPermissions(target.stx_mode & permissionBits);
}

void ScratchFile::setPermissions(mode_t mode)
{
    Status scratch;
    int error = getStatus(file_, scratch);
    if (error == 0 && (scratch.stx_mode & permissionBits) != mode)
        error = errorOf([&] { return systemCalls().fchmod(file_.get(), mode); });
    if (error != 0)
        throwError(error, target_);
}

/// Closing reports what a file system over the network could not write. The file stays open: that is how others know
/// that somebody needs it.
int ScratchFile::closeDuplicate()
{
    FileDescriptor duplicate(retried([&] { return systemCalls().dup(file_.get()); }));
    if (!duplicate.isOpen())
        throwError(errno, target_);
    return duplicate.close();
}

/// The system reports what it lost once: a second sync would find nothing left to write, and succeed.
void ScratchFile::writeContentBack()
{
    if (lost_ == 0)
        lost_ = durability_ == Durability::None ? closeDuplicate() : sync(file_, file_);
    if (lost_ != 0)
        throwError(lost_, target_);
}

void ScratchFile::putInPlace(ReplacementPolicy policy)
{
    int error = isNameless() ? nameInPlace(policy) : moveInPlace(policy);
    if (error == EISDIR)
        error = EEXIST;
    Status status;
    if (error == ENOENT && !isNameless() && meansMissing(getStatus(scratchAt(), Links::Keep, status)))
        throwError(error, scratch_);
    if (error != 0)
        throwError(error, target_);
}

int ScratchFile::moveInPlace(ReplacementPolicy policy)
{
    return replaces(policy) ? renameEntry(scratchAt(), targetAt(), 0)
                            : moveFileWithoutReplacing(scratchAt(), targetAt());
}

/// A name is never given in place of another: what turned up meanwhile is replaced by way of a scratch name.
int ScratchFile::nameInPlace(ReplacementPolicy policy)
{
    int error = nameFile(file_, targetAt());
    bool const needsScratchName = error == EEXIST ? replaces(policy) : meansNeverNamed(error);
    if (!needsScratchName)
        return error;
    error = giveScratchName();
    return error != 0 ? error : moveInPlace(policy);
}

int ScratchFile::giveScratchName()
{
    scratchName_ = detail::scratchName();
    int error = nameFile(file_, scratchAt());
    if (meansNeverNamed(error))
        error = copyToNamed();
    if (error != 0)
        scratchName_.clear();
    return error;
}

int ScratchFile::copyToNamed()
{
    FileDescriptor named;
    if (int const error = openFile(scratchAt(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, named, 0))
        return error;
    if (int const error = copyAll(named)) {
        removeName(scratchAt());
        return error;
    }
    file_ = std::move(named);
    writeContentBack();
    return 0;
}

int ScratchFile::copyAll(FileDescriptor const& to) const
{
    Status status;
    if (int const error = getFullStatus(file_, status))
        return error;
    if (systemCalls().lseek(file_.get(), 0, SEEK_SET) == -1)
        return errno;
    if (int const error = copyContent(file_, status, to, {}).error)
        return error;
    if (int const error = keepUserAttributes(file_.get(), to.get()).error)
        return error;
    if (int const error = errorOf([&] { return systemCalls().fchmod(to.get(), status.stx_mode & permissionBits); }))
        return error;
    return keepTimes(to.get(), status);
}

int ScratchFile::syncFolder()
{
    return isFolderReadable_ ? sync(folder_, file_) : syncFileSystem(file_);
}

void ScratchFile::discard()
{
    if (state_ == State::Writing && !isNameless())
        if (int const error = removeName(scratchAt()))
            throwError(error, scratch_);
    finish();
}

/// The content was written back before, or is not wanted: closing has nothing to report.
void ScratchFile::finish()
{
    state_ = State::Done;
    file_ = FileDescriptor();
    folder_ = FileDescriptor();
    scratchFolder_ = FileDescriptor();
}

} // namespace foundation::storage::local::detail
