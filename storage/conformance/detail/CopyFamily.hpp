#pragma once

#include <storage/conformance/Check.hpp>
#include <storage/conformance/detail/Family.hpp>

#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

namespace foundation::storage::conformance::detail {

/// A function that checks copies from one provider to another, under its own name; see `COPY_CHECK_FUNCTION`.
struct NamedCopyFunction
{
    char const* name;
    void (*run)(Harness const& source, Harness const& destination);
};

/// The checks of a family, which apply to every destination that can be written.
inline std::vector<Check> copyFamily(std::string const& family, Harness const& source,
                                     std::initializer_list<NamedCopyFunction> functions)
{
    std::vector<Check> checks;
    for (NamedCopyFunction const& function : functions)
        checks.push_back({family, checkName(function.name),
                          [source, run = function.run](Harness const& destination) { run(source, destination); },
                          [](Harness const& destination) { return destination.capabilities.writable; }});
    return checks;
}

} // namespace foundation::storage::conformance::detail

#define COPY_CHECK_FUNCTION(function)                                                                                  \
    ::foundation::storage::conformance::detail::NamedCopyFunction                                                      \
    {                                                                                                                  \
#function, function                                                                                            \
    }
