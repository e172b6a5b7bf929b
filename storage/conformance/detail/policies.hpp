#pragma once

#include <storage/provider/ReplacementPolicy.hpp>

#include <array>

namespace foundation::storage::conformance::detail {

using provider::ReplacementPolicy;

inline constexpr std::array preservingPolicies{ReplacementPolicy::Preserve, ReplacementPolicy::NoClobber};
inline constexpr std::array replacingPolicies{ReplacementPolicy::Overwrite, ReplacementPolicy::Clobber};
inline constexpr std::array allPolicies{ReplacementPolicy::Preserve, ReplacementPolicy::Overwrite,
                                        ReplacementPolicy::Clobber, ReplacementPolicy::NoClobber};

} // namespace foundation::storage::conformance::detail
