#pragma once

#include <cstdint>
#include <optional>

struct zip;

namespace foundation::storage::archive::detail {

/// When an entry was modified, in microseconds since 1970, UTC; nothing where it has but the time of day of the place
/// where it was made.
std::optional<std::int64_t> utcTimeOfEntry(::zip* archive, std::uint64_t number);

/// Sets when an entry was modified, to the second; answers false for a failure of libzip.
bool setTimeOfEntry(::zip* archive, std::uint64_t number, std::int64_t microseconds);

} // namespace foundation::storage::archive::detail
