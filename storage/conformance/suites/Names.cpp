#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/hostileNames.hpp>
#include <storage/conformance/detail/listings.hpp>

#include <algorithm>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

/// All hostile names at once, each with a content of its own, so that names taken for each other are seen.
Tree hostileFiles(Harness const& harness)
{
    Tree files;
    for (std::u16string const& name : hostileNamesFor(harness.capabilities))
        files[name] = "content " + std::to_string(files.size());
    return files;
}

void filesOfHostileNamesAreApartAndWhole(Harness const& harness)
{
    Tree const files = hostileFiles(harness);
    Scene const scene(harness, files);
    EXPECT_TRUE(scene.holds(files));
    for (auto const& [name, content] : files) {
        SCOPED_TRACE(testing::Message() << scene.iri(name));
        EXPECT_TRUE(scene.provider().fileExists(scene.iri(name)));
        EXPECT_EQ(scene.provider().getFileAttributes(scene.iri(name)).getSize(), content.size());
    }
}

void hostileNamesAreListedAsTheyAre(Harness const& harness)
{
    Tree const files = hostileFiles(harness);
    Scene const scene(harness, files);
    Names names;
    for (auto const& [name, content] : files)
        names.push_back(name);
    forEachListing(false, [&](ListingOperation const& operation) {
        EXPECT_EQ(namesOf(list(scene, operation, scene.iri())), operation.files ? names : Names{});
    });
}

void aLocationFoundInAListingSurvivesItsText(Harness const& harness)
{
    Scene const scene(harness, hostileFiles(harness));
    IProvider::Listing const listing = scene.provider().listFiles(scene.iri());
    for (FolderEntry const& entry : entries(*listing)) {
        StorageIRI const found = scene.iri(entry.getName());
        StorageIRI const parsed(found.toString());
        EXPECT_EQ(parsed.getName(), entry.getName()) << found;
        EXPECT_EQ(StorageItem(scene.shared(), parsed).getFileAttributes().getSize(),
                  entry.getFileAttributes()->getSize())
            << found;
        EXPECT_TRUE(scene.provider().fileExists(parsed)) << found;
    }
}

void foldersOfHostileNamesHoldFiles(Harness const& harness)
{
    Tree content;
    for (std::u16string const& name : hostileNamesFor(harness.capabilities)) {
        content[name + u'/'];
        content[name + u"/" + name] = "content " + std::to_string(content.size());
    }
    Scene const scene(harness, content);
    EXPECT_TRUE(scene.holds(content));
}

void filesAreMovedAndCopiedBetweenHostileNames(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    IProvider const& provider = scene.provider();
    std::u16string current = u"file";
    for (std::u16string const& name : hostileNamesFor(harness.capabilities)) {
        SCOPED_TRACE(testing::Message() << scene.iri(name));
        provider.moveFile(scene.iri(current), scene.iri(name), ReplacementPolicy::Preserve);
        EXPECT_TRUE(scene.holds({{name, "content"}}));
        provider.copyFile(scene.iri(name), scene.iri(u"copy"), ReplacementPolicy::Preserve);
        provider.removeFile(scene.iri(u"copy"));
        current = name;
    }
    provider.removeFile(scene.iri(current));
    EXPECT_TRUE(scene.holds({}));
}

void hostileNamesAreCreatedAndRemovedOneByOne(Harness const& harness)
{
    Scene const scene(harness);
    for (std::u16string const& name : hostileNamesFor(harness.capabilities)) {
        SCOPED_TRACE(testing::Message() << scene.iri(name));
        scene.provider().createFile(scene.iri(name));
        EXPECT_TRUE(scene.holds({{name, ""}}));
        scene.provider().removeFile(scene.iri(name));
        scene.provider().createFolder(scene.iri(name));
        EXPECT_TRUE(scene.holds({{name + u'/', ""}}));
        scene.provider().removeFolder(scene.iri(name));
    }
    EXPECT_TRUE(scene.holds({}));
}

void aHostileNameIsNoPattern(Harness const& harness)
{
    Scene const scene(harness, {{u"a1", "wrong"}, {u"axb", "wrong"}, {u"a[1]", "right"}});
    EXPECT_EQ(scene.read(u"a[1]"), "right");
    EXPECT_FALSE(scene.provider().fileExists(scene.iri(u"a*")));
    EXPECT_FALSE(scene.provider().fileExists(scene.iri(u"a?b")));
}

