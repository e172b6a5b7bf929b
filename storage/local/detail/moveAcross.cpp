#include <storage/local/detail/moveAcross.hpp>

#include <storage/local/detail/ScratchFile.hpp>
#include <storage/local/detail/checkedRemoval.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/move.hpp>
#include <storage/local/detail/moveContent.hpp>
#include <storage/local/detail/nativePath.hpp>
#include <storage/local/detail/scratchName.hpp>
#include <storage/local/detail/sync.hpp>

#include <cerrno>
#include <string>
#include <unistd.h>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::ReplacementPolicy;
using provider::StorageIRI;

namespace {

constexpr mode_t privateMode = 0600;

/// A file to be moved, by its name in an open folder: whatever is renamed meanwhile, what was copied is what goes.
class Source
{
public:
    Source(Root const& root, StorageIRI const& iri) : iri_(iri)
    {
        std::string const path = root.pathOf(iri);
        int error = root.openParent(path, parent_, name_);
        if (error == 0)
            error = getFullStatus(at(), Links::Keep, status_);
        // To find that out when all is copied would be late.
        if (error == 0)
            error = root.checkAccess(parentOf(path), W_OK | X_OK);
        if (error != 0)
            throwError(error, iri_);
    }

    StorageIRI const& iri() const { return iri_; }
    Status const& status() const { return status_; }
    At at() const { return {parent_.get(), name_.c_str()}; }

    void open(FileDescriptor& file)
    {
        int error = openFile(at(), O_RDONLY | O_NOFOLLOW | O_NOCTTY | O_NONBLOCK, file);
        if (error == 0)
            error = getFullStatus(file, status_);
        if (error == 0 && !S_ISREG(status_.stx_mode))
            error = EBUSY;
        if (error != 0)
            throwAtSource(error, iri_);
    }

    void requireUnchanged() const
    {
        Status now;
        int const error = getFullStatus(at(), Links::Keep, now);
        if (error != 0 || !isUnchanged(status_, now))
            throwAtSource(error != 0 && !meansMissing(error) ? error : EBUSY, iri_);
    }

    void remove() const
    {
        requireUnchanged();
        auto const isCopied = [&](Status const& now) { return hasSameContent(status_, now) ? 0 : EBUSY; };
        if (int const error = removeNameChecked(at(), isCopied))
            throwError(error == ENOENT || error == EISDIR ? EBUSY : error, iri_);
    }

private:
    StorageIRI const& iri_;
    FileDescriptor parent_;
    std::string name_;
    Status status_;
};

/// A link that goes with its scratch name, unless that was given up.
class ScratchLink
{
public:
    explicit ScratchLink(FileDescriptor const& folder) : folder_(folder) {}
    ScratchLink(ScratchLink const&) = delete;
    ScratchLink& operator=(ScratchLink const&) = delete;
    ~ScratchLink()
    {
        if (!isInPlace_)
            removeName(at());
    }

    At at() const { return {folder_.get(), name_.c_str()}; }

    int putInPlace(At const& target, ReplacementPolicy policy)
    {
        int const error = replaces(policy) ? renameEntry(at(), target, 0) : moveFileWithoutReplacing(at(), target);
        isInPlace_ = error == 0;
        return error == EISDIR ? EEXIST : error;
    }

private:
    FileDescriptor const& folder_;
    std::string const name_ = scratchName();
    bool isInPlace_ = false;
};

/// Another name of the source is reached through a second mount of one file system only.
void requireReplaceable(Root const& root, Status const& source, StorageIRI const& to, ReplacementPolicy policy)
{
    Status status;
    int const error = root.getStatus(root.pathOf(to), Links::Keep, status);
    if (meansMissing(error))
        return;
    if (error != 0)
        throwError(error, to);
    if (!replaces(policy))
        throwError(ErrorCode::ResourceAlreadyExists, to);
    if (isSameFile(source, status))
        throwError(EXDEV, to);
}

void copyRegularFile(Root const& root, Source& source, StorageIRI const& to, ReplacementPolicy policy,
                     MoveWatch const& watch)
{
    FileDescriptor file;
    source.open(file);
    ScratchFile scratch(root, to, Durability::Full, O_RDWR, privateMode, Permissions::Own);
    requireMoved(moveContent(file, source.status(), scratch.file(), watch), source.iri(), to);
    source.requireUnchanged();
    scratch.commit(policy);
}

void copyLink(Root const& root, Source const& source, StorageIRI const& to, ReplacementPolicy policy)
{
    FileDescriptor folder;
    std::string name;
    if (int const error = root.openParent(root.pathOf(to), folder, name))
        throwError(error, to);
    ScratchLink scratch(folder);
    requireMoved(moveLink(source.at(), source.status(), scratch.at()), source.iri(), to);
    if (int const error = scratch.putInPlace({folder.get(), name.c_str()}, policy))
        throwError(error, to);
    if (int const error = syncFolder(folder.get()))
        throwNotDurable(error, to);
}

} // namespace

void moveFileAcross(Root const& root, StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy,
                    MoveWatch const& watch)
{
    Source source(root, from);
    bool const isLink = detail::isLink(source.status());
    if (!isLink && !S_ISREG(source.status().stx_mode))
        throwAtSource(EOPNOTSUPP, from);
    requireReplaceable(root, source.status(), to, policy);
    if (isLink)
        copyLink(root, source, to, policy);
    else
        copyRegularFile(root, source, to, policy, watch);
    source.remove();
}

} // namespace foundation::storage::local::detail
