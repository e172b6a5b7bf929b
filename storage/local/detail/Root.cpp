#include <storage/local/detail/Root.hpp>

#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/nativePath.hpp>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace foundation::storage::local::detail {

namespace {

constexpr __u64 beneath = RESOLVE_BENEATH | RESOLVE_NO_MAGICLINKS;

/// How often a path is resolved anew when folders are renamed on the way. The kernel gives up rather than guess.
constexpr int maximumRaces = 1000;

int openBeneath(int folder, char const* path, open_how const& how, FileDescriptor& file)
{
    auto const open = [&] { return systemCalls().openat2(folder, path, &how, sizeof how); };
    int descriptor = retried(open);
    for (int races = 0; descriptor == -1 && errno == EAGAIN && races < maximumRaces; ++races)
        descriptor = retried(open);
    int const error = descriptor == -1 ? errno : 0;
    file = FileDescriptor(descriptor);
    return error;
}

/// Opens the folder that another file system is mounted on, the first on the way, without following any link to it.
/// Answers `EACCES` where there is none. What is left of the path goes on from there.
int openMounted(int folder, std::string& path, FileDescriptor& mounted)
{
    open_how how{.flags = O_PATH | O_DIRECTORY | O_CLOEXEC, .mode = 0, .resolve = 0};
    int error = 0;
    std::size_t end = 0;
    for (; error == 0 && end != std::string::npos; end = path.find('/', end + 1)) {
        how.resolve = beneath | RESOLVE_NO_SYMLINKS | RESOLVE_NO_XDEV;
        FileDescriptor onTheWay;
        std::string const way = path.substr(0, path.find('/', end + 1));
        error = openBeneath(folder, way.c_str(), how, onTheWay);
        if (error != EXDEV)
            continue;
        how.resolve = beneath | RESOLVE_NO_SYMLINKS;
        error = openBeneath(folder, way.c_str(), how, mounted);
        path.erase(0, path.find_first_not_of('/', way.size()));
        return error;
    }
    return error == 0 ? EACCES : error;
}

/// Follows links, none of which leads from one file system to another.
int openWithinMounts(int folder, std::string path, open_how how, FileDescriptor& file)
{
    how.resolve = beneath | RESOLVE_NO_XDEV;
    int error = EXDEV;
    for (FileDescriptor mounted; error == EXDEV;) {
        FileDescriptor next;
        if (int const failure = openMounted(mounted.isOpen() ? mounted.get() : folder, path, next))
            return failure == EXDEV || failure == ELOOP ? EACCES : failure;
        mounted = std::move(next);
        error = openBeneath(mounted.get(), path.empty() ? "." : path.c_str(), how, file);
    }
    return error;
}

/// Other file systems are entered by their mount points, not by links to them: a path that enters one is resolved again
/// without following any link, and one with links in the other file system again from where that is mounted.
int openConfined(int folder, char const* path, int flags, mode_t mode, FileDescriptor& file)
{
    bool const isCreating = (flags & O_CREAT) != 0 || (flags & O_TMPFILE) == O_TMPFILE;
    open_how how{.flags = static_cast<unsigned>(flags) | O_CLOEXEC,
                 .mode = isCreating ? mode : 0,
                 .resolve = beneath | RESOLVE_NO_XDEV};
    int error = openBeneath(folder, path, how, file);
    if (error != EXDEV)
        return error;
    how.resolve = beneath | RESOLVE_NO_SYMLINKS;
    error = openBeneath(folder, path, how, file);
    if (error == ELOOP)
        return openWithinMounts(folder, path, how, file);
    return error == EXDEV ? EACCES : error;
}

/// With one slash between names, and none at the end.
std::string withoutSuperfluousSlashes(std::string path)
{
    auto const isRepeated = [](char left, char right) { return left == '/' && right == '/'; };
    path.erase(std::unique(path.begin(), path.end(), isRepeated), path.end());
    path.resize(std::max<std::size_t>(path.find_last_not_of('/') + 1, 1));
    return path;
}

/// Where an open file is; empty where the system does not tell, or it is nowhere any more.
std::string systemPathOf(FileDescriptor const& file)
{
    std::string const link = "/proc/self/fd/" + std::to_string(file.get());
    std::string path(PATH_MAX, '\0');
    ssize_t const size =
        retried([&] { return systemCalls().readlinkat(AT_FDCWD, link.c_str(), path.data(), path.size()); });
    Status status;
    if (size <= 0 || size == PATH_MAX || path[0] != '/' || getStatus(file, status) != 0 || status.stx_nlink == 0)
        return {};
    path.resize(static_cast<std::size_t>(size));
    return path;
}

[[noreturn]] void refuseRoot(std::string const& path, std::string const& reason)
{
    throw std::invalid_argument("\"" + path + "\" cannot be a root: " + reason);
}

} // namespace

