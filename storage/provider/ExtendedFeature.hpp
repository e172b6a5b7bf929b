#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// Optional capabilities of a provider, asked for through `hasFeature`.
enum class ExtendedFeature : std::int32_t
{
    RecursiveFolderRemoval = 0, ///< `removeFolderRecursively` works
    AtomicFileCopy = 5,         ///< `copyFileAtomic` works
};

/// Writes "ExtendedFeature::RecursiveFolderRemoval" for that value and nothing for any other, `AtomicFileCopy`
/// included.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, ExtendedFeature value);

} // namespace foundation::storage::provider
