#include <storage/local/scratchFiles.hpp>

#include <storage/local/detail/FolderChain.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/TreeRemoval.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/scratchName.hpp>

#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <string>
#include <utility>

namespace foundation::storage::local {

using namespace detail;
using provider::ErrorCode;
using provider::StorageIRI;

namespace {

/// Finds out whether somebody still needs what a writer left.
class Examination
{
public:
    Examination(StorageIRI const& iri, std::chrono::seconds age) : iri_(iri), age_(age) {}

    ScratchFileState byAge(statx_timestamp const& changed) const
    {
        // `time` may be a tick behind what the kernel stamps files with.
        auto const now = std::chrono::floor<std::chrono::seconds>(std::chrono::system_clock::now());
        bool const isRecent = now.time_since_epoch() - std::chrono::seconds(changed.tv_sec) < age_;
        return isRecent ? ScratchFileState::Recent : ScratchFileState::Abandoned;
    }

    /// While `file` is open on one that is abandoned, nobody can open that, and who had it open already would have
    /// prevented the lease. So nobody is left who would miss it.
    ScratchFileState ofFile(At const& at, FileDescriptor& file) const;

    /// Of a folder in an open one: whether all that it holds is abandoned. Copies have the times of their sources, but
    /// nobody can set when they were given those.
    ScratchFileState ofFolder(FileDescriptor parent, char const* name) const;

private:
    bool open(At const& at, FileDescriptor& file) const;
    ScratchFileState takeLease(FileDescriptor const& file) const;
    ScratchFileState enter(FolderChain& chain, char const* name) const;
    ScratchFileState step(FolderChain& chain) const;
    ScratchFileState ofEntry(FolderChain& chain, char const* name) const;

    void require(int error) const
    {
        if (error != 0)
            throwError(error, iri_);
    }

    StorageIRI const& iri_;
    std::chrono::seconds age_;
};

/// Answers whether nobody else holds a lease that would have to be broken for it.
bool Examination::open(At const& at, FileDescriptor& file) const
{
    constexpr int flags = O_NOFOLLOW | O_NOCTTY | O_NONBLOCK;
    int error = openFile(at, O_RDONLY | flags, file);
    if (error == EACCES)
        error = openFile(at, O_WRONLY | flags, file);
    if (error == ELOOP)
        throwError(ErrorCode::ResourceNotFound, iri_);
    if (error != EWOULDBLOCK)
        require(error);
    return error == 0;
}

/// Who opens the file meanwhile has the kernel tell us by a signal, which by default would end this process; `SIGURG`
/// is one that nobody minds.
ScratchFileState Examination::takeLease(FileDescriptor const& file) const
{
    int error = errorOf([&] { return systemCalls().fcntl(file.get(), F_SETSIG, SIGURG); });
    if (error == 0)
        error = errorOf([&] { return systemCalls().fcntl(file.get(), F_SETLEASE, F_WRLCK); });
    if (error == EAGAIN || error == EBUSY)
        return ScratchFileState::InUse;
    require(error == EINVAL ? EOPNOTSUPP : error);
    return ScratchFileState::Abandoned;
}

ScratchFileState Examination::ofFile(At const& at, FileDescriptor& file) const
{
    if (!open(at, file))
        return ScratchFileState::InUse;
    Status status;
    require(getStatus(file, status));
    if (!S_ISREG(status.stx_mode))
        throwError(ErrorCode::ResourceNotFound, iri_);
    ScratchFileState const state = byAge(status.stx_mtime);
    return state == ScratchFileState::Abandoned ? takeLease(file) : state;
}

ScratchFileState Examination::ofFolder(FileDescriptor parent, char const* name) const
{
    FolderChain chain(std::move(parent));
    ScratchFileState state = enter(chain, name);
    while (state == ScratchFileState::Abandoned && chain.depth() > 0)
        state = step(chain);
    return state;
}

/// Where something has vanished, been replaced or been mounted, somebody is at work.
ScratchFileState Examination::enter(FolderChain& chain, char const* name) const
{
    int const error = chain.enter(name, Mounts::Refuse);
    if (error == ENOENT || error == ENOTDIR || error == ELOOP || error == EXDEV)
        return ScratchFileState::InUse;
    require(error);
    Status status;
    require(getFullStatus({chain.folder(), "."}, Links::Keep, status));
    return byAge(status.stx_ctime);
}

ScratchFileState Examination::step(FolderChain& chain) const
{
    FoundName found;
    require(chain.read(found));
    if (!found.name.empty())
        return ofEntry(chain, std::string(found.name).c_str());
    int const error = chain.leave();
    if (error == ESTALE)
        return ScratchFileState::InUse;
    require(error);
    return ScratchFileState::Abandoned;
}

ScratchFileState Examination::ofEntry(FolderChain& chain, char const* name) const
{
    At const at{chain.folder(), name};
    Status status;
    int const error = getFullStatus(at, Links::Keep, status);
    if (error == ENOENT)
        return ScratchFileState::InUse;
    require(error);
    if (isFolder(status))
        return enter(chain, name);
    ScratchFileState const state = byAge(status.stx_ctime);
    FileDescriptor file;
    return state == ScratchFileState::Abandoned && S_ISREG(status.stx_mode) ? ofFile(at, file) : state;
}

/// What has a scratch name, by that name in an open folder.
class ScratchEntry
{
public:
    explicit ScratchEntry(StorageIRI const& iri) : iri_(iri)
    {
        std::string const path = Root().pathOf(iri);
        std::size_t const slash = path.rfind('/');
        name_ = path.substr(slash + 1);
        if (!isScratchName(name_))
            throwError(ErrorCode::InvalidLocation, iri);
        int error = Root().open(path.substr(0, slash + 1), O_PATH | O_DIRECTORY, folder_);
        if (error == 0)
            error = getFullStatus(at(), Links::Keep, status_);
        if (error != 0)
            throwError(error, iri);
    }

