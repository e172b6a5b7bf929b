#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/SystemCalls.hpp>

#include <cstddef>
#include <fcntl.h>

namespace foundation::storage::local::detail {

// One call of the operating system each, made again when a signal interrupts it. They answer 0 or `errno`.

/// A path and the open folder from which it starts. An absolute path starts from the root whatever the folder.
struct At
{
    int folder = AT_FDCWD;
    char const* path;
};

/// What the system knows of a file.
using Status = struct statx;

enum class Links
{
    Follow,
    Keep,
};

inline constexpr mode_t newFileMode = 0666;
inline constexpr mode_t newFolderMode = 0777;

/// A new file gets `mode`, less the umask.
[[nodiscard]] int openFile(At const& at, int flags, FileDescriptor& file, mode_t mode = newFileMode);

[[nodiscard]] int getStatus(At const& at, Links links, Status& status);

/// Of an open file.
[[nodiscard]] int getStatus(FileDescriptor const& file, Status& status);

// The same, with all that `statx` can tell.

[[nodiscard]] int getFullStatus(FileDescriptor const& file, Status& status);
[[nodiscard]] int getFullStatus(At const& at, Links links, Status& status);

/// Whether this user may do what `mode` (`W_OK`, `X_OK`) says.
[[nodiscard]] int checkAccess(At const& at, int mode);
[[nodiscard]] int checkAccess(FileDescriptor const& file, int mode);

// Also of a file that was opened with `O_PATH`, by its path below /proc where no call takes such a descriptor;
// `EOPNOTSUPP` where /proc is not mounted.

[[nodiscard]] int setMode(FileDescriptor const& file, mode_t mode);

/// Leaves the time of the last access as it is.
[[nodiscard]] int setModified(FileDescriptor const& file, timespec const& time);

inline constexpr std::size_t maximumAttributeSize = 64 * 1024; // no system holds longer lists, nor values

/// Names, each ended by NUL. The buffer has to have room for the maximum, so that nothing can grow beyond it meanwhile.
[[nodiscard]] int listAttributes(FileDescriptor const& file, char* names, std::size_t& size);
[[nodiscard]] int getAttribute(FileDescriptor const& file, char const* name, char* value, std::size_t& size);

/// The folder gets `mode`, less the umask.
[[nodiscard]] int makeFolder(At const& at, mode_t mode = newFolderMode);

int removeName(At const& at);
int removeEmptyFolder(At const& at);

/// Gives a file a second name; a link is not followed.
[[nodiscard]] int addName(At const& from, At const& to);

/// Gives a name to a file that was made with `O_TMPFILE`. `ENOENT` where this user has no right to do so by descriptor
/// (`CAP_DAC_READ_SEARCH`), and /proc, which needs none, is not mounted.
[[nodiscard]] int nameFile(FileDescriptor const& file, At const& to);

/// `flags` as for `renameat2`.
int renameEntry(At const& from, At const& to, unsigned flags);

inline bool isFolder(Status const& status)
{
    return S_ISDIR(status.stx_mode);
}

inline bool isLink(Status const& status)
{
    return S_ISLNK(status.stx_mode);
}

bool isSameFile(Status const& left, Status const& right);

} // namespace foundation::storage::local::detail
