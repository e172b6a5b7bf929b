#pragma once

#include <foundation/export.hpp>

#include <string>
#include <string_view>

namespace foundation::storage::local::detail {

/// A name for a file that is still being written, which nobody else picks and nobody can foretell: a random UUID and
/// ".tmp.bak".
FOUNDATION_API std::string scratchName();

/// Whether a name has the form of those: the UUID of version 4, in lower case.
FOUNDATION_API bool isScratchName(std::string_view name);
FOUNDATION_API bool isScratchName(std::u16string_view name);

} // namespace foundation::storage::local::detail
