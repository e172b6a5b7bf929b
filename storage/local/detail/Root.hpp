#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <string>
#include <string_view>

namespace foundation::storage::local::detail {

/// An entry by its name in an open folder. For calls that do not follow a link at the end of a path.
///
/// Refers to the root that located it, which must outlive it.
class FOUNDATION_API Located
{
public:
    At at() const { return {folder_, name_.c_str()}; }

    /// The folder that holds the entry, open where `Root::locateInFolder` found it.
    int folder() const { return folder_; }

private:
    friend class Root;

    FileDescriptor owned_;
    int folder_ = AT_FDCWD;
    std::string name_;
};

/// The part of the file system that a provider may touch: all of it, or what lies beneath one folder.
///
/// Confined to a folder, each path is resolved by the kernel in one step that never leaves the folder, whatever is
/// renamed or swapped meanwhile (`openat2` with `RESOLVE_BENEATH` and `RESOLVE_NO_MAGICLINKS`). A link that is
/// absolute, leads above the folder, or is on the way to another mounted file system answers `EACCES`. All calls on a
/// path take the one that `pathOf` gave; how long it is does not matter.
///
/// Threads: any number at once.
/// Cost: the same number of calls as without a root where a file is opened; one more, to open the folder or the file,
/// for all else. None more for what is not confined.
class FOUNDATION_API Root
{
public:
    /// All of the file system.
    Root() = default;

    /// What lies beneath a folder, and the folder. Throws `std::invalid_argument` naming the path, and why it cannot be
    /// a root: it is not absolute, leads to no folder, or the system has no `openat2` (Linux 5.6).
    explicit Root(std::string const& path);

    bool isConfined() const { return folder_.isOpen(); }

    /// The absolute path of a location, as from `nativePath`; throws what that throws, and `Exception` with
    /// `PermissionDenied` for one that does not lie beneath the folder.
    std::string pathOf(provider::StorageIRI const& iri) const;

    /// The one path of what a path leads to: without links, "." and "..", as far as that exists; what is missing stands
    /// behind it as it is. It lies beneath the folder as the given one does. Empty where the system does not tell.
    std::string canonicalPath(std::string const& path) const;

    /// Whether a path names the folder above which there is none.
    bool isTop(std::string const& path) const { return path == (isConfined() ? path_ : "/"); }

    /// Opens what a path leads to. A new file gets `mode`, less the umask.
    [[nodiscard]] int open(std::string const& path, int flags, FileDescriptor& file, mode_t mode = newFileMode) const;

    [[nodiscard]] int getStatus(std::string const& path, Links links, Status& status) const;

    /// Whether this user may do what `mode` (`W_OK`, `X_OK`) says.
    [[nodiscard]] int checkAccess(std::string const& path, int mode) const;

    /// Finds the folder that holds the last name of a path.
    [[nodiscard]] int locate(std::string const& path, Located& entry) const;

    /// The same, with the folder open: what happens to the entry, and to the folder afterwards, happens in one folder,
    /// whatever is renamed meanwhile. A last name "." or ".." is located alone.
    [[nodiscard]] int locateInFolder(std::string const& path, Located& entry) const;

    /// Opens the folder that holds the last name of a path, so that what happens there is done to one folder, whatever
    /// is renamed meanwhile. `EBUSY` for the root itself, `EINVAL` where the last name is "." or "..".
    [[nodiscard]] int openParent(std::string const& path, FileDescriptor& parent, std::string& name) const;

    /// Whether a folder stands at a path, perhaps by a link.
    bool leadsToFolder(std::string const& path) const;

private:
    std::string pathOfOpen(FileDescriptor const& file) const;
    char const* relative(std::string const& path) const;
    int openStep(int folder, char const* path, int flags, FileDescriptor& file, mode_t mode) const;
    int descend(std::string& path, Located& entry) const;
    int locateConfined(std::string path, Located& entry) const;

    std::string path_;
    FileDescriptor folder_;
};

} // namespace foundation::storage::local::detail
