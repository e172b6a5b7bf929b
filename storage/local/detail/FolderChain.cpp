#include <storage/local/detail/FolderChain.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <utility>

namespace foundation::storage::local::detail {

namespace {

constexpr int folderFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW;

/// For systems without `openat2`.
int openUnlessMounted(At const& at, FileDescriptor& folder)
{
    FileDescriptor opened;
    if (int const error = openFile(at, folderFlags, opened))
        return error;
    Status status;
    if (int const error = getStatus(opened, status))
        return error;
    if ((status.stx_attributes & STATX_ATTR_MOUNT_ROOT) != 0)
        return EXDEV;
    folder = std::move(opened);
    return 0;
}

int openOnSameMount(At const& at, FileDescriptor& folder)
{
    open_how const how{.flags = folderFlags | O_CLOEXEC, .mode = 0, .resolve = RESOLVE_NO_XDEV};
    int const descriptor = retried([&] { return systemCalls().openat2(at.folder, at.path, &how, sizeof how); });
    int const error = descriptor == -1 ? errno : 0;
    folder = FileDescriptor(descriptor);
    return error == ENOSYS ? openUnlessMounted(at, folder) : error;
}

/// Some file systems know no place any more in a folder that has been removed; it holds nothing.
int goTo(off_t position, FileDescriptor const& folder)
{
    if (systemCalls().lseek(folder.get(), position, SEEK_SET) != -1)
        return 0;
    int const error = errno;
    Status status;
    return getStatus(folder, status) == 0 && status.stx_nlink == 0 ? 0 : error;
}

} // namespace

FolderChain::FolderChain(FileDescriptor outermost, std::size_t maximum) : maximum_(maximum)
{
    levels_.push_back({{}, std::move(outermost)});
}

std::string FolderChain::path(std::size_t depth) const
{
    std::string path;
    for (std::size_t i = 1; i <= depth; ++i)
        path.append(path.empty() ? "" : "/").append(levels_[i].name);
    return path;
}

int FolderChain::enter(char const* name, Mounts mounts)
{
    if (levels_.size() - firstOpen_ >= maximum_) {
        if (int const error = closeOne())
            return error;
    }
    Level level{name, {}};
    int error = open(name, mounts, level.descriptor);
    // Others in this process may hold all descriptors but a few.
    while (error == EMFILE && levels_.size() - firstOpen_ > 1 && closeOne() == 0)
        error = open(name, mounts, level.descriptor);
    if (error != 0)
        return error;
    levels_.back().readAhead = names_.takeRest();
    levels_.push_back(std::move(level));
    return 0;
}

int FolderChain::open(char const* name, Mounts mounts, FileDescriptor& folder) const
{
    At const at{this->folder(), name};
    return mounts == Mounts::Enter ? openFile(at, folderFlags, folder) : openOnSameMount(at, folder);
}

/// Closes the first of those that are open and may be closed. Its entries can be read again from where it stands.
int FolderChain::closeOne()
{
    Level& level = levels_[firstOpen_];
    if (int const error = identify(level.descriptor, level.identity))
        return error;
    level.descriptor = FileDescriptor();
    level.readAhead = {};
    ++firstOpen_;
    return 0;
}

int FolderChain::identify(FileDescriptor const& folder, Identity& identity)
{
    Status status;
    int const error = getStatus(folder, status);
    identity = {status.stx_ino, status.stx_dev_major, status.stx_dev_minor};
    return error;
}

int FolderChain::leave()
{
    FileDescriptor const below = std::move(levels_.back().descriptor);
    levels_.pop_back();
    names_.clear();
    return isInnermostOpen() ? 0 : reopenInnermost(below.get());
}

int FolderChain::reopenInnermost(int below)
{
    FileDescriptor folder;
    std::size_t found = depth();
    if (openSame({below, ".."}, levels_.back().identity, folder) != 0)
        found = findAgain(folder);
    bool const isLost = found < depth();
    if (isLost) {
        lostPath_ = path(found + 1);
        levels_.erase(levels_.begin() + static_cast<std::ptrdiff_t>(found) + 1, levels_.end());
    }
    firstOpen_ = std::max<std::size_t>(found, 1);
    if (found != 0) {
        if (int const error = goTo(levels_.back().position, folder))
            return error;
        levels_.back().descriptor = std::move(folder);
    }
    return isLost ? ESTALE : 0;
}

/// Goes down from the outermost folder by name, for as long as the folders are those that were entered. Answers how
/// deep that is.
std::size_t FolderChain::findAgain(FileDescriptor& deepest) const
{
    std::size_t found = 0;
    for (; found < depth(); ++found) {
        int const above = found == 0 ? levels_.front().descriptor.get() : deepest.get();
        Level const& next = levels_[found + 1];
        FileDescriptor folder;
        if (openSame({above, next.name.c_str()}, next.identity, folder) != 0)
            break;
        deepest = std::move(folder);
    }
    return found;
}

int FolderChain::openSame(At const& at, Identity const& identity, FileDescriptor& folder)
{
    FileDescriptor opened;
    if (int const error = openFile(at, folderFlags, opened))
        return error;
    Identity found;
    if (int const error = identify(opened, found))
        return error;
    if (found != identity)
        return ESTALE;
    folder = std::move(opened);
    return 0;
}

int FolderChain::restart()
{
    levels_.erase(levels_.begin() + 1, levels_.end());
    firstOpen_ = 1;
    return rewind();
}

int FolderChain::rewind()
{
    names_.clear();
    levels_.back().readAhead = {};
    levels_.back().position = 0;
    return systemCalls().lseek(folder(), 0, SEEK_SET) == -1 ? errno : 0;
}

int FolderChain::read(FoundName& found)
{
    Level& level = levels_.back();
    if (!level.readAhead.empty())
        names_.putRest(std::exchange(level.readAhead, {}));
    int const error = names_.next(folder(), found);
    if (error == 0 && !found.name.empty())
        level.position = found.end;
    return error;
}

} // namespace foundation::storage::local::detail
