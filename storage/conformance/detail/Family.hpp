#pragma once

#include <storage/conformance/Check.hpp>

#include <cctype>
#include <functional>
#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

namespace foundation::storage::conformance::detail {

/// A check function under its own name; see `CHECK_FUNCTION`.
struct NamedFunction
{
    char const* name;
    void (*run)(Harness const& harness);
};

/// The name of a check: that of its function, with a capital.
inline std::string checkName(std::string function)
{
    function[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(function[0])));
    return function;
}

/// Writes the table of a family: which checks there are, and for which providers.
class Family
{
public:
    explicit Family(std::string name) : name_(std::move(name)) {}

    /// Checks that need nothing but a place with some content in it.
    Family& forAll(std::initializer_list<NamedFunction> functions)
    {
        return add(functions, [](Harness const&) { return true; });
    }

    /// Checks that change the store.
    Family& forWritable(std::initializer_list<NamedFunction> functions)
    {
        return forWritable([](Harness const&) { return true; }, functions);
    }

    /// Checks that change the store, for providers of which `condition` holds.
    template <typename Condition>
    Family& forWritable(Condition condition, std::initializer_list<NamedFunction> functions)
    {
        return add(functions, [condition](Harness const& harness) {
            return harness.capabilities.writable && static_cast<bool>(condition(harness));
        });
    }

    /// Checks for providers of which `condition` holds, writable or not.
    Family& when(std::function<bool(Harness const&)> condition, std::initializer_list<NamedFunction> functions)
    {
        return add(functions, condition);
    }

    std::vector<Check> checks() { return std::move(checks_); }

private:
    Family& add(std::initializer_list<NamedFunction> functions, std::function<bool(Harness const&)> const& applies)
    {
        for (NamedFunction const& function : functions)
            checks_.push_back({name_, checkName(function.name), function.run, applies});
        return *this;
    }

    std::string name_;
    std::vector<Check> checks_;
};

} // namespace foundation::storage::conformance::detail

#define CHECK_FUNCTION(function)                                                                                       \
    ::foundation::storage::conformance::detail::NamedFunction                                                          \
    {                                                                                                                  \
#function, function                                                                                            \
    }
