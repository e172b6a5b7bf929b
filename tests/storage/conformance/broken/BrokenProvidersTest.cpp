// The kit is tried on providers with one thing wrong each: the check that is meant for it finds it, and finds nothing
// in the provider without it.

#include <storage/conformance/Check.hpp>
#include <tests/storage/conformance/broken/Defect.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <utility>

namespace foundation::storage::conformance::broken {
namespace {

std::vector<Table> allDefects()
{
    std::vector<Table> all;
    for (auto const tables : {entryDefects, nameDefects, listingDefects, streamDefects, transactionDefects, moveDefects,
                              copyDefects, otherDefects})
    {
        std::vector<Table> some = tables();
        std::move(some.begin(), some.end(), std::back_inserter(all));
    }
    return all;
}

/// Promises that no provider can break, since the public functions of the interface keep them.
std::set<std::string> const keptByTheInterface{"MoveFolder.AFolderDoesNotMoveBelowItself"};

class Rejection : public testing::Test
{
public:
    Rejection(std::string const& family, Defect defect) : defect_(std::move(defect))
    {
        auto const& all = allChecks();
        auto const found = std::find_if(all.begin(), all.end(), [&](Check const& check) {
            return check.family == family && check.name == defect_.check;
        });
        if (found == all.end())
            throw std::logic_error("there is no check " + family + '.' + defect_.check);
        check_ = *found;
    }

    void TestBody() override
    {
        Harness const sound = defect_.sound();
        ASSERT_TRUE(check_.applies(sound));
        EXPECT_EQ(violations(check_, sound), std::vector<std::string>{});
        Harness const broken = brokenHarness(defect_);
        ASSERT_TRUE(check_.applies(broken));
        EXPECT_NE(violations(check_, broken), std::vector<std::string>{});
    }

private:
    Defect defect_;
    Check check_;
};

bool registerRejections()
{
    for (Table const& table : allDefects())
        for (Defect const& defect : table.defects)
            testing::RegisterTest(("BrokenProvider/" + table.family).c_str(),
                                  (defect.check + "_" + defect.name).c_str(), nullptr, nullptr, __FILE__, __LINE__,
                                  [=]() -> testing::Test* { return new Rejection(table.family, defect); });
    return true;
}

[[maybe_unused]] bool const registered = registerRejections();

TEST(BrokenProviders, EveryCheckHasOneThatItRejects)
{
    std::set<std::string> covered = keptByTheInterface;
    for (Table const& table : allDefects())
        for (Defect const& defect : table.defects)
            covered.insert(table.family + '.' + defect.check);
    for (Check const& check : allChecks())
        EXPECT_TRUE(covered.contains(check.family + '.' + check.name)) << check.family << '.' << check.name;
}

} // namespace

Harness brokenHarness(Defect const& defect)
{
    auto const broken = [wrap = defect.wrap, misbehaviour = defect.misbehaviour](Place place) {
        place.provider = wrap ? wrap(place.provider) : misbehaving(place.provider, misbehaviour);
        return place;
    };
    Harness harness = defect.base ? defect.base() : defect.sound();
    if (harness.makePlace)
        harness.makePlace = [broken, make = harness.makePlace] { return broken(make()); };
    if (harness.makeFilledPlace)
        harness.makeFilledPlace = [broken, make = harness.makeFilledPlace](Tree const& content) {
            return broken(make(content));
        };
    if (defect.claim)
        defect.claim(harness.capabilities);
    return harness;
}

} // namespace foundation::storage::conformance::broken