Root::Root(std::string const& path)
{
    if (!path.starts_with('/') || path.find('\0') != std::string::npos)
        refuseRoot(path, "it is no absolute path");
    path_ = withoutSuperfluousSlashes(path);
    if (int const error = openFile({.path = path_.c_str()}, O_PATH | O_DIRECTORY, folder_))
        refuseRoot(path, std::generic_category().message(error));
    FileDescriptor self;
    if (int const error = openConfined(folder_.get(), ".", O_PATH | O_DIRECTORY, 0, self))
        refuseRoot(path, std::generic_category().message(error));
}

std::string Root::pathOf(provider::StorageIRI const& iri) const
{
    std::string path = isConfined() ? withoutSuperfluousSlashes(nativePath(iri)) : nativePath(iri);
    bool const isInside = !isConfined() || path_ == "/" ||
                          (path.starts_with(path_) && (path.size() == path_.size() || path[path_.size()] == '/'));
    if (!isInside)
        throwError(provider::ErrorCode::PermissionDenied, iri);
    return path;
}

std::string Root::canonicalPath(std::string const& path) const
{
    std::string existing = path;
    FileDescriptor file;
    while (int const error = open(existing, O_PATH, file)) {
        if (!meansMissing(error) || isTop(existing))
            return {};
        std::size_t const end = existing.find_last_not_of('/', existing.rfind('/'));
        existing.resize(end == std::string::npos ? 1 : end + 1);
    }
    std::string const found = pathOfOpen(file);
    std::string const missing = path.substr(existing == "/" ? 0 : existing.size());
    return found.empty() || existing.size() == path.size() ? found : found == "/" ? missing : found + missing;
}

/// The folder may have been opened through links, which are left out elsewhere.
std::string Root::pathOfOpen(FileDescriptor const& file) const
{
    std::string const path = systemPathOf(file);
    if (!isConfined())
        return path;
    std::string const top = systemPathOf(folder_);
    std::string const above = top == "/" ? std::string() : top;
    bool const isBeneath =
        !top.empty() && path.starts_with(above) && (path.size() == above.size() || path[above.size()] == '/');
    if (!isBeneath)
        return {};
    std::string const shown =
        (path_ == "/" ? std::string() : path_) + (path == "/" ? std::string() : path.substr(above.size()));
    return shown.empty() ? "/" : shown;
}

/// Never empty, and never absolute: the kernel is given names alone.
char const* Root::relative(std::string const& path) const
{
    std::size_t const start = path.find_first_not_of('/', path_.size());
    return start == std::string::npos ? "." : path.c_str() + start;
}

int Root::openStep(int folder, char const* path, int flags, FileDescriptor& file, mode_t mode) const
{
    return isConfined() ? openConfined(folder, path, flags, mode, file) : openFile({folder, path}, flags, file, mode);
}

