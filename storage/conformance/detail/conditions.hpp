#pragma once

#include <storage/conformance/Harness.hpp>

namespace foundation::storage::conformance::detail {

/// Conditions under which checks apply: that a capability is claimed, or that it is not.
inline auto claims(bool Capabilities::*capability)
{
    return [capability](Harness const& harness) { return harness.capabilities.*capability; };
}

inline auto disclaims(bool Capabilities::*capability)
{
    return [capability](Harness const& harness) { return !(harness.capabilities.*capability); };
}

inline bool makesLinks(Harness const& harness)
{
    return static_cast<bool>(harness.makers.symbolicLink);
}

inline bool makesSecondNames(Harness const& harness)
{
    return static_cast<bool>(harness.makers.secondName);
}

inline bool makesSpecialFiles(Harness const& harness)
{
    return static_cast<bool>(harness.makers.specialFile);
}

template <typename Left, typename Right>
auto both(Left left, Right right)
{
    return [left, right](Harness const& harness) { return left(harness) && right(harness); };
}

} // namespace foundation::storage::conformance::detail
