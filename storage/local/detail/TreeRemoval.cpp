#include <storage/local/detail/TreeRemoval.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/FolderChain.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/move.hpp>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <dirent.h>
#include <string>
#include <utility>
#include <vector>

namespace foundation::storage::local::detail {

using provider::StorageIRI;

namespace {

/// So many entries are sorted at once: enough for file systems to gain from it, and a few megabytes at most.
constexpr std::size_t maximumBatch = 1U << 16U;

/// How often a folder is read again that others fill, or that left out entries while others were removed.
constexpr int maximumPasses = 100;

/// Some entries of a folder, to be removed in the order in which they lie on the disk.
class Batch
{
public:
    void clear()
    {
        names_.clear();
        entries_.clear();
    }

    bool isFull() const { return entries_.size() == maximumBatch; }

    void add(FoundName const& found)
    {
        entries_.push_back({found.inode, static_cast<std::uint32_t>(names_.size()), found.type});
        names_.append(found.name).push_back('\0');
    }

    template <typename Function>
    void forEachByInode(Function const& function)
    {
        std::sort(entries_.begin(), entries_.end(), [](auto& left, auto& right) { return left.inode < right.inode; });
        for (Entry const& entry : entries_)
            function(names_.c_str() + entry.name, entry.type);
    }

private:
    struct Entry
    {
        ino64_t inode;
        std::uint32_t name;
        unsigned char type;
    };

    std::string names_;
    std::vector<Entry> entries_;
};

/// A folder that is being emptied.
struct Level
{
    std::string folders = {}; ///< the names of those in it that are still to be emptied, each with a NUL behind
    std::size_t next = 0;     ///< where the first of them is
    int passes = 0;           ///< how often it was read
    bool isRead = false;      ///< this time, to its end
    bool hasChanged = false;  ///< something in it went, this time
    bool hasFailed = false;   ///< something in it stays
};

/// The paths of a removal begin with the name of the folder.
std::string withoutFirstName(std::string const& path)
{
    std::size_t const slash = path.find('/');
    return slash == std::string::npos ? std::string() : path.substr(slash + 1);
}

class TreeRemoval
{
public:
    TreeRemoval(FileDescriptor parent, Failures wanted, MayRemove mayRemove)
        : chain_(std::move(parent)), mayRemove_(std::move(mayRemove)), wanted_(wanted)
    {}

    /// Answers 0, or what is wrong with the folder itself before anything was removed. The rest is in `failures`.
    int remove(char const* name);

    std::vector<RemovalFailure>& failures() { return failures_; }

private:
    int enter(char const* name, int passes);
    void step();
    void readBatch();
    int removeName(char const* name) const;
    int removeEmpty(char const* name) const;
    void removeFile(char const* name);
    void removeFolder(char const* name);
    void leave();
    void noteLost();
    void removeEmptied(std::string const& name, Level const& emptied);
    void noteEntry(int error, std::string const& name);

    template <typename MakePath>
    void noteAt(int error, MakePath const& makePath);

