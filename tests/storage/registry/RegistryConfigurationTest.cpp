#include <storage/registry/Registry.hpp>

#include <storage/memory/MemoryProviderFactory.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/registry/FactoryException.hpp>
#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/storage/registry/wordsOf.hpp>
#include <tests/support/CallLog.hpp>
#include <tests/support/thrown.hpp>

#include <gtest/gtest.h>

#include <stdexcept>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using namespace tests::support;
using boost::property_tree::ptree;

/// Three stores with a live provider each, and a scheme of containers.
struct ConfiguredRegistry : testing::Test
{
    ConfiguredRegistry()
    {
        registry.add(u"a", a);
        registry.add(u"b", b);
        registry.add(u"c", c);
        registry.add(u"zip", std::make_shared<FakeContainerFactory>());
        for (auto const& [factory, name] : {std::pair(a, "a"), std::pair(b, "b"), std::pair(c, "c")})
            factory->onConfigure = [this, name = name] { log.push_back(name); };
        for (char16_t const* const location : {u"a:/", u"b:/", u"c:/"})
            items.push_back(registry.open(location));
    }

    std::string complaintAbout(ptree const& settings)
    {
        return textOf<std::invalid_argument>([&] { registry.configure(settings); });
    }

    CallLog log;
    std::shared_ptr<FakePhysicalFactory> a = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakePhysicalFactory> b = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakePhysicalFactory> c = std::make_shared<FakePhysicalFactory>();
    Registry registry;
    std::vector<StorageItem> items;
};

/// A tree with these paths and values.
ptree tree(std::initializer_list<std::pair<char const*, char const*>> values)
{
    ptree result;
    for (auto const& [path, value] : values)
        result.put(path, value);
    return result;
}

void fail()
{
    throw std::domain_error("no");
}

TEST_F(ConfiguredRegistry, GivesEachSchemeItsPart)
{
    registry.configure(tree({{"a.key", "1"}, {"b.deep.key", "2"}}));
    EXPECT_EQ(a->settings(), std::vector{tree({{"key", "1"}})});
    EXPECT_EQ(b->settings(), std::vector{tree({{"deep.key", "2"}})});
}

TEST_F(ConfiguredRegistry, LeavesSchemesAloneThatAreNotNamed)
{
    registry.configure(tree({{"a.key", "1"}}));
    registry.configure(tree({{"b.key", "2"}}));
    EXPECT_EQ(a->settings().size(), 1U);
    EXPECT_TRUE(c->settings().empty());
    StorageItem const later = registry.open(u"a://later/");
    EXPECT_EQ(a->settings(), std::vector{tree({{"key", "1"}})});
}

TEST_F(ConfiguredRegistry, ConfiguresWhatIsOpenedLater)
{
    registry.configure(tree({{"a.key", "1"}}));
    StorageItem const later = registry.open(u"a://later/");
    EXPECT_EQ(a->settings(), std::vector{tree({{"key", "1"}})});
}

TEST_F(ConfiguredRegistry, IgnoresLetterCaseOfSchemes)
{
    registry.configure(tree({{"A.Key", "1"}}));
    EXPECT_EQ(a->settings(), std::vector{tree({{"Key", "1"}})});
}

TEST_F(ConfiguredRegistry, TakesNothingFromAnEmptyTree)
{
    registry.configure({});
    EXPECT_TRUE(log.empty());
}

TEST_F(ConfiguredRegistry, RefusesUnknownSchemesByNameBeforeItConfigures)
{
    EXPECT_EQ(complaintAbout(tree({{"a.key", "1"}, {"other.key", "canary"}})),
              "The scheme \"other\" has settings, but nothing serves it.");
    EXPECT_EQ(complaintAbout(tree({{"a", "canary"}, {"oth\xFFr", "canary"}})),
              "The scheme \"oth\xFFr\" has settings, but nothing serves it.");
    EXPECT_TRUE(log.empty());
}

TEST_F(ConfiguredRegistry, RefusesSettingsOfContainers)
{
    EXPECT_EQ(complaintAbout(tree({{"a.key", "1"}, {"zip.key", "canary"}})),
              "The scheme \"zip\" has settings, which schemes of containers do not take.");
    EXPECT_TRUE(log.empty());
}

TEST_F(ConfiguredRegistry, RefusesSettingsThatStandTwice)
{
    EXPECT_EQ(complaintAbout(tree({{"a.key", "1"}, {"A.key", "canary"}})), "The scheme \"A\" has settings twice.");
    EXPECT_TRUE(log.empty());
}

TEST_F(ConfiguredRegistry, ReachesAllFactoriesAndThrowsTheFirstFailure)
{
    a->onConfigure = fail;
    c->onConfigure = [] { throw Exception(ErrorCode::PermissionDenied, StorageIRI(u"c:/")); };
    try {
        registry.configure(tree({{"c.key", "3"}, {"b.key", "2"}, {"a.key", "1"}}));
        FAIL();
    } catch (FactoryException const& error) {
        EXPECT_EQ(error.getStorageIRI(), StorageIRI(u"a:/"));
    }
    EXPECT_EQ(log, CallLog{"b"});
    EXPECT_EQ(c->settings().size(), 1U);
}

TEST_F(ConfiguredRegistry, KeepsTheSettingsOfAFactoryThatFailed)
{
    a->onConfigure = fail;
    EXPECT_THROW(registry.configure(tree({{"a.key", "1"}})), FactoryException);
    a->onConfigure = [] {};
    StorageItem const later = registry.open(u"a://later/");
    EXPECT_EQ(a->settings(), std::vector{tree({{"key", "1"}})});
}

TEST(Registry, ConfiguresTheLimitOfMemory)
{
    Registry registry;
    registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
    registry.configure(tree({{"mem.limit", "3"}}));
    auto const stream = registry.open(u"mem:///file").openStream({});
    EXPECT_THROW(stream->write("1234", 4), ByteStreamFailure);
}

TEST(Registry, DoesNotRepeatALimitThatIsNoNumber)
{
    Registry registry;
    registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
    StorageItem const item = registry.open(u"mem:///");
    EXPECT_EQ(wordsOf([&] { registry.configure(tree({{"mem.limit", "canary"}})); }).find("canary"), std::string::npos);
    EXPECT_EQ(wordsOf([&] { registry.open(u"mem://other/"); }).find("canary"), std::string::npos);
}

} // namespace
} // namespace foundation::storage::registry
