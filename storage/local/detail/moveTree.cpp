#include <storage/local/detail/moveAcross.hpp>

#include <storage/local/detail/Copied.hpp>
#include <storage/local/detail/FolderChain.hpp>
#include <storage/local/detail/SourceWalk.hpp>
#include <storage/local/detail/TreeRemoval.hpp>
#include <storage/local/detail/copyFailure.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/metadata.hpp>
#include <storage/local/detail/move.hpp>
#include <storage/local/detail/moveContent.hpp>
#include <storage/local/detail/scratchName.hpp>
#include <storage/local/detail/sync.hpp>

#include <cerrno>
#include <cstddef>
#include <string>
#include <unistd.h>
#include <utility>
#include <vector>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::StorageIRI;

namespace {

constexpr mode_t privateFileMode = 0600;
constexpr mode_t privateFolderMode = 0700;

/// Looks before anything is copied for what would stop the move at its end.
class Inspection : public SourceVisitor
{
public:
    Inspection(SourceWalk const& walk, Status const& targetParent) : walk_(walk), targetParent_(targetParent) {}

    void enter(Status const& folder) override
    {
        if (isSameFile(folder, targetParent_))
            walk_.fail(EINVAL); // by a second mount of the same file system
        if (!folders_.empty())
            requireRemovable("..");
        folders_.push_back({});
    }

    void leave() override { folders_.pop_back(); }

    void visit(char const* name, Status const& entry) override
    {
        if (!S_ISREG(entry.stx_mode) && !isLink(entry))
            walk_.fail(EOPNOTSUPP, name);
        requireRemovable(".");
    }

private:
    struct Level
    {
        bool isLookedAt = false;
    };

    void requireRemovable(char const* folder)
    {
        if (std::exchange(folders_.back().isLookedAt, true))
            return;
        if (int const error = checkAccess({walk_.folder(), folder}, W_OK | X_OK))
            walk_.fail(error);
    }

    SourceWalk const& walk_;
    Status const& targetParent_;
    std::vector<Level> folders_;
};

/// Makes the copy below a scratch name, from which nothing stays unless it is put in place.
class TreeCopy : public SourceVisitor
{
public:
    TreeCopy(SourceWalk const& walk, Tree const& target, Copied& copied, MoveWatch const& watch)
        : walk_(walk),
          target_(target),
          copied_(copied),
          watch_(watch),
          chain_(target.openParent()),
          cleaning_(target.openParent())
    {}

    ~TreeCopy() override
    {
        if (isInPlace_)
            return;
        try {
            removeTree(std::move(cleaning_), scratch_, target_.iri);
        } catch (...) {
            // The failure of the move is told, and the name tells what stays.
        }
    }

    void enter(Status const& folder) override;
    void leave() override;
    void visit(char const* name, Status const& entry) override;

    void putInPlace();

private:
    void visitFile(char const* name, Status const& entry);
    void require(CopyResult const& result, std::string const& entry) const;
    void requireAtTarget(int error) const
    {
        if (error != 0)
            throwError(error, target_.iri);
    }

