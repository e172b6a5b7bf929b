#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// Whether a copy writes in place or all-or-nothing.
enum class TransactionPolicy : std::int32_t
{
    NonAtomic, ///< written in place; a failure leaves a partial target
    Atomic,    ///< written aside and moved onto the target when complete
};

/// Writes "TransactionPolicy::" and the enumerator; nothing for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, TransactionPolicy const& value);

} // namespace foundation::storage::provider
