#pragma once

#include <foundation/export.hpp>
#include <storage/conformance/Harness.hpp>

#include <functional>
#include <string>
#include <vector>

namespace foundation::storage::conformance {

/// One promise of the provider interface, and the code that finds out whether a provider keeps it.
struct Check
{
    std::string family;
    std::string name;

    /// Makes a place of its own, uses the provider there, and reports each broken promise as a GoogleTest failure.
    std::function<void(Harness const& harness)> run;

    /// Whether the promise is one that the provider of this harness gives.
    std::function<bool(Harness const& harness)> applies;
};

/// Every check of a provider, in families.
FOUNDATION_API std::vector<Check> const& allChecks();

/// Every check of copies from the provider of `source`; to be run with the provider that is copied to.
FOUNDATION_API std::vector<Check> copyChecks(Harness const& source);

/// Those of `checks` that apply to a provider.
FOUNDATION_API std::vector<Check> applicable(std::vector<Check> const& checks, Harness const& harness);

/// Runs a check, and turns what it throws into a failure too.
FOUNDATION_API void run(Check const& check, Harness const& harness);

/// Runs a check apart from the test that calls, and answers the failures that it reported; none when all is well.
FOUNDATION_API std::vector<std::string> violations(Check const& check, Harness const& harness);

} // namespace foundation::storage::conformance
