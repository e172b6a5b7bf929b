#pragma once

#include <storage/local/detail/copyContent.hpp>
#include <storage/local/detail/fileSystem.hpp>

namespace foundation::storage::local::detail {

// What a copy takes over of its source, which `getFullStatus` told of. They work on open files and folders, and answer
// 0 or `errno`.

/// The owner and the group, as far as this user may give files away, and the permissions. Set-user-id and set-group-id
/// go where the owner or the group does.
[[nodiscard]] int keepOwnerAndMode(int file, Status const& source);

/// The owner and the group of a link itself, as far as this user may.
[[nodiscard]] int keepOwnerOfLink(At const& link, Status const& source);

/// The times of the last access and change, by what reading and writing touches no more afterwards.
[[nodiscard]] int keepTimes(int file, Status const& source);
[[nodiscard]] int keepTimesOfLink(At const& link, Status const& source);

/// The extended attributes of the user, beside those that the target has. Those that this user may not read are left
/// out.
CopyResult keepUserAttributes(int source, int target);

} // namespace foundation::storage::local::detail
