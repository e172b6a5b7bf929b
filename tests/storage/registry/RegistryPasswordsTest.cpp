#include <storage/registry/Registry.hpp>

#include <fl/i18n/utf8.hpp>
#include <storage/registry/OpenException.hpp>
#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/storage/registry/wordsOf.hpp>

#include <gtest/gtest.h>

#include <stdexcept>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using Reason = OpenException::Reason;

struct RegistryOfPasswords : testing::Test
{
    RegistryOfPasswords()
    {
        registry.add(u"s", disk);
        registry.add(u"zip", std::make_shared<FakeContainerFactory>());
    }

    std::shared_ptr<FakePhysicalFactory> disk = std::make_shared<FakePhysicalFactory>();
    Registry registry;
};

/// Each holds the password "canary".
constexpr char16_t const* locations[] = {
    u"s://u:canary@h/x",
    u"S://u%3Acanary@h/x",
    u"s://u:can/canary@h/x",
    u"s://:canary@h",
    u"zip:s://u:canary@h/a.zip!/x",
    u"zip:zip:s://u:canary!canary@h/a.zip!/b.zip!/x",
    u"other://u:canary@h/x",
    u"zip:other://u:canary@h/a.zip!/x",
};

/// The same, in what is no location for other reasons too.
constexpr char16_t const* brokenLocations[] = {
    u"//u:canary@h/x",           u"no scheme://u:canary@h/x",
    u"zip:s://u:canary@h/a.zip", u"zip:s://u:canary@h/a.zip!x",
    u"s://u:canary@h:99999",     u"s://u:canary@h/x\xD800",
    u"s:a//u:canary@h/x",        u"s://u:12345678/canary@h",
    u"x y:s://u:canary@h/a",     u"zip:a b://u:canary@h/c!/d",
    u"/s://u:canary@h/x",        u"./s:///u:canary@h/v//w:canary@i",
    u"zip:s:/a//u:canary@h",
};

TEST_F(RegistryOfPasswords, AreRefusedInLocations)
{
    for (std::u16string const text : locations) {
        try {
            registry.open(text);
            FAIL() << fl::i18n::to_utf8(text, fl::i18n::Malformed::Replace);
        } catch (OpenException const& error) {
            EXPECT_EQ(error.getReason(), Reason::CredentialsInLocation) << error.getStorageIRI();
            EXPECT_NE(error.getStorageIRI().toString().find(u"***@h"), std::u16string::npos) << error.getStorageIRI();
        }
    }
    EXPECT_EQ(disk->built, 0);
}

TEST_F(RegistryOfPasswords, AreNotRepeatedByErrors)
{
    for (std::u16string const text : locations)
        EXPECT_EQ(wordsOf([&] { registry.open(text); }).find("canary"), std::string::npos);
    for (std::u16string const text : brokenLocations)
        EXPECT_EQ(wordsOf([&] { registry.open(text); }).find("canary"), std::string::npos);
}

TEST_F(RegistryOfPasswords, AreRefusedInParsedLocations)
{
    for (std::u16string const text : locations) {
        StorageIRI const location(text);
        EXPECT_THROW(registry.open(location), OpenException) << location;
        EXPECT_EQ(wordsOf([&] { registry.open(location); }).find("canary"), std::string::npos);
    }
}

TEST_F(RegistryOfPasswords, AreShownAsStars)
{
    try {
        registry.open(u"zip:s://u:canary@h/a.zip!/x");
        FAIL();
    } catch (OpenException const& error) {
        EXPECT_EQ(error.getStorageIRI(), StorageIRI(u"zip:s://u:***@h/a.zip!/x"));
    }
}

TEST_F(RegistryOfPasswords, MayBeMissing)
{
    EXPECT_EQ(registry.open(u"s://user@h:80/x").getLocation(), StorageIRI(u"s://user@h:80/x"));
    EXPECT_EQ(registry.open(u"zip:s://user@h/a.zip!/x@y").getName(), u"x@y");
}

TEST_F(RegistryOfPasswords, AreNoMatterOfPaths)
{
    EXPECT_EQ(registry.open(u"s:/u:p@h").getName(), u"u:p@h");
    EXPECT_EQ(registry.open(StorageIRI(u"s", fl::filesystem::upath(u"/u:p@h"))).getName(), u"u:p@h");
}

} // namespace
} // namespace foundation::storage::registry
