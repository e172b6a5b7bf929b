#pragma once

#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Packed.hpp>

#include <optional>

struct zip;
struct zip_source;

namespace foundation::storage::archive::detail {

/// Packed content as libzip reads it, to be written as it is. `failure` is told what goes wrong, and has to live as
/// long as the source. Throws `std::bad_alloc`.
::zip_source* makePackedSource(::zip* archive, PackedPtr packed, std::optional<Fault>& failure);

} // namespace foundation::storage::archive::detail
