#pragma once

#include <exception>
#include <string>

namespace foundation::storage::conformance::detail {

/// Says for the reader of a failed check what was thrown, with code and location where there are any.
std::string describe(std::exception_ptr const& thrown);

} // namespace foundation::storage::conformance::detail
