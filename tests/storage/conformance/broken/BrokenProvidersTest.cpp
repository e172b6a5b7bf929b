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
                              copyDefects, copyBetweenDefects, otherDefects})
    {
        std::vector<Table> some = tables();
        std::move(some.begin(), some.end(), std::back_inserter(all));
    }
    return all;
}

/// Promises that no provider can break, since the public functions of the interface keep them.
std::set<std::string> const keptByTheInterface{"MoveFolder.AFolderDoesNotMoveBelowItself"};

/// Those of copies from the provider of `source` too.
std::vector<Check> everyCheck(Harness const& source)
{
    std::vector<Check> checks = allChecks();
    std::vector<Check> ofCopies = copyChecks(source);
    std::move(ofCopies.begin(), ofCopies.end(), std::back_inserter(checks));
    return checks;
}

Check findCheck(Harness const& source, std::string const& family, std::string const& name)
{
    for (Check const& check : everyCheck(source))
        if (check.family == family && check.name == name)
            return check;
    throw std::logic_error("there is no check " + family + '.' + name);
}

class Rejection : public testing::Test
{
public:
    Rejection(std::string family, Defect defect) : family_(std::move(family)), defect_(std::move(defect)) {}

    void TestBody() override
    {
        Harness const sound = defect_.sound();
        Harness const broken = brokenHarness(defect_);
        EXPECT_EQ(found(sound, sound), std::vector<std::string>{});
        EXPECT_NE(defect_.asSource ? found(broken, sound) : found(sound, broken), std::vector<std::string>{});
    }

private:
    /// What the check finds in a provider; `source` matters to copies alone.
    std::vector<std::string> found(Harness const& source, Harness const& provider) const
    {
        Check const check = findCheck(source, family_, defect_.check);
        EXPECT_TRUE(check.applies(provider));
        return violations(check, provider);
    }

    std::string family_;
    Defect defect_;
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
    for (Check const& check : everyCheck(memoryHarness()))
        EXPECT_TRUE(covered.contains(check.family + '.' + check.name)) << check.family << '.' << check.name;
}

/// The providers that the broken ones are made of and that no program of its own tries.
class SoundProviders : public testing::TestWithParam<Harness (*)()>
{};

TEST_P(SoundProviders, PassTheWholeKit)
{
    Harness const harness = GetParam()();
    for (Check const& check : applicable(allChecks(), harness))
        EXPECT_EQ(violations(check, harness), std::vector<std::string>{}) << check.family << '.' << check.name;
}

INSTANTIATE_TEST_SUITE_P(Plain, SoundProviders, testing::Values(plainHarness));
INSTANTIATE_TEST_SUITE_P(ReadOnly, SoundProviders, testing::Values(readOnlyHarness));
INSTANTIATE_TEST_SUITE_P(Recursive, SoundProviders, testing::Values(recursiveHarness));
INSTANTIATE_TEST_SUITE_P(Picky, SoundProviders, testing::Values(pickyHarness));

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
