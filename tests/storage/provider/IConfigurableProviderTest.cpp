#include <storage/provider/IConfigurableProvider.hpp>

#include <tests/support/ConfigurableProvider.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <stdexcept>
#include <type_traits>
#include <vector>

namespace foundation::storage::provider {
namespace {

using boost::property_tree::ptree;
using tests::support::ConfigurableProvider;

static_assert(std::is_base_of_v<IProvider, IConfigurableProvider>);
static_assert(std::is_abstract_v<IConfigurableProvider>);
static_assert(sizeof(IConfigurableProvider) == sizeof(void*));
static_assert(
    requires(IProvider * base) { static_cast<IConfigurableProvider*>(base); }, "not a virtual base");
static_assert(std::is_same_v<decltype(&IConfigurableProvider::configure), void (IConfigurableProvider::*)(ptree)>);

struct Opened : IConfigurableProvider
{
    using IConfigurableProvider::doConfigure;
    using IProvider::doGetExtendedAttributes;
};
static_assert(std::is_same_v<decltype(&Opened::doConfigure), void (IConfigurableProvider::*)(ptree)>);

template <class Provider>
concept ConfiguresByTheVirtualOperation = requires(Provider& provider)
{
    provider.doConfigure(ptree());
};
static_assert(ConfiguresByTheVirtualOperation<Opened> && !ConfiguresByTheVirtualOperation<IConfigurableProvider>);

TEST(IConfigurableProvider, ConfiguringIsTheSlotBehindThoseOfIProvider)
{
    EXPECT_EQ(tests::support::slotOf(&Opened::doConfigure),
              tests::support::slotOf(&Opened::doGetExtendedAttributes) + 1);
}

ptree sampleTree()
{
    ptree tree("data of the root");
    tree.put("a", 1);
    tree.put("b.c", "deep");
    return tree;
}

TEST(IConfigurableProvider, HandsOnAllOfTheTree)
{
    ConfigurableProvider provider;
    provider.configure(sampleTree());
    EXPECT_EQ(provider.trees, std::vector{sampleTree()});
}

TEST(IConfigurableProvider, TheCopyIsTheProvidersOwn)
{
    ConfigurableProvider provider;
    provider.onConfigure = [](ConfigurableProvider& own) { own.trees[0].get_child("b").put("c", "changed"); };
    ptree const tree = sampleTree();
    provider.configure(tree);
    EXPECT_EQ(tree, sampleTree());
}

TEST(IConfigurableProvider, FailureOfTheProviderPasses)
{
    ConfigurableProvider provider;
    provider.onConfigure = [](ConfigurableProvider&) { throw std::range_error("no such key"); };
    EXPECT_THROW(provider.configure(sampleTree()), std::range_error);
}

} // namespace
} // namespace foundation::storage::provider
