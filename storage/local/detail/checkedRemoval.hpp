#pragma once

#include <storage/local/detail/fileSystem.hpp>

#include <functional>

namespace foundation::storage::local::detail {

/// Answers 0 for an entry that may be removed, or the `errno` for which it stays. A name given to it meanwhile counts
/// as a change of its attributes.
using MayRemove = std::function<int(Status const& entry)>;

// To look at a name and then remove it would lose what somebody renames onto it in between. So the entry is given a
// name first that nobody else knows, looked at there, and given its own name back where it stays. That name is not
// taken from another that has got it meanwhile: then it is the unknown one that stays. They answer 0 or `errno`.

/// Removes a file or link; `EISDIR` for a folder.
[[nodiscard]] int removeNameChecked(At const& entry, MayRemove const& mayRemove);

[[nodiscard]] int removeEmptyFolderChecked(At const& entry, MayRemove const& mayRemove);

} // namespace foundation::storage::local::detail
