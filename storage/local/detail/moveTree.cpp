#include <storage/local/detail/moveAcross.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/FolderChain.hpp>
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
#include <cstdint>
#include <dirent.h>
#include <map>
#include <string>
#include <tuple>
#include <unistd.h>
#include <utility>
#include <vector>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::StorageIRI;

namespace {

constexpr mode_t privateFileMode = 0600;
constexpr mode_t privateFolderMode = 0700;

/// A tree to be moved, by its name in an open folder.
struct Tree
{
    Root const& root;
    StorageIRI const& iri;
    FileDescriptor parent = {};
    std::string name = {};

    void open()
    {
        if (int const error = root.openParent(root.pathOf(iri), parent, name))
            throwError(error, iri);
    }

    FileDescriptor openParent() const
    {
        FileDescriptor opened;
        if (int const error = openFile({parent.get(), "."}, O_PATH | O_DIRECTORY, opened))
            throwError(error, iri);
        return opened;
    }
};

/// What is done in each folder and with each entry of the source. All throw `Exception`.
class Visitor
{
public:
    virtual ~Visitor() = default;

    /// The walk stands in the folder.
    virtual void enter(Status const& folder) = 0;
    virtual void leave() = 0;

    /// Of what is no folder, in the one in which the walk stands.
    virtual void visit(char const* name, Status const& entry) = 0;
};

/// Goes through the source, never by a link, nor into what is mounted there.
class SourceWalk
{
public:
    explicit SourceWalk(Tree const& tree) : tree_(tree), chain_(tree.openParent()) {}

    void run(Visitor& visitor);

    int folder() const { return chain_.folder(); }
    std::string const& name() const { return chain_.name(); }

    /// Throws what is wrong with an entry of the folder in which the walk stands; with the folder itself without one.
    [[noreturn]] void fail(int error, std::string const& entry = {}) const;

private:
    void enter(char const* name, Visitor& visitor);
    void step(Visitor& visitor);

    Tree const& tree_;
    FolderChain chain_;
};

void SourceWalk::run(Visitor& visitor)
{
    enter(tree_.name.c_str(), visitor);
    while (chain_.depth() > 0)
        step(visitor);
}

void SourceWalk::enter(char const* name, Visitor& visitor)
{
    if (int const error = chain_.enter(name, Mounts::Refuse))
        fail(error == EXDEV ? EBUSY : error, name);
    Status status;
    if (int const error = getFullStatus({folder(), "."}, Links::Keep, status))
        fail(error);
    visitor.enter(status);
}

void SourceWalk::step(Visitor& visitor)
{
    FoundName found;
    if (int const error = chain_.read(found))
        fail(error);
    std::string const name(found.name);
    if (name.empty()) {
        visitor.leave();
        if (int const error = chain_.leave())
            fail(error);
        return;
    }
    Status status;
    if (int const error = getFullStatus({folder(), name.c_str()}, Links::Keep, status))
        fail(error == ENOENT ? EBUSY : error, name);
    if (isFolder(status))
        enter(name.c_str(), visitor);
    else
        visitor.visit(name.c_str(), status);
}

/// The path of the chain begins with the name of the tree.
void SourceWalk::fail(int error, std::string const& entry) const
{
    std::string path = chain_.path();
    if (!entry.empty())
        path.append(path.empty() ? "" : "/").append(entry);
    std::size_t const slash = path.find('/');
    if (slash == std::string::npos)
        throwError(error, tree_.iri);
    throwError(error, StorageIRI(tree_.iri, fl::filesystem::from_native_bytes(path.substr(slash + 1))));
}

/// Looks before anything is copied for what would stop the move at its end.
class Inspection : public Visitor
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

/// What was copied, as it was then.
class Copied
{
public:
    void add(Status const& status)
    {
        Stamp const stamp{status.stx_size, status.stx_mtime.tv_sec, status.stx_mtime.tv_nsec, status.stx_ctime.tv_sec,
                          status.stx_ctime.tv_nsec};
        stamps_.insert_or_assign(keyOf(status), stamp);
        ++count_;
    }

    std::size_t count() const { return count_; }

    bool holds(Status const& folder) const { return stamps_.contains(keyOf(folder)); }

    bool holdsUnchanged(Status const& file) const
    {
        auto const found = stamps_.find(keyOf(file));
        return found != stamps_.end() && hasContentOf(found->second, file) &&
               found->second.changed == file.stx_ctime.tv_sec && found->second.changedPart == file.stx_ctime.tv_nsec;
    }

    /// A name of the file may have gone or changed since, which counts as a change of its attributes.
    bool holdsContentOf(Status const& file) const
    {
        auto const found = stamps_.find(keyOf(file));
        return found != stamps_.end() && hasContentOf(found->second, file);
    }

private:
    using Key = std::tuple<std::uint64_t, std::uint32_t, std::uint32_t>;

    struct Stamp
    {
        std::uint64_t size;
        std::int64_t modified;
        std::uint32_t modifiedPart;
        std::int64_t changed;
        std::uint32_t changedPart;
    };

    static Key keyOf(Status const& status) { return {status.stx_ino, status.stx_dev_major, status.stx_dev_minor}; }

    static bool hasContentOf(Stamp const& stamp, Status const& file)
    {
        return stamp.size == file.stx_size && stamp.modified == file.stx_mtime.tv_sec &&
               stamp.modifiedPart == file.stx_mtime.tv_nsec;
    }

    std::map<Key, Stamp> stamps_;
    std::size_t count_ = 0;
};

/// Makes the copy below a scratch name, from which nothing stays unless it is put in place.
class TreeCopy : public Visitor
{
public:
    TreeCopy(SourceWalk const& walk, Tree const& target, Copied& copied)
        : walk_(walk), target_(target), copied_(copied), chain_(target.openParent()), cleaning_(target.openParent())
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
    require(moveContent(file, entry, copy), name);
    requireAtTarget(copy.close());
}

void TreeCopy::putInPlace()
{
    At const scratch{target_.parent.get(), scratch_.c_str()};
    requireAtTarget(moveFolderWithoutReplacing(scratch, {target_.parent.get(), target_.name.c_str()}));
    isInPlace_ = true;
}

/// Makes sure that the source holds what was copied, and nothing else.
class Comparison : public Visitor
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

void inspect(Tree const& source, Tree const& target)
{
    Status parent;
    if (int const error = getStatus({target.parent.get(), "."}, Links::Keep, parent))
        throwError(error, target.iri);
    if (int const error = checkAccess({source.parent.get(), "."}, W_OK | X_OK))
        throwError(error, source.iri);
    SourceWalk walk(source);
    Inspection inspection(walk, parent);
    walk.run(inspection);
}

void requireUnchanged(Tree const& source, Copied const& copied)
{
    SourceWalk walk(source);
    Comparison comparison(walk, copied);
    walk.run(comparison);
    if (comparison.count() != copied.count())
        throwError(EBUSY, source.iri);
}

void copyTree(Tree const& source, Tree const& target, Copied& copied)
{
    SourceWalk walk(source);
    TreeCopy copy(walk, target, copied);
    walk.run(copy);
    requireUnchanged(source, copied);
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

void moveFolderAcross(Root const& root, StorageIRI const& from, StorageIRI const& to)
{
    Tree source{root, from};
    Tree target{root, to};
    source.open();
    target.open();
    inspect(source, target);
    Copied copied;
    copyTree(source, target, copied);
    if (int const error = syncFolderOf(root, root.pathOf(to)))
        throwNotDurable(error, to);
    removeCopied(source, copied);
}

} // namespace foundation::storage::local::detail
