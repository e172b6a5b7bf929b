#include <storage/registry/Registry.hpp>

#include <storage/registry/OpenException.hpp>
#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/support/thrown.hpp>

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using namespace tests::support;

/// A registry that serves `disk` and the containers `box`.
struct RegistryOfSchemes : testing::Test
{
    RegistryOfSchemes()
    {
        registry.add(u"disk", disk);
        registry.add(u"box", box);
    }

    /// Why an action opens nothing, as text.
    template <typename Action>
    static std::string refusalBy(Action const& action)
    {
        try {
            action();
            return "opened";
        } catch (OpenException const& error) {
            std::ostringstream text;
            text << error.getReason() << " at " << error.getStorageIRI();
            return text.str();
        }
    }
    std::string refusalOf(std::u16string const& text) const
    {
        return refusalBy([&] { registry.open(text); });
    }

    std::shared_ptr<FakePhysicalFactory> disk = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakeContainerFactory> box = std::make_shared<FakeContainerFactory>();
    Registry registry;
};

TEST_F(RegistryOfSchemes, OpensWhatIsServed)
{
    EXPECT_EQ(refusalOf(u"disk:/a"), "opened");
    EXPECT_EQ(refusalOf(u"box:disk:/a!/b"), "opened");
    EXPECT_EQ(refusalOf(u"BOX:box:DISK:/a!/b!/c"), "opened");
}

TEST_F(RegistryOfSchemes, UnknownSchemesAreRefusedWhereTheyStand)
{
    EXPECT_EQ(refusalOf(u"tape:/a"), "Reason::UnknownScheme at tape:/a");
    EXPECT_EQ(refusalOf(u"tape:disk:/a!/b"), "Reason::UnknownScheme at tape:disk:/a!/b");
    EXPECT_EQ(refusalOf(u"box:tape:/a!/b"), "Reason::UnknownScheme at tape:/a");
    EXPECT_EQ(refusalOf(u"box:tape:disk:/a!/b!/c"), "Reason::UnknownScheme at tape:disk:/a!/b");
}

TEST_F(RegistryOfSchemes, ContainerSchemesWithoutAContainerAreRefused)
{
    EXPECT_EQ(refusalOf(u"box:/a"), "Reason::ContainerNeedsContainer at box:/a");
    EXPECT_EQ(refusalOf(u"box://h/a"), "Reason::ContainerNeedsContainer at box://h/a");
    EXPECT_EQ(refusalOf(u"box:box:/a!/b"), "Reason::ContainerNeedsContainer at box:/a");
}

TEST_F(RegistryOfSchemes, PlainSchemesOfContainersAreRefused)
{
    EXPECT_EQ(refusalOf(u"disk:disk:/a!/b"), "Reason::PlainSchemeOfContainer at disk:disk:/a!/b");
    EXPECT_EQ(refusalOf(u"box:disk:disk:/a!/b!/c"), "Reason::PlainSchemeOfContainer at disk:disk:/a!/b");
}

TEST_F(RegistryOfSchemes, LocationsAreRefusedLikeText)
{
    auto const refusal = [&](StorageIRI const& location) { return refusalBy([&] { registry.open(location); }); };
    EXPECT_EQ(refusal(StorageIRI(u"tape", fl::filesystem::upath(u"/a"))), "Reason::UnknownScheme at tape:///a");
    EXPECT_EQ(refusal(StorageIRI(u"no scheme", fl::filesystem::upath(u"/a"))),
              "Reason::UnknownScheme at no scheme:///a");
    EXPECT_EQ(refusal(StorageIRI(u"box", fl::filesystem::upath(u"/a"))), "Reason::ContainerNeedsContainer at box:///a");
    EXPECT_EQ(refusal(StorageIRI(u"disk", StorageIRI(u"disk:/a"), u"/b")),
              "Reason::PlainSchemeOfContainer at disk:disk:/a!/b");
}

TEST_F(RegistryOfSchemes, TextThatIsNoLocationIsRefusedForItsSchemeFirst)
{
    EXPECT_EQ(refusalOf(u"tape:a"), "Reason::UnknownScheme at tape:/");
    EXPECT_EQ(refusalOf(u"Tape:"), "Reason::UnknownScheme at Tape:/");
    EXPECT_EQ(refusalOf(u"tape://h:99999/"), "Reason::UnknownScheme at tape:/");
    EXPECT_EQ(refusalOf(u"disk:a"), "Reason::PlainSchemeOfContainer at disk:/");
    EXPECT_EQ(refusalOf(u"box:tape:a!/b"), "Reason::UnknownScheme at tape:/");
    EXPECT_EQ(refusalOf(u"box:disk:a!/b"), "Reason::PlainSchemeOfContainer at disk:/");
}

TEST_F(RegistryOfSchemes, OtherTextThatIsNoLocationFailsAsTheLocationDoes)
{
    EXPECT_EQ(internalTextOf<std::runtime_error>([&] { registry.open(u"a/b"); }), u"IRI 'a/b' is not absolute.");
    EXPECT_EQ(internalTextOf<std::runtime_error>([&] { registry.open(u"box:disk:/a"); }),
              u"Invalid container-style storage IRI 'box:disk:/a'. Expected to find a '!' to begin the path section.");
    EXPECT_THROW(registry.open(u"disk://h:99999/"), std::invalid_argument);
    EXPECT_THROW(registry.open(u"disk:/\xD800"), std::out_of_range);
}

TEST_F(RegistryOfSchemes, NothingIsBuiltForWhatIsRefused)
{
    EXPECT_NE(refusalOf(u"box:tape:disk:/a!/b!/c"), "opened");
    EXPECT_NE(refusalOf(u"tape:box:disk:/a!/b!/c"), "opened");
    EXPECT_NE(refusalOf(u"disk:box:disk:/a!/b!/c"), "opened");
    EXPECT_EQ(disk->built, 0);
    EXPECT_EQ(box->built, 0);
}

} // namespace
} // namespace foundation::storage::registry
