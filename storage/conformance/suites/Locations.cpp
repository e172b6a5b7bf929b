#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/aliases.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/families.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

void everySpellingNamesTheEntry(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}, {u"folder/inner", "inner"}});
    for (StorageIRI const& alias : spellingsOf(scene, u"file")) {
        EXPECT_EQ(scene.provider().exists(alias), ExistenceType::AsFile) << alias;
        EXPECT_EQ(scene.provider().getFileAttributes(alias).getSize(), 7u) << alias;
    }
    for (StorageIRI const& alias : spellingsOf(scene, u"folder"))
        EXPECT_TRUE(scene.provider().fileExists(StorageIRI(alias, u"inner"))) << alias;
}

void unresolvedDotsNameNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (auto const* const path : {u"./file", u"folder/../file"})
        EXPECT_EQ(scene.provider().exists(scene.iri(path)), ExistenceType::AsNeither);
}

void theCanonicalLocationNamesTheSameEntry(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (StorageIRI const& alias : spellingsOf(scene, u"file")) {
        StorageIRI const canonical = scene.provider().getCanonicalLocation(alias);
        EXPECT_EQ(scene.provider().exists(canonical), ExistenceType::AsFile) << canonical << " for " << alias;
        EXPECT_EQ(scene.provider().getCanonicalLocation(canonical), canonical);
    }
}

void theCanonicalLocationHasNoDots(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    StorageIRI const canonical = scene.provider().getCanonicalLocation(scene.iri(u"file"));
    for (auto const* const path : {u"./file", u"folder/../file", u"folder/./.././file"})
        EXPECT_EQ(scene.provider().getCanonicalLocation(scene.iri(path)), canonical);
}

void aMissingEntryHasACanonicalLocationToo(Harness const& harness)
{
    Scene const scene(harness);
    StorageIRI const canonical = scene.provider().getCanonicalLocation(scene.iri(u"missing"));
    EXPECT_EQ(scene.provider().exists(canonical), ExistenceType::AsNeither);
    EXPECT_TRUE(scene.holds({}));
}

void thePathComparatorTreatsCaseAsTold(Harness const& harness)
{
    Scene const scene(harness);
    PathComparator const equal = scene.provider().getPathComparator(scene.iri());
    for (CaseModifier const modifier : {CaseModifier::None, CaseModifier::Sensitive, CaseModifier::InSensitive}) {
        EXPECT_TRUE(equal(u"/a/b", u"/a/b", modifier));
        EXPECT_TRUE(equal(u"", u"", modifier));
        EXPECT_FALSE(equal(u"/a/b", u"/a/c", modifier));
        EXPECT_FALSE(equal(u"/a/b", u"/a/bc", modifier));
    }
    EXPECT_FALSE(equal(u"/\u00C9t\u00E9", u"/\u00E9T\u00C9", CaseModifier::Sensitive));
    EXPECT_TRUE(equal(u"/\u00C9t\u00E9", u"/\u00E9T\u00C9", CaseModifier::InSensitive));
}

void theSensitivityToldIsTheOneClaimed(Harness const& harness)
{
    Scene const scene(harness);
    FilenameSensitivity const told = scene.provider().getFilenameSensitivity(scene.iri());
    EXPECT_EQ(told.caseSensitive, harness.capabilities.caseSensitive);
    EXPECT_EQ(told.casePreserving, harness.capabilities.casePreserving);
}

void locationsOfOtherStoresAreInvalid(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    StorageIRI const foreign(u"no-such-scheme://nowhere/file");
    IProvider const& provider = scene.provider();
    auto const refused = [&](std::function<void()> const& action) {
        EXPECT_TRUE(scene.refuses(action, ErrorCode::InvalidLocation, foreign));
    };
    refused([&] { provider.exists(foreign); });
    refused([&] { provider.getFileAttributes(foreign); });
    refused([&] { provider.openReadOnlyStream(foreign); });
    refused([&] { provider.listAll(foreign); });
    if (!harness.capabilities.writable)
        return;
    refused([&] { provider.createFile(foreign); });
    refused([&] { provider.openStream(foreign, {}); });
    refused([&] { provider.removeFile(foreign); });
    refused([&] { provider.moveFile(scene.iri(u"file"), foreign, ReplacementPolicy::Overwrite); });
    refused([&] { provider.copyFile(scene.iri(u"file"), foreign, ReplacementPolicy::Overwrite); });
}

void aProviderCanBeShutDownMoreThanOnce(Harness const& harness)
{
    Scene const scene(harness);
    scene.provider().shutdown();
    scene.provider().shutdown();
}

} // namespace

std::vector<Check> locationChecks()
{
    return Family("Locations")
        .forAll({
            CHECK_FUNCTION(everySpellingNamesTheEntry),
            CHECK_FUNCTION(theCanonicalLocationNamesTheSameEntry),
            CHECK_FUNCTION(aMissingEntryHasACanonicalLocationToo),
            CHECK_FUNCTION(thePathComparatorTreatsCaseAsTold),
            CHECK_FUNCTION(theSensitivityToldIsTheOneClaimed),
            CHECK_FUNCTION(locationsOfOtherStoresAreInvalid),
            CHECK_FUNCTION(aProviderCanBeShutDownMoreThanOnce),
        })
        .when(claims(&Capabilities::resolvesDots), {CHECK_FUNCTION(theCanonicalLocationHasNoDots)})
        .when(disclaims(&Capabilities::resolvesDots), {CHECK_FUNCTION(unresolvedDotsNameNothing)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
