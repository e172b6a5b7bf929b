#include <storage/registry/Registry.hpp>

#include <storage/registry/FactoryException.hpp>
#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/storage/registry/wordsOf.hpp>

#include <boost/exception/errinfo_api_function.hpp>

#include <gtest/gtest.h>

#include <new>
#include <stdexcept>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using boost::property_tree::ptree;

/// The password among the settings.
constexpr char const* canary = "canary-2f7c";

ptree settings()
{
    ptree result;
    result.put("s.user", "somebody");
    result.put("s.password", canary);
    return result;
}

[[noreturn]] void throwRuntimeError()
{
    throw std::runtime_error(std::string("cannot log in with ") + canary);
}

[[noreturn]] void throwAtALocationWithPassword()
{
    throw Exception(ErrorCode::PermissionDenied, StorageIRI(u"s://somebody:canary-2f7c@h/"));
}

[[noreturn]] void throwWithInformation()
{
    Exception error(ErrorCode::IOError, StorageIRI(u"s://h/"));
    error << boost::errinfo_api_function(canary);
    throw error;
}

[[noreturn]] void throwNested()
{
    try {
        throwRuntimeError();
    } catch (...) {
        std::throw_with_nested(std::runtime_error("cannot log in"));
    }
}

/// What a property tree throws where a number is read and a password stands: it carries the value.
[[noreturn]] void throwFromTheTree()
{
    throw boost::property_tree::ptree_bad_data("conversion of data to type \"i\" failed",
                                               settings().get<std::string>("s.password"));
}

[[noreturn]] void throwAText()
{
    throw std::string(canary);
}

struct Failure
{
    void (*raise)();
    ErrorCode code;
    bool saysThePassword;
};

constexpr Failure failures[] = {
    {throwRuntimeError, ErrorCode::Unknown, true},    {throwAtALocationWithPassword, ErrorCode::PermissionDenied, true},
    {throwWithInformation, ErrorCode::IOError, true}, {throwNested, ErrorCode::Unknown, true},
    {throwFromTheTree, ErrorCode::Unknown, false},    {throwAText, ErrorCode::Unknown, false},
};

bool saysThePassword(std::string const& words)
{
    return words.find(canary) != std::string::npos;
}

/// A store that fails when it is configured, built or shut down, and a container in it.
struct SettingsSecrecy : testing::TestWithParam<Failure>
{
    SettingsSecrecy()
    {
        registry.add(u"s", store);
        registry.add(u"plain", plain);
        registry.add(u"zip", zip);
    }

    /// Expects that an action fails with what is left of the failure.
    template <typename Action>
    static void expectNoWords(StorageIRI const& location, Action const& action)
    {
        EXPECT_FALSE(saysThePassword(wordsOf(action))) << wordsOf(action);
        try {
            action();
            FAIL() << "nothing was thrown";
        } catch (FactoryException const& error) {
            EXPECT_EQ(error.getErrorCode(), GetParam().code);
            EXPECT_EQ(error.getStorageIRI(), location);
        }
    }

    std::shared_ptr<FakePhysicalFactory> store = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakePhysicalFactory> plain = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakeContainerFactory> zip = std::make_shared<FakeContainerFactory>();
    Registry registry;
};

TEST_P(SettingsSecrecy, HoldsWhenProvidersAreConfigured)
{
    store->onConfigure = GetParam().raise;
    StorageItem const item = registry.open(u"s://h/x");
    expectNoWords(StorageIRI(u"s:/"), [&] { registry.configure(settings()); });
}

TEST_P(SettingsSecrecy, HoldsWhenProvidersAreConfiguredAsTheyAreBuilt)
{
    store->onConfigure = GetParam().raise;
    registry.configure(settings());
    expectNoWords(StorageIRI(u"s://h/x"), [&] { registry.open(u"s://h/x"); });
}

TEST_P(SettingsSecrecy, HoldsWhenProvidersAreBuilt)
{
    store->onBuild = GetParam().raise;
    registry.configure(settings());
    expectNoWords(StorageIRI(u"s://h/x"), [&] { registry.open(u"s://h/x"); });
}

TEST_P(SettingsSecrecy, HoldsForContainersInSuchAStore)
{
    zip->onBuild = GetParam().raise;
    registry.configure(settings());
    expectNoWords(StorageIRI(u"zip:s://h/a!/x"), [&] { registry.open(u"zip:s://h/a!/x"); });
    expectNoWords(StorageIRI(u"zip:s://h/a!/x"), [&] { registry.open(u"zip:zip:s://h/a!/x!/y"); });
}

TEST_P(SettingsSecrecy, HoldsWhenProvidersAreShutDown)
{
    store->onShutdown = GetParam().raise;
    registry.configure(settings());
    StorageItem const item = registry.open(u"s://h/x");
    expectNoWords(StorageIRI(u"s:/"), [&] { registry.shutdown(); });
}

TEST_P(SettingsSecrecy, HoldsWhenContainersAreShutDown)
{
    zip->onShutdown = GetParam().raise;
    registry.configure(settings());
    StorageItem const item = registry.open(u"zip:s://h/a!/x");
    expectNoWords(StorageIRI(u"zip:/"), [&] { registry.shutdown(); });
}

TEST_P(SettingsSecrecy, IsNotForFailuresOfSchemesWithoutSettings)
{
    plain->onBuild = plain->onShutdown = zip->onBuild = GetParam().raise;
    registry.configure(settings());
    EXPECT_EQ(saysThePassword(wordsOf([&] { registry.open(u"plain://h/x"); })), GetParam().saysThePassword);
    plain->onBuild = [] {};
    EXPECT_EQ(saysThePassword(wordsOf([&] { registry.open(u"zip:plain://h/a!/x"); })), GetParam().saysThePassword);
    StorageItem const item = registry.open(u"plain://h/x");
    EXPECT_EQ(saysThePassword(wordsOf([&] { registry.shutdown(); })), GetParam().saysThePassword);
}

INSTANTIATE_TEST_SUITE_P(OfEachFailure, SettingsSecrecy, testing::ValuesIn(failures));

TEST(Registry, PassesOnThatMemoryIsShort)
{
    auto const store = std::make_shared<FakePhysicalFactory>();
    Registry registry;
    registry.add(u"s", store);
    registry.configure(settings());
    store->onBuild = [] { throw std::bad_alloc(); };
    EXPECT_THROW(registry.open(u"s:/"), std::bad_alloc);
}

} // namespace
} // namespace foundation::storage::registry