    FolderChain chain_; ///< from the folder that holds the one to remove
    MayRemove mayRemove_;
    std::vector<Level> levels_; ///< one for each folder that was entered
    Batch batch_;
    Failures wanted_;
    std::vector<RemovalFailure> failures_;
};

int TreeRemoval::remove(char const* name)
{
    int const error = enter(name, 0);
    while (!levels_.empty())
        step();
    return error;
}

/// A folder that may not be read may be empty.
int TreeRemoval::enter(char const* name, int passes)
{
    int const error = chain_.enter(name, Mounts::Refuse);
    if (error == 0)
        levels_.push_back({.passes = passes + 1});
    else if (error == EACCES && removeEmpty(name) == 0)
        return 0;
    return error == EXDEV ? EBUSY : error;
}

void TreeRemoval::step()
{
    Level& level = levels_.back();
    if (level.next < level.folders.size()) {
        std::string const name = level.folders.c_str() + level.next;
        level.next += name.size() + 1;
        removeFolder(name.c_str());
    } else if (!level.isRead) {
        readBatch();
    } else {
        leave();
    }
}

/// Removes the files of a batch, and keeps the names of its folders for later.
void TreeRemoval::readBatch()
{
    Level& level = levels_.back();
    batch_.clear();
    while (!batch_.isFull() && !level.isRead) {
        FoundName found;
        if (int const error = chain_.read(found))
            noteAt(error, [&] { return chain_.path(); });
        level.isRead = found.name.empty();
        if (!level.isRead)
            batch_.add(found);
    }
    level.folders.clear();
    level.next = 0;
    batch_.forEachByInode([&](char const* name, unsigned char type) {
        if (type == DT_DIR)
            level.folders.append(name).push_back('\0');
        else
            removeFile(name);
    });
}

int TreeRemoval::removeName(char const* name) const
{
    At const entry{chain_.folder(), name};
    return mayRemove_ ? removeNameChecked(entry, mayRemove_) : detail::removeName(entry);
}

int TreeRemoval::removeEmpty(char const* name) const
{
    At const entry{chain_.folder(), name};
    return mayRemove_ ? removeEmptyFolderChecked(entry, mayRemove_) : removeEmptyFolder(entry);
}

void TreeRemoval::removeFile(char const* name)
{
    int const error = removeName(name);
    if (error == EISDIR)
        levels_.back().folders.append(name).push_back('\0');
    else if (error != 0 && error != ENOENT)
        noteEntry(error, name);
    else
        levels_.back().hasChanged = true;
}

/// What has become a file or a link meanwhile is removed as that.
void TreeRemoval::removeFolder(char const* name)
{
    std::size_t const level = levels_.size() - 1;
    int error = enter(name, 0);
    if (error == ENOTDIR || error == ELOOP)
        error = removeName(name);
    if (error != 0 && error != ENOENT)
        noteEntry(error, name);
    else
        levels_[level].hasChanged = true;
}

void TreeRemoval::leave()
{
    Level const emptied = std::move(levels_.back());
    std::string const name = chain_.name();
    levels_.pop_back();
    int const error = chain_.leave();
    levels_.resize(chain_.depth());
    if (error == ESTALE)
        noteLost();
    else if (error != 0)
        noteAt(error, [&] { return chain_.path(); });
    else if (!emptied.hasFailed)
        removeEmptied(name, emptied);
    else if (!levels_.empty())
        levels_.back().hasFailed = true;
}

/// What others have moved away is gone as what they have removed; what they have put in its place is met when the
/// folder is read again.
void TreeRemoval::noteLost()
{
    if (!levels_.empty())
        levels_.back().hasChanged = true;
}

void TreeRemoval::removeEmptied(std::string const& name, Level const& emptied)
{
    int error = removeEmpty(name.c_str());
    bool const isFull = error == ENOTEMPTY || error == EEXIST;
    if (isFull && emptied.hasChanged && emptied.passes < maximumPasses)
        error = enter(name.c_str(), emptied.passes);
    // What has taken the place of the folder is met when the one above is read again.
    bool const isReplaced = (error == ENOTDIR || error == ELOOP) && !levels_.empty();
    if (error != 0 && error != ENOENT && !isReplaced)
        noteEntry(error == EEXIST ? ENOTEMPTY : error, name);
}

void TreeRemoval::noteEntry(int error, std::string const& name)
{
    noteAt(error, [&] { return chain_.depth() == 0 ? name : chain_.path() + '/' + name; });
}

/// `makePath` is called for the failures that are wanted alone.
template <typename MakePath>
void TreeRemoval::noteAt(int error, MakePath const& makePath)
{
    if (!levels_.empty())
        levels_.back().hasFailed = true;
    if (wanted_ == Failures::All || failures_.empty())
        failures_.push_back({error, withoutFirstName(makePath())});
}

void throwFirst(std::vector<RemovalFailure> const& failures, StorageIRI const& folder)
{
    if (failures.empty())
        return;
    auto const& [error, path] = failures.front();
    throwError(error, path.empty() ? folder : StorageIRI(folder, fl::filesystem::from_native_bytes(path)));
}

} // namespace

std::vector<RemovalFailure> removeTree(Root const& root, StorageIRI const& folder, Failures wanted)
{
    std::string const path = root.pathOf(folder);
    FileDescriptor parent;
    std::string name;
    if (int const error = root.openParent(path, parent, name))
        throwError(error, folder);
    TreeRemoval removal(std::move(parent), wanted, {});
    int const error = removal.remove(name.c_str());
    if (error == ENOTDIR || error == ELOOP)
        throwNotAFolder(root, path, folder);
    if (error != 0)
        throwError(error, folder);
    return std::move(removal.failures());
}

void removeTree(Root const& root, StorageIRI const& folder)
{
    throwFirst(removeTree(root, folder, Failures::First), folder);
}

void removeTree(FileDescriptor parent, std::string const& name, StorageIRI const& folder, MayRemove mayRemove)
{
    TreeRemoval removal(std::move(parent), Failures::First, std::move(mayRemove));
    if (int const error = removal.remove(name.c_str()))
        throwError(error, folder);
    throwFirst(removal.failures(), folder);
}

} // namespace foundation::storage::local::detail