    ScratchFileState examine(std::chrono::seconds age);
    void remove() const;

private:
    At at() const { return {folder_.get(), name_.c_str()}; }
    FileDescriptor openFolder() const;

    StorageIRI const& iri_;
    std::string name_;
    FileDescriptor folder_;
    FileDescriptor file_;
    Status status_;
};

FileDescriptor ScratchEntry::openFolder() const
{
    FileDescriptor opened;
    if (int const error = openFile({folder_.get(), "."}, O_PATH | O_DIRECTORY, opened))
        throwError(error, iri_);
    return opened;
}

ScratchFileState ScratchEntry::examine(std::chrono::seconds age)
{
    Examination const examination(iri_, age);
    if (isFolder(status_))
        return examination.ofFolder(openFolder(), name_.c_str());
    return isLink(status_) ? examination.byAge(status_.stx_ctime) : examination.ofFile(at(), file_);
}

/// Nobody else gives the name to anything: it means what was examined, or nothing.
void ScratchEntry::remove() const
{
    if (isFolder(status_))
        return removeTree(openFolder(), name_, iri_);
    int const error = removeName(at());
    if (error != 0 && error != ENOENT)
        throwError(error, iri_);
}

} // namespace

std::u16string makeScratchName()
{
    std::string const name = scratchName();
    return std::u16string(name.begin(), name.end());
}

bool isScratchName(std::u16string_view name)
{
    return detail::isScratchName(name);
}

ScratchFileState examineScratchFile(StorageIRI const& file, std::chrono::seconds age)
{
    return ScratchEntry(file).examine(age);
}

ScratchFileState removeAbandonedScratchFile(StorageIRI const& file, std::chrono::seconds age)
{
    ScratchEntry found(file);
    ScratchFileState const state = found.examine(age);
    if (state == ScratchFileState::Abandoned)
        found.remove();
    return state;
}

} // namespace foundation::storage::local
