#include <storage/provider/StorageIRI.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <boost/container_hash/hash.hpp>
#include <boost/unordered_map.hpp>

#include <cstdint>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <unordered_map>
#include <unordered_set>

#include <tests/support/generators.hpp>
#include <tests/support/inThreads.hpp>
#include <tests/support/locationWithText.hpp>

namespace foundation::storage::provider {
namespace {

/// The fold written out step by step, in arithmetic of 128 bits that is cut down to 64 after every step.
std::uint64_t folded(std::u16string const& text)
{
    __extension__ using Wide = unsigned __int128;
    Wide const modulus = Wide(1) << 64;
    Wide const multiplier = 0xc6a4a7935bd1e995;
    Wide hash = 0;
    for (char16_t const unit : text) {
        Wide key = Wide(unit) * multiplier % modulus;
        key = key ^ key / (Wide(1) << 47);
        key = key * multiplier % modulus;
        hash = (hash ^ key) * multiplier % modulus;
        hash = (hash + 0xe6546b64) % modulus;
    }
    return static_cast<std::uint64_t>(hash);
}

/// Counts how often its text is asked for, and fails the time with the number `failing`.
class AskedImpl : public tests::support::TextOnlyImpl
{
public:
    using TextOnlyImpl::TextOnlyImpl;

    std::u16string const& toString() const override
    {
        ++asked;
        if (asked == failing)
            throw std::runtime_error("not yet");
        return TextOnlyImpl::toString();
    }

    mutable int asked = 0;
    int failing = 0;
};

TEST(StorageIRIHash, HasTheSameValuesEverywhere)
{
    EXPECT_EQ(StorageIRI(u"s:/").hashValue(), 0xb6267209ac739dfeU);
    EXPECT_EQ(StorageIRI(u"s://h/a").hashValue(), 0x5ee1346dd8469145U);
    EXPECT_EQ(StorageIRI(u"file:///tmp/a%20b").hashValue(), 0x43a00598222a89e1U);
    EXPECT_EQ(StorageIRI(u"s://h/\u00E9\u4F60\U0001F600").hashValue(), 0xd748519d48228bc2U);
}

TEST(StorageIRIHash, IsThatOfTheCanonicalText)
{
    EXPECT_EQ(StorageIRI(u"s://h/a/").hashValue(), StorageIRI(u"s://h/a").hashValue());
    EXPECT_NE(StorageIRI(u"s://h/A").hashValue(), StorageIRI(u"s://h/a").hashValue());
}

TEST(StorageIRIHash, OfNoTextIsZero)
{
    EXPECT_EQ(tests::support::locationWithText(u"").hashValue(), 0u);
}

TEST(StorageIRIHash, IsFoldedOnceForAllCopies)
{
    auto const implementation = std::make_shared<AskedImpl>(u"s:/a");
    StorageIRI const location{std::shared_ptr<detail::StorageIRIImpl>(implementation)};
    StorageIRI const copy = location;
    for (int i = 0; i != 2; ++i) {
        EXPECT_EQ(location.hashValue(), folded(u"s:/a"));
        EXPECT_EQ(copy.hashValue(), folded(u"s:/a"));
    }
    EXPECT_EQ(implementation->asked, 1);
}

TEST(StorageIRIHash, IsAskedForAgainAfterTheTextCouldNotBeMade)
{
    auto const implementation = std::make_shared<AskedImpl>(u"s:/a");
    implementation->failing = 1;
    StorageIRI const location{std::shared_ptr<detail::StorageIRIImpl>(implementation)};
    EXPECT_THROW(static_cast<void>(location.hashValue()), std::runtime_error);
    EXPECT_EQ(location.hashValue(), folded(u"s:/a"));
}

TEST(StorageIRIHash, ServesTheHashersOfBoostAndOfTheStandardLibrary)
{
    StorageIRI const location(u"s://h/a");
    EXPECT_EQ(hash_value(location), location.hashValue());
    EXPECT_EQ(boost::hash<StorageIRI>()(location), location.hashValue());
    EXPECT_EQ(std::hash<StorageIRI>()(location), location.hashValue());
}

TEST(StorageIRIHash, FindsLocationsInHashedContainers)
{
    boost::unordered_map<StorageIRI, int> boostMap;
    std::unordered_map<StorageIRI, int> map;
    std::unordered_set<StorageIRI> set;
    boostMap[StorageIRI(u"s://h/a")] = map[StorageIRI(u"s://h/a")] = 7;
    set.insert(StorageIRI(u"s://h/a"));
    EXPECT_EQ(boostMap.at(StorageIRI(u"s://h/a/")), 7);
    EXPECT_EQ(map.at(StorageIRI(u"s://h/a/")), 7);
    EXPECT_EQ(set.count(StorageIRI(u"s://h/a/")), 1u);
    EXPECT_EQ(set.count(StorageIRI(u"s://h/b")), 0u);
}

RC_GTEST_PROP(StorageIRIHash, IsTheFoldOfTheCodeUnits, ())
{
    StorageIRI const location(StorageIRI(u"s://h/"), *tests::support::fileName());
    RC_ASSERT(location.hashValue() == folded(location.toString()));
}

TEST(StorageIRIHashConcurrency, ManyThreadsGetTheSameOfAFreshLocation)
{
    std::uint64_t const expected = folded(u"s://h/a/b");
    for (int round = 0; round != 10; ++round) {
        StorageIRI const location(u"s://h/a/b/");
        tests::support::inThreads(32, [&](int) { EXPECT_EQ(location.hashValue(), expected); });
    }
}

} // namespace
} // namespace foundation::storage::provider
