// What can be wrong with names and locations.

#include <tests/storage/conformance/broken/Defect.hpp>
#include <tests/support/VectorListing.hpp>

#include <algorithm>

namespace foundation::storage::conformance::broken {

namespace {

bool hasPattern(Iri iri)
{
    return iri.getName().find_first_of(u"*?[") != std::u16string::npos;
}

StorageIRI withoutTheEscapeOfAnA(Iri iri)
{
    return iri.hasParent() && iri.getName() == u"%41" ? sibling(iri, u"A") : iri;
}

StorageIRI onOneLine(Iri iri)
{
    if (!iri.hasParent())
        return iri;
    std::u16string name = iri.getName();
    std::replace(name.begin(), name.end(), u'\n', u' ');
    return sibling(iri, name);
}

/// A listing in which names have lost their outer blanks.
Listing trimmed(ListingCall const& call)
{
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entriesOf(call.answer())) {
        std::u16string name = entry.getName();
        while (name.ends_with(u' '))
            name.pop_back();
        found.emplace_back(name, entry.isFile() ? FolderEntry::EntryType::File : FolderEntry::EntryType::Folder);
    }
    return std::make_unique<tests::support::VectorListing>(std::move(found));
}

Misbehaviour translating(StorageIRI (*translated)(Iri))
{
    return {.translated = translated};
}

Table names()
{
    return {"Names",
            {{"FilesOfHostileNamesAreApartAndWhole", "DecodesNamesTwice", translating(withoutTheEscapeOfAnA)},
             {"FilesOfHostileNamesAreApartAndWhole", "CutsNamesShort", translating(cutShort)},
             {"HostileNamesAreListedAsTheyAre", "ListsNamesWithoutOuterBlanks", {.list = trimmed}},
             {"ALocationFoundInAListingSurvivesItsText",
              "TakesEscapesForNames",
              {.fileExists = [](Store s,
                                Iri i) { return i.toString().find(u'%') == std::u16string::npos && s.fileExists(i); }}},
             {"FoldersOfHostileNamesHoldFiles", "PutsNamesOnOneLine", translating(onOneLine)},
             {"AHostileNameIsNoPattern",
              "TakesNamesForPatterns",
              {.fileExists =
                   [](Store s, Iri i) {
                       return hasPattern(i) ? s.listFiles(i.getParent(), i.getName())->hasEntry() : s.fileExists(i);
                   }}},
             {"FilesAreMovedAndCopiedBetweenHostileNames",
              "TakesANameForAnOption",
              {.moveFile =
                   [](Store s, Iri from, Iri to, Policy policy) {
                       if (to.getName().starts_with(u'-'))
                           throw Exception(ErrorCode::InvalidLocation, to);
                       s.moveFile(from, to, policy);
                   }}},
             {"HostileNamesAreCreatedAndRemovedOneByOne",
              "RefusesHiddenFolders",
              {.createFolder =
                   [](Store s, Iri i) {
                       if (i.getName().starts_with(u'.'))
                           throw Exception(ErrorCode::InvalidLocation, i);
                       s.createFolder(i);
                   }}},
             {.check = "RefusedNamesAreInvalidLocations",
              .name = "CreatesThem",
              .sound = pickyHarness,
              .base = memoryHarness,
              .claim = [](Capabilities& c) { c.refusedNames = {u"con"}; }},
             {"NamesBeyondTheLimitAreInvalidLocations", "CutsThemShort", translating(cutShort), localHarness},
             {"NamesBeyondTheLimitAreInvalidLocations",
              "SaysResourceNotFound",
              {.createFile = [](Store s, Iri i) { miscoded([&] { s.createFile(i); }, ErrorCode::ResourceNotFound); }},
              localHarness},
             {"NamesOfAnyLengthAreTaken", "CutsThemShort", translating(cutShort)},
             {"LetterCaseTellsNamesApart", "FoldsCase", translating(inSmallLetters)},
             {.check = "LetterCaseDoesNotTellNamesApart",
              .name = "TellsThemApart",
              .sound = caselessHarness,
              .base = memoryHarness,
              .claim = [](Capabilities& c) { c.caseSensitive = false; }},
             {"LetterCaseIsPreserved", "FoldsCase", translating(inSmallLetters)},
             {"NormalisationTellsNamesApart", "ComposesNames", translating(composed)},
             {.check = "NormalisationDoesNotTellNamesApart",
              .name = "TellsThemApart",
              .sound = unnormalisedHarness,
              .base = memoryHarness,
              .claim = [](Capabilities& c) { c.normalisationSensitive = false; }}}};
}

class ShutDownOnce final : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;

protected:
    void doShutdown() override
    {
        if (wasShutDown_)
            throw std::logic_error("already shut down");
        wasShutDown_ = true;
    }

private:
    bool wasShutDown_ = false;
};

