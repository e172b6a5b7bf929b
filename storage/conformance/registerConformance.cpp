#include <storage/conformance/registerConformance.hpp>

#include <storage/conformance/Check.hpp>

#include <gtest/gtest.h>

#include <memory>
#include <utility>
#include <vector>

namespace foundation::storage::conformance {

namespace {

class ConformanceTest : public testing::Test
{
public:
    ConformanceTest(Check check, std::shared_ptr<Harness const> harness)
        : check_(std::move(check)), harness_(std::move(harness))
    {}

    void TestBody() override { run(check_, *harness_); }

private:
    Check check_;
    std::shared_ptr<Harness const> harness_;
};

std::size_t registerApplicable(std::string const& name, std::vector<Check> const& checks, Harness const& harness)
{
    auto const shared = std::make_shared<Harness const>(harness);
    std::vector<Check> const some = applicable(checks, harness);
    for (Check const& check : some)
        testing::RegisterTest((name + '/' + check.family).c_str(), check.name.c_str(), nullptr, nullptr, __FILE__,
                              __LINE__, [=]() -> testing::Test* { return new ConformanceTest(check, shared); });
    return some.size();
}

} // namespace

std::size_t registerConformance(std::string const& provider, Harness const& harness)
{
    return registerApplicable(provider, allChecks(), harness);
}

std::size_t registerCopyConformance(std::string const& pair, Harness const& source, Harness const& destination)
{
    return registerApplicable(pair, copyChecks(source), destination);
}

} // namespace foundation::storage::conformance
