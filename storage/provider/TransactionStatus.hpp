#pragma once

#include <foundation/export.hpp>

#include <cstdint>
#include <iosfwd>

namespace foundation::storage::provider {

/// How a copy that can be interrupted ended.
enum class TransactionStatus : std::int32_t
{
    Completed,
    Aborted, ///< the interrupt function stopped it
};

/// Writes "TransactionStatus::" and the enumerator; nothing for any other value.
FOUNDATION_API std::ostream& operator<<(std::ostream& stream, TransactionStatus const& value);

} // namespace foundation::storage::provider