bool comparedByAsciiLetters(std::u16string const& a, std::u16string const& b, CaseModifier modifier)
{
    auto const small = [](char16_t unit) { return unit >= u'A' && unit <= u'Z' ? unit + 32 : int{unit}; };
    if (modifier != CaseModifier::InSensitive)
        return a == b;
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [&](char16_t x, char16_t y) { return small(x) == small(y); });
}

Table locations()
{
    return {
        "Locations",
        {{"EverySpellingNamesTheEntry",
          "TakesEscapesForNames",
          {.exists =
               [](Store s, Iri i) {
                   bool const escaped = i.toString().find(u'%') != std::u16string::npos;
                   return escaped ? ExistenceType::AsNeither : s.exists(i);
               }}},
         {.check = "UnresolvedDotsNameNothing",
          .name = "ResolvesThem",
          .sound = dotlessHarness,
          .base = memoryHarness,
          .claim = [](Capabilities& c) { c.resolvesDots = false; }},
         {"TheCanonicalLocationNamesTheSameEntry",
          "AnswersTheFolder",
          {.getCanonicalLocation = [](Store s, Iri i) { return s.getCanonicalLocation(i).getParent(); }}},
         {"TheCanonicalLocationHasNoDots",
          "AnswersWhatItIsAsked",
          {.getCanonicalLocation = [](Store, Iri i) { return i; }}},
         {"AMissingEntryHasACanonicalLocationToo",
          "LooksForTheEntry",
          {.getCanonicalLocation =
               [](Store s, Iri i) {
                   if (s.exists(i) == ExistenceType::AsNeither)
                       throw Exception(ErrorCode::ResourceNotFound, i);
                   return s.getCanonicalLocation(i);
               }}},
         {"ThePathComparatorTreatsCaseAsTold",
          "KnowsTheLettersOfAsciiAlone",
          {.getPathComparator = [](Store, Iri) { return PathComparator(comparedByAsciiLetters); }}},
         {"ThePathComparatorTreatsCaseAsTold",
          "ComparesPrefixes",
          {.getPathComparator =
               [](Store, Iri) {
                   return PathComparator([](auto& a, auto& b, CaseModifier) { return b.starts_with(a); });
               }}},
         {"TheSensitivityToldIsTheOneClaimed",
          "ToldOtherwise",
          {.getFilenameSensitivity =
               [](Store, Iri) {
                   return FilenameSensitivity{false, true};
               }}},
         {"LocationsOfOtherStoresAreInvalid",
          "FindsNothingThere",
          {.exists = [](Store s, Iri i) { return i.getScheme() == u"mem" ? s.exists(i) : ExistenceType::AsNeither; }}},
         {"LocationsOfOtherStoresAreInvalid",
          "SaysResourceNotFound",
          {.removeFile = [](Store s, Iri i) { miscoded([&] { s.removeFile(i); }, ErrorCode::ResourceNotFound); }}},
         {.check = "AProviderCanBeShutDownMoreThanOnce",
          .name = "FailsTheSecondTime",
          .wrap = [](std::shared_ptr<IProvider> sound) -> std::shared_ptr<IProvider> {
              return std::make_shared<ShutDownOnce>(std::move(sound));
          }}}};
}

} // namespace

std::vector<Table> nameDefects()
{
    return {names(), locations()};
}

} // namespace foundation::storage::conformance::broken