void expectUncreatable(Scene const& scene, std::u16string const& name)
{
    StorageIRI const iri = scene.iri(name);
    IProvider const& provider = scene.provider();
    auto const refused = [&](std::function<void()> const& action) {
        EXPECT_TRUE(scene.refuses(action, ErrorCode::InvalidLocation, iri));
    };
    refused([&] { provider.createFile(iri); });
    refused([&] { provider.createFolder(iri); });
    refused([&] { provider.openStream(iri, {}); });
    refused([&] { provider.copyFile(scene.iri(u"file"), iri, ReplacementPolicy::Preserve); });
    refused([&] { provider.moveFile(scene.iri(u"file"), iri, ReplacementPolicy::Preserve); });
    refused([&] { provider.moveFolder(scene.iri(u"folder"), iri, ReplacementPolicy::Preserve); });
}

void refusedNamesAreInvalidLocations(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (std::u16string const& name : harness.capabilities.refusedNames)
        expectUncreatable(scene, name);
}

void namesBeyondTheLimitAreInvalidLocations(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    std::size_t const tooLong = *harness.capabilities.longestName + 1;
    for (std::u16string const& name : {std::u16string(tooLong, u'a'), namesOfLength(tooLong).back()}) {
        expectUncreatable(scene, name);
        EXPECT_EQ(scene.provider().exists(scene.iri(name)), ExistenceType::AsNeither);
    }
}

void namesOfAnyLengthAreTaken(Harness const& harness)
{
    std::u16string const name(5000, u'a');
    Scene const scene(harness, {{name, "content"}});
    EXPECT_TRUE(scene.holds({{name, "content"}}));
}

Tree const casePair{{u"Name", "upper"}, {u"name", "lower"}};
Tree const normalisationPair{{u"\u00E9", "composed"}, {u"e\u0301", "decomposed"}};

void expectTwoNames(Harness const& harness, Tree const& pair)
{
    Scene const scene(harness, pair);
    EXPECT_TRUE(scene.holds(pair));
}

void expectOneName(Harness const& harness, Tree const& pair)
{
    Scene const scene(harness, {*pair.begin()});
    for (auto const& [name, content] : pair) {
        EXPECT_TRUE(scene.provider().fileExists(scene.iri(name)));
        EXPECT_EQ(scene.read(name), pair.begin()->second);
    }
    scene.write(pair.rbegin()->first, "new");
    EXPECT_EQ(scene.tree().size(), 1u);
    EXPECT_EQ(scene.read(pair.begin()->first), "new");
}

void letterCaseTellsNamesApart(Harness const& harness)
{
    expectTwoNames(harness, casePair);
}

void letterCaseDoesNotTellNamesApart(Harness const& harness)
{
    expectOneName(harness, casePair);
}

void letterCaseIsPreserved(Harness const& harness)
{
    Scene const scene(harness, {{u"MiXed", "content"}});
    EXPECT_TRUE(scene.holds({{u"MiXed", "content"}}));
}

void normalisationTellsNamesApart(Harness const& harness)
{
    expectTwoNames(harness, normalisationPair);
}

void normalisationDoesNotTellNamesApart(Harness const& harness)
{
    expectOneName(harness, normalisationPair);
}

bool limitsNames(Harness const& harness)
{
    return harness.capabilities.longestName.has_value();
}

bool doesNotLimitNames(Harness const& harness)
{
    return !limitsNames(harness);
}

} // namespace

std::vector<Check> nameChecks()
{
    return Family("Names")
        .forAll({
            CHECK_FUNCTION(filesOfHostileNamesAreApartAndWhole),
            CHECK_FUNCTION(hostileNamesAreListedAsTheyAre),
            CHECK_FUNCTION(aLocationFoundInAListingSurvivesItsText),
            CHECK_FUNCTION(foldersOfHostileNamesHoldFiles),
            CHECK_FUNCTION(aHostileNameIsNoPattern),
        })
        .forWritable({
            CHECK_FUNCTION(filesAreMovedAndCopiedBetweenHostileNames),
            CHECK_FUNCTION(hostileNamesAreCreatedAndRemovedOneByOne),
            CHECK_FUNCTION(refusedNamesAreInvalidLocations),
        })
        .forWritable(limitsNames, {CHECK_FUNCTION(namesBeyondTheLimitAreInvalidLocations)})
        .when(doesNotLimitNames, {CHECK_FUNCTION(namesOfAnyLengthAreTaken)})
        .when(claims(&Capabilities::caseSensitive), {CHECK_FUNCTION(letterCaseTellsNamesApart)})
        .forWritable(disclaims(&Capabilities::caseSensitive), {CHECK_FUNCTION(letterCaseDoesNotTellNamesApart)})
        .when(claims(&Capabilities::casePreserving), {CHECK_FUNCTION(letterCaseIsPreserved)})
        .when(claims(&Capabilities::normalisationSensitive), {CHECK_FUNCTION(normalisationTellsNamesApart)})
        .forWritable(disclaims(&Capabilities::normalisationSensitive),
                     {CHECK_FUNCTION(normalisationDoesNotTellNamesApart)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
