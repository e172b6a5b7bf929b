#pragma once

#include <string>
#include <utility>

namespace foundation::storage::provider::detail {

/// Where the name of a path begins: what stands before it, the '/' included, and the name itself.
/// A trailing '/' is part of neither; the name of "/" is "/".
std::pair<std::u16string, std::u16string> splitName(std::u16string const& path);

} // namespace foundation::storage::provider::detail
