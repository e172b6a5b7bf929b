#include <storage/registry/Registry.hpp>

#include <storage/memory/MemoryProviderFactory.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/support/failureOf.hpp>
#include <tests/support/thrown.hpp>

#include <gtest/gtest.h>

#include <stdexcept>
#include <type_traits>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using namespace tests::support;

static_assert(!std::is_copy_constructible_v<Registry>);
static_assert(!std::is_copy_assignable_v<Registry>);

/// Makes no provider.
class EmptyFactory : public PhysicalProviderFactory
{
protected:
    std::shared_ptr<IProvider> doBuildProvider(StorageIRI const&) const override { return nullptr; }
    StorageIRI doGetKey(StorageIRI const& location) const override { return location; }
};

struct Registered : testing::Test
{
    Registered()
    {
        registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
        registry.add(u"fake", fake);
    }

    std::shared_ptr<FakePhysicalFactory> fake = std::make_shared<FakePhysicalFactory>();
    Registry registry;
};

std::string complaintOf(Registry& registry, std::u16string const& scheme)
{
    return textOf<std::invalid_argument>(
        [&] { registry.add(scheme, std::make_shared<memory::MemoryProviderFactory>()); });
}

TEST_F(Registered, OpensTextAndLocationsAlike)
{
    StorageItem const byText = registry.open(u"mem://a/x%20y");
    EXPECT_EQ(byText.getLocation(), StorageIRI(u"mem://a/x%20y"));
    EXPECT_EQ(registry.open(StorageIRI(u"mem://a/x%20y")), byText);
}

TEST_F(Registered, OpensItemsThatWork)
{
    registry.open(u"mem:///file").createFile();
    EXPECT_TRUE(registry.open(u"mem:///file").fileExists());
    EXPECT_FALSE(registry.open(u"mem://elsewhere/file").fileExists());
}

TEST_F(Registered, OpensLocationsMadeOfPathsAsTheyAre)
{
    StorageIRI const location(u"mem", fl::filesystem::upath(u"/a b"));
    StorageItem const item = registry.open(location);
    EXPECT_EQ(item.getLocation().toString(), location.toString());
    item.createFile();
    EXPECT_TRUE(registry.open(u"mem:///a%20b").fileExists());
}

TEST_F(Registered, LocationsOfOneKeyShareTheirProvider)
{
    StorageItem const first = registry.open(u"fake://h/a");
    EXPECT_TRUE(registry.open(u"fake://h/b/c").hasSameProviderInstance(first));
    EXPECT_FALSE(registry.open(u"fake://other/a").hasSameProviderInstance(first));
    EXPECT_EQ(fake->built, 2);
}

TEST_F(Registered, OpensWhatAFactoryBuildsByItself)
{
    StorageItem const item = registry.open(u"fake://h/a");
    EXPECT_EQ(item, StorageItem(fake->last.lock(), StorageIRI(u"fake://h/a")));
}

TEST_F(Registered, KeepsNoProviderAlive)
{
    registry.open(u"fake://h/a");
    EXPECT_EQ(fake->built, 1);
    EXPECT_TRUE(fake->last.expired());
}

TEST_F(Registered, LetterCaseOfSchemesIsIgnored)
{
    StorageItem const item = registry.open(u"FaKe://h/a");
    EXPECT_EQ(item.getLocation().toString(), u"FaKe://h/a");
}

TEST_F(Registered, FailuresOfFactoriesPassUnchanged)
{
    fake->onBuild = [] { throw std::domain_error("cannot be built"); };
    EXPECT_EQ(textOf<std::domain_error>([&] { registry.open(u"fake://h/a"); }), "cannot be built");
    EXPECT_EQ(failureOf([&] { registry.open(u"mem://a/b?c"); }),
              failure(ErrorCode::InvalidLocation, StorageIRI(u"mem://a/b?c")));
}

TEST_F(Registered, FactoryThatMakesNoProviderIsAnInternalError)
{
    registry.add(u"empty", std::make_shared<EmptyFactory>());
    EXPECT_EQ(failureOf([&] { registry.open(u"empty:/a"); }),
              failure(ErrorCode::InternalError, StorageIRI(u"empty:/a")));
}

TEST(Registry, ItemsOutliveIt)
{
    auto registry = std::make_unique<Registry>();
    registry->add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
    StorageItem const item = registry->open(u"mem:///file");
    registry.reset();
    item.createFile();
    EXPECT_TRUE(item.fileExists());
}

TEST(Registry, ListsWhatItServesSortedWithTheKind)
{
    Registry registry;
    EXPECT_TRUE(registry.schemes().empty());
    registry.add(u"Zip", std::make_shared<FakeContainerFactory>());
    registry.add(u"mem", std::make_shared<FakePhysicalFactory>());
    registry.add(u"A.b+c-1", std::make_shared<FakePhysicalFactory>());
    std::vector<Scheme> const expected{
        {u"a.b+c-1", SchemeKind::Physical}, {u"mem", SchemeKind::Physical}, {u"zip", SchemeKind::Container}};
    EXPECT_EQ(registry.schemes(), expected);
}

TEST_F(Registered, RefusesSchemesThatAreServed)
{
    EXPECT_EQ(complaintOf(registry, u"mem"), "The scheme \"mem\" is served already.");
    EXPECT_EQ(complaintOf(registry, u"MEM"), "The scheme \"MEM\" is served already.");
    EXPECT_EQ(textOf<std::invalid_argument>([&] { registry.add(u"mem", std::make_shared<FakeContainerFactory>()); }),
              "The scheme \"mem\" is served already.");
    EXPECT_EQ(registry.schemes().size(), 2U);
}

TEST_F(Registered, RefusesMalformedSchemes)
{
    for (char16_t const* const scheme : {u"", u"1a", u"a b", u"a:", u"a/b", u"+a", u"\u00E9", u"a%41"}) {
        std::string const complaint = complaintOf(registry, scheme);
        EXPECT_TRUE(complaint.ends_with("is malformed.")) << complaint;
    }
    EXPECT_EQ(registry.schemes().size(), 2U);
}

TEST_F(Registered, RefusesMissingFactories)
{
    std::string const complaint = "The scheme \"new\" comes without a factory.";
    EXPECT_EQ(textOf<std::invalid_argument>([&] { registry.add(u"new", std::shared_ptr<PhysicalProviderFactory>()); }),
              complaint);
    EXPECT_EQ(textOf<std::invalid_argument>([&] { registry.add(u"new", std::shared_ptr<ContainerProviderFactory>()); }),
              complaint);
}

} // namespace
} // namespace foundation::storage::registry