/// Opens folder by folder as much of a path as is too long for one call.
int Root::descend(std::string& path, Located& entry) const
{
    while (path.size() >= PATH_MAX) {
        std::size_t const end = path.rfind('/', PATH_MAX - 2);
        if (end == std::string::npos || end == 0)
            return ENAMETOOLONG;
        FileDescriptor next;
        if (int const error = openStep(entry.folder_, path.substr(0, end).c_str(), O_PATH | O_DIRECTORY, next, 0))
            return error;
        entry.owned_ = std::move(next);
        entry.folder_ = entry.owned_.get();
        path.erase(0, path.find_first_not_of('/', end));
    }
    return 0;
}

int Root::open(std::string const& path, int flags, FileDescriptor& file, mode_t mode) const
{
    int const folder = isConfined() ? folder_.get() : AT_FDCWD;
    char const* const name = isConfined() ? relative(path) : path.c_str();
    if (path.size() < PATH_MAX)
        return openStep(folder, name, flags, file, mode);
    Located start;
    start.folder_ = folder;
    std::string rest = name;
    if (int const error = descend(rest, start))
        return error;
    return openStep(start.folder_, rest.c_str(), flags, file, mode);
}

int Root::locate(std::string const& path, Located& entry) const
{
    entry = Located();
    if (isConfined())
        return locateConfined(relative(path), entry);
    entry.name_ = path;
    return descend(entry.name_, entry);
}

/// The last name goes to calls that know no confinement, so that it must not be one that leads up.
int Root::locateConfined(std::string path, Located& entry) const
{
    entry.folder_ = folder_.get();
    if (int const error = descend(path, entry))
        return error;
    std::size_t const slash = path.rfind('/');
    std::string name = path.substr(slash + 1);
    if (name == "." || name == "..")
        name = ".";
    else
        path.resize(slash == std::string::npos ? 0 : slash);
    entry.name_ = std::move(name);
    if (path.empty())
        return 0;
    FileDescriptor folder;
    if (int const error = openStep(entry.folder_, path.c_str(), O_PATH | O_DIRECTORY, folder, 0))
        return error;
    entry.owned_ = std::move(folder);
    entry.folder_ = entry.owned_.get();
    return 0;
}

int Root::locateInFolder(std::string const& path, Located& entry) const
{
    std::string const name = nameOf(path);
    if (isTop(path) || name == "." || name == "..")
        return locate(path, entry);
    entry = Located();
    if (int const error = open(parentOf(path), O_PATH | O_DIRECTORY, entry.owned_))
        return error;
    entry.folder_ = entry.owned_.get();
    entry.name_ = name;
    return 0;
}

int Root::openParent(std::string const& path, FileDescriptor& parent, std::string& name) const
{
    if (isTop(path))
        return EBUSY;
    std::size_t const slash = path.rfind('/');
    name = path.substr(slash + 1);
    if (name == "." || name == "..")
        return EINVAL;
    return open(path.substr(0, std::max<std::size_t>(slash, 1)), O_PATH | O_DIRECTORY, parent);
}

int Root::getStatus(std::string const& path, Links links, Status& status) const
{
    if (isConfined() && links == Links::Follow) {
        FileDescriptor file;
        int const error = open(path, O_PATH, file);
        return error != 0 ? error : detail::getStatus(file, status);
    }
    Located entry;
    int const error = locate(path, entry);
    return error != 0 ? error : detail::getStatus(entry.at(), links, status);
}

int Root::checkAccess(std::string const& path, int mode) const
{
    if (isConfined()) {
        FileDescriptor file;
        int const error = open(path, O_PATH, file);
        return error != 0 ? error : detail::checkAccess(file, mode);
    }
    Located entry;
    int const error = locate(path, entry);
    return error != 0 ? error : detail::checkAccess(entry.at(), mode);
}

bool Root::leadsToFolder(std::string const& path) const
{
    Status status;
    return getStatus(path, Links::Follow, status) == 0 && isFolder(status);
}

} // namespace foundation::storage::local::detail
