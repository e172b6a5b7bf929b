#include <storage/local/scratchFiles.hpp>

#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/scratchName.hpp>

#include <cerrno>
#include <csignal>
#include <fcntl.h>
#include <string>
#include <time.h>

namespace foundation::storage::local {

using namespace detail;
using provider::ErrorCode;
using provider::StorageIRI;

namespace {

class FoundScratchFile
{
public:
    explicit FoundScratchFile(StorageIRI const& iri) : iri_(iri)
    {
        std::string const path = Root().pathOf(iri);
        std::size_t const slash = path.rfind('/');
        name_ = path.substr(slash + 1);
        if (!isScratchName(name_))
            throwError(ErrorCode::InvalidLocation, iri);
        if (int const error = Root().open(path.substr(0, slash + 1), O_PATH | O_DIRECTORY, folder_))
            throwError(error, iri);
    }

    ScratchFileState examine(std::chrono::seconds age);

    /// While the lease is held nobody can open the file, and who has it open already would have prevented the lease. So
    /// nobody is left who would miss it, and the name means this file or nothing.
    void remove() const
    {
        int const error = removeName(at());
        if (error != 0 && error != ENOENT)
            throwError(error, iri_);
    }

private:
    At at() const { return {folder_.get(), name_.c_str()}; }

    bool open();
    bool isRecent(std::chrono::seconds age) const;
    bool takeLease() const;

    StorageIRI const& iri_;
    std::string name_;
    FileDescriptor folder_;
    FileDescriptor file_;
};

/// Answers whether nobody else holds a lease that would have to be broken for it.
bool FoundScratchFile::open()
{
    constexpr int flags = O_NOFOLLOW | O_NOCTTY | O_NONBLOCK;
    int error = openFile(at(), O_RDONLY | flags, file_);
    if (error == EACCES)
        error = openFile(at(), O_WRONLY | flags, file_);
    if (error == ELOOP)
        throwError(ErrorCode::ResourceNotFound, iri_);
    if (error != 0 && error != EWOULDBLOCK)
        throwError(error, iri_);
    return error == 0;
}

bool FoundScratchFile::isRecent(std::chrono::seconds age) const
{
    Status status;
    if (int const error = getStatus(file_, status))
        throwError(error, iri_);
    if (!S_ISREG(status.stx_mode))
        throwError(ErrorCode::ResourceNotFound, iri_);
    return std::chrono::seconds(::time(nullptr) - status.stx_mtime.tv_sec) < age;
}

/// Who opens the file meanwhile has the kernel tell us by a signal, which by default would end this process; `SIGURG`
/// is one that nobody minds.
bool FoundScratchFile::takeLease() const
{
    if (::fcntl(file_.get(), F_SETSIG, SIGURG) == 0 && ::fcntl(file_.get(), F_SETLEASE, F_WRLCK) == 0)
        return true;
    if (errno == EAGAIN || errno == EBUSY)
        return false;
    throwError(errno == EINVAL ? EOPNOTSUPP : errno, iri_);
}

ScratchFileState FoundScratchFile::examine(std::chrono::seconds age)
{
    if (!open())
        return ScratchFileState::InUse;
    if (isRecent(age))
        return ScratchFileState::Recent;
    return takeLease() ? ScratchFileState::Abandoned : ScratchFileState::InUse;
}

} // namespace

ScratchFileState examineScratchFile(StorageIRI const& file, std::chrono::seconds age)
{
    return FoundScratchFile(file).examine(age);
}

ScratchFileState removeAbandonedScratchFile(StorageIRI const& file, std::chrono::seconds age)
{
    FoundScratchFile found(file);
    ScratchFileState const state = found.examine(age);
    if (state == ScratchFileState::Abandoned)
        found.remove();
    return state;
}

} // namespace foundation::storage::local
