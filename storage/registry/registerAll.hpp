#pragma once

#include <foundation/export.hpp>
#include <storage/registry/Registry.hpp>

namespace foundation::storage::registry {

/// Adds every provider that is built in: `file`, `mem` and, where this was built with the libraries for them,
/// `cpio`, `iso`, `sevenzip`, `tar` and `zip`.
/// Throws `std::invalid_argument` when one of their schemes is taken; those before it are added then.
FOUNDATION_API void registerAll(Registry& registry);

} // namespace foundation::storage::registry
