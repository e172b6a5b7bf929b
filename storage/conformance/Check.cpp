#include <storage/conformance/Check.hpp>

#include <storage/conformance/detail/describe.hpp>
#include <storage/conformance/detail/families.hpp>

#include <gtest/gtest-spi.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <exception>
#include <iterator>

namespace foundation::storage::conformance {

namespace {

std::vector<Check> gather()
{
    std::vector<Check> all;
    for (auto const family : detail::families) {
        std::vector<Check> checks = family();
        std::move(checks.begin(), checks.end(), std::back_inserter(all));
    }
    return all;
}

} // namespace

std::vector<Check> const& allChecks()
{
    static std::vector<Check> const checks = gather();
    return checks;
}

std::vector<Check> copyChecks(Harness const& source)
{
    std::vector<Check> all;
    for (auto const family : detail::copyFamilies) {
        std::vector<Check> checks = family(source);
        std::move(checks.begin(), checks.end(), std::back_inserter(all));
    }
    return all;
}

std::vector<Check> applicable(std::vector<Check> const& checks, Harness const& harness)
{
    std::vector<Check> some;
    std::copy_if(checks.begin(), checks.end(), std::back_inserter(some),
                 [&](Check const& check) { return check.applies(harness); });
    return some;
}

void run(Check const& check, Harness const& harness)
{
    try {
        check.run(harness);
    } catch (...) {
        ADD_FAILURE() << "The check ended by an exception that it did not expect: "
                      << detail::describe(std::current_exception());
    }
}

std::vector<std::string> violations(Check const& check, Harness const& harness)
{
    testing::TestPartResultArray results;
    {
        testing::ScopedFakeTestPartResultReporter const reporter(
            testing::ScopedFakeTestPartResultReporter::INTERCEPT_ALL_THREADS, &results);
        run(check, harness);
    }
    std::vector<std::string> messages;
    for (int i = 0; i < results.size(); ++i)
        if (results.GetTestPartResult(i).failed())
            messages.emplace_back(results.GetTestPartResult(i).message());
    return messages;
}

} // namespace foundation::storage::conformance
