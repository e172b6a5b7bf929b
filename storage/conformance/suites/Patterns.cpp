#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/listings.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

bool matchesPatterns(Harness const& harness)
{
    return harness.capabilities.patterns == Patterns::Globs;
}

bool ignoresPatterns(Harness const& harness)
{
    return !matchesPatterns(harness);
}

void expectPatternIgnored(Harness const& harness, bool recursive)
{
    Scene const scene(harness, listingContent());
    forEachListing(recursive, [&](ListingOperation const& operation) {
        for (auto const* const pattern : {u"*", u"*.txt", u"no match"})
            EXPECT_EQ(namesOf(list(scene, operation, scene.iri(), pattern)), expectedNames(operation));
    });
}

void anIgnoredPatternListsEverything(Harness const& harness)
{
    expectPatternIgnored(harness, false);
}

void anIgnoredPatternListsEverythingRecursively(Harness const& harness)
{
    expectPatternIgnored(harness, true);
}

void expectPatternsMatched(Harness const& harness, bool recursive)
{
    Scene const scene(harness, listingContent());
    forEachListing(recursive, [&](ListingOperation const& operation) {
        auto const match = [&](std::u16string const& pattern, auto const& wanted) {
            EXPECT_EQ(namesOf(list(scene, operation, scene.iri(), pattern)), expectedNames(operation, wanted));
        };
        match(u"*", [](std::u16string_view) { return true; });
        match(u"*.txt", [](std::u16string_view name) { return name.ends_with(u".txt"); });
        match(u"?.*", [](std::u16string_view name) { return name.size() > 1 && name[1] == u'.'; });
        match(u"f*r", [](std::u16string_view name) { return name == u"folder"; });
        match(u"b.txt", [](std::u16string_view name) { return name == u"b.txt"; });
        match(u"[ac].*", [](std::u16string_view name) { return name == u"a.txt" || name == u"c.md"; });
        match(u"[a-b].txt", [](std::u16string_view name) { return name == u"a.txt" || name == u"b.txt"; });
        match(u"[!a-c]*", [](std::u16string_view name) { return name.front() > u'c'; });
        match(u"txt", [](std::u16string_view) { return false; });
        match(u"", [](std::u16string_view) { return true; });
    });
}

void patternsMatchWholeNames(Harness const& harness)
{
    expectPatternsMatched(harness, false);
}

void patternsMatchTheLastNameOfRecursiveEntries(Harness const& harness)
{
    expectPatternsMatched(harness, true);
}

void patternsGoByCodePoints(Harness const& harness)
{
    Scene const scene(harness, {{u"\U0001F600", ""}, {u"ab", ""}, {u"x", ""}});
    EXPECT_EQ(namesOf(scene.provider().listFiles(scene.iri(), u"?")), (Names{u"x", u"\U0001F600"}));
    EXPECT_EQ(namesOf(scene.provider().listFiles(scene.iri(), u"??")), (Names{u"ab"}));
}

void patternsTreatLetterCaseAsTheStoreDoes(Harness const& harness)
{
    Scene const scene(harness, {{u"Name.TXT", ""}});
    Names const matched = harness.capabilities.caseSensitive ? Names{} : Names{u"Name.TXT"};
    EXPECT_EQ(namesOf(scene.provider().listFiles(scene.iri(), u"*.txt")), matched);
}

void aFolderIsNeverAPattern(Harness const& harness)
{
    Scene const scene(harness, {{u"a[1]/", ""}, {u"a[1]/x", ""}, {u"a1/", ""}, {u"a1/y", ""}});
    EXPECT_EQ(namesOf(scene.provider().listAll(scene.iri(u"a[1]"), u"*")), (Names{u"x"}));
}

} // namespace

std::vector<Check> patternChecks()
{
    auto const recursive = claims(&Capabilities::recursiveListing);
    return Family("Patterns")
        .when(ignoresPatterns, {CHECK_FUNCTION(anIgnoredPatternListsEverything)})
        .when(both(ignoresPatterns, recursive), {CHECK_FUNCTION(anIgnoredPatternListsEverythingRecursively)})
        .when(matchesPatterns,
              {CHECK_FUNCTION(patternsMatchWholeNames), CHECK_FUNCTION(patternsGoByCodePoints),
               CHECK_FUNCTION(patternsTreatLetterCaseAsTheStoreDoes), CHECK_FUNCTION(aFolderIsNeverAPattern)})
        .when(both(matchesPatterns, recursive), {CHECK_FUNCTION(patternsMatchTheLastNameOfRecursiveEntries)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
