#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/SystemCalls.hpp>

#include <string>

namespace foundation::storage::local::detail {

// One call of the operating system each, made again when a signal interrupts it. They answer 0 or `errno`.

/// What the system knows of a file.
using Status = struct statx;

enum class Links
{
    Follow,
    Keep,
};

/// New files get mode 0666, less the umask.
[[nodiscard]] int openFile(std::string const& path, int flags, FileDescriptor& file);

[[nodiscard]] int getStatus(std::string const& path, Links links, Status& status);

/// Of an entry of an open folder.
[[nodiscard]] int getStatus(FileDescriptor const& folder, char const* name, Links links, Status& status);

/// Of an open file.
[[nodiscard]] int getStatus(FileDescriptor const& file, Status& status);

/// Whether this user may do what `mode` (`W_OK`, `X_OK`) says.
[[nodiscard]] int checkAccess(std::string const& path, int mode);

/// The folder gets mode 0777, less the umask.
[[nodiscard]] int makeFolder(std::string const& path);

int removeName(std::string const& path);
int removeEmptyFolder(std::string const& path);

/// Gives a file a second name; a link is not followed.
[[nodiscard]] int addName(std::string const& path, std::string const& secondPath);

/// `flags` as for `renameat2`.
int renameEntry(std::string const& from, std::string const& to, unsigned flags);

inline bool isFolder(Status const& status)
{
    return S_ISDIR(status.stx_mode);
}

inline bool isLink(Status const& status)
{
    return S_ISLNK(status.stx_mode);
}

bool isSameFile(Status const& left, Status const& right);

/// Whether a folder stands at a path, perhaps by a link.
bool leadsToFolder(std::string const& path);

} // namespace foundation::storage::local::detail
