#pragma once

#include <storage/conformance/Capabilities.hpp>

#include <cstddef>
#include <string>
#include <vector>

namespace foundation::storage::conformance::detail {

/// Names that are easy to mistreat: escapes, separators of other systems, patterns, blanks, controls, characters beyond
/// the basic plane, and the longest that the store takes. All differ; those that the store refuses or does not tell
/// from another one are left out.
std::vector<std::u16string> hostileNamesFor(Capabilities const& capabilities);

/// Names of exactly so many bytes in UTF-8: of one byte per character, and of three, filled up with single ones.
std::vector<std::u16string> namesOfLength(std::size_t bytes);

} // namespace foundation::storage::conformance::detail