    SourceWalk const& walk_;
    Tree const& target_;
    Copied& copied_;
    MoveWatch const& watch_;
    FolderChain chain_;
    FileDescriptor cleaning_;
    std::string const scratch_ = scratchName();
    std::vector<Status> folders_; ///< those of the source on the way
    bool isInPlace_ = false;
};

/// Of a failure at the target its place is told: nobody knows the copy by name.
void TreeCopy::require(CopyResult const& result, std::string const& entry) const
{
    if (result.outcome == CopyOutcome::SourceFailed)
        walk_.fail(result.error, entry);
    requireCopied(result, target_.iri, target_.iri);
}

void TreeCopy::enter(Status const& folder)
{
    std::string const name = folders_.empty() ? scratch_ : walk_.name();
    requireAtTarget(makeFolder({chain_.folder(), name.c_str()}, privateFolderMode));
    requireAtTarget(chain_.enter(name.c_str(), Mounts::Refuse));
    folders_.push_back(folder);
    copied_.add(folder);
}

/// Only now: what is made in a folder changes its times, and may need permissions that it is to lose.
void TreeCopy::leave()
{
    Status const& source = folders_.back();
    requireAtTarget(keepOwnerAndMode(chain_.folder(), source));
    require(keepUserAttributes(walk_.folder(), chain_.folder()), {});
    requireAtTarget(keepTimes(chain_.folder(), source));
    requireAtTarget(errorOf([&] { return systemCalls().fsync(chain_.folder()); }));
    // The times of the files are not on the disk yet.
    if (folders_.size() == 1)
        requireAtTarget(errorOf([&] { return systemCalls().syncfs(chain_.folder()); }));
    folders_.pop_back();
    requireAtTarget(chain_.leave());
}

void TreeCopy::visit(char const* name, Status const& entry)
{
    if (S_ISREG(entry.stx_mode))
        visitFile(name, entry);
    else if (isLink(entry))
        require(moveLink({walk_.folder(), name}, entry, {chain_.folder(), name}), name);
    else
        walk_.fail(EOPNOTSUPP, name);
    copied_.add(entry);
}

void TreeCopy::visitFile(char const* name, Status const& entry)
{
    FileDescriptor file;
    if (int const error = openFile({walk_.folder(), name}, O_RDONLY | O_NOFOLLOW | O_NOCTTY | O_NONBLOCK, file))
        walk_.fail(error, name);
    FileDescriptor copy;
    constexpr int flags = O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW;
    requireAtTarget(openFile({chain_.folder(), name}, flags, copy, privateFileMode));
    require(moveContent(file, entry, copy, watch_), name);
    requireAtTarget(copy.close());
}

void TreeCopy::putInPlace()
{
    At const scratch{target_.parent.get(), scratch_.c_str()};
    requireAtTarget(moveFolderWithoutReplacing(scratch, {target_.parent.get(), target_.name.c_str()}));
    isInPlace_ = true;
}

/// Makes sure that the source holds what was copied, and nothing else.
class Comparison : public SourceVisitor
{
public:
    Comparison(SourceWalk const& walk, Copied const& copied) : walk_(walk), copied_(copied) {}

    void enter(Status const& folder) override
    {
        ++count_;
        if (!copied_.holds(folder))
            walk_.fail(EBUSY);
    }

    void leave() override {}

    void visit(char const* name, Status const& entry) override
    {
        ++count_;
        if (!copied_.holdsUnchanged(entry))
            walk_.fail(EBUSY, name);
    }

    std::size_t count() const { return count_; }

private:
    SourceWalk const& walk_;
    Copied const& copied_;
    std::size_t count_ = 0;
};

void inspect(Tree const& source, Tree const& target, MoveWatch const& watch)
{
    Status parent;
    if (int const error = getStatus({target.parent.get(), "."}, Links::Keep, parent))
        throwError(error, target.iri);
    if (int const error = checkAccess({source.parent.get(), "."}, W_OK | X_OK))
        throwError(error, source.iri);
    SourceWalk walk(source, watch);
    Inspection inspection(walk, parent);
    walk.run(inspection);
}

void requireUnchanged(Tree const& source, Copied const& copied, MoveWatch const& watch)
{
    SourceWalk walk(source, watch);
    Comparison comparison(walk, copied);
    walk.run(comparison);
    if (comparison.count() != copied.count())
        throwAtSource(EBUSY, source.iri);
}

void copyTree(Tree const& source, Tree const& target, Copied& copied, MoveWatch const& watch)
{
    SourceWalk walk(source, watch);
    TreeCopy copy(walk, target, copied, watch);
    walk.run(copy);
    requireUnchanged(source, copied, watch);
    copy.putInPlace();
}

/// What came into the source or changed there since it was compared is not in the copy: it stays.
void removeCopied(Tree& source, Copied const& copied)
{
    removeTree(std::move(source.parent), source.name, source.iri, [&](Status const& entry) {
        bool const isCopied = isFolder(entry) ? copied.holds(entry) : copied.holdsContentOf(entry);
        return isCopied ? 0 : EBUSY;
    });
}

} // namespace

void moveFolderAcross(Root const& root, StorageIRI const& from, StorageIRI const& to, MoveWatch const& watch)
{
    Tree source{root, from};
    Tree target{root, to};
    source.open();
    target.open();
    inspect(source, target, watch);
    Copied copied;
    copyTree(source, target, copied, watch);
    if (int const error = syncFolder(target.parent.get()))
        throwNotDurable(error, to);
    removeCopied(source, copied);
}

} // namespace foundation::storage::local::detail
