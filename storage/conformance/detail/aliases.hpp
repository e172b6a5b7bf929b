#pragma once

#include <storage/conformance/detail/Scene.hpp>

#include <string>
#include <vector>

namespace foundation::storage::conformance::detail {

/// Locations of other texts that name the entry at a path: the path itself, with an escape for a letter of it, by way
/// of
/// "." and, where `folder` stands beside it, by way of "..". A name in another case where the store does not tell case.
std::vector<provider::StorageIRI> spellingsOf(Scene const& scene, std::u16string const& name);

} // namespace foundation::storage::conformance::detail
