#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// How names are matched with regard to letter case.
enum class CaseModifier : std::int32_t
{
    None,        ///< as written
    Sensitive,   ///< letters of different case differ
    InSensitive, ///< letters of different case are equal
};

/// Writes "CaseModifier::" and the enumerator; nothing for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, CaseModifier value);

} // namespace foundation::storage::provider
