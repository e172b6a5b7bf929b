#pragma once

#include <functional>
#include <string>

namespace foundation::storage::conformance::detail {

inline constexpr int threadCount = 16;

/// Runs `action` in all threads at once, and reports as failures of the check what they throw.
void onThreads(std::function<void(int thread)> const& action);

/// Throws `std::runtime_error` unless `condition` holds; for threads, which report by throwing.
void requireThat(bool condition, std::string const& what);

} // namespace foundation::storage::conformance::detail
