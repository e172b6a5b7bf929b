// What can be wrong with listings and their patterns.

#include <tests/storage/conformance/broken/Defect.hpp>
#include <tests/support/VectorListing.hpp>

#include <utility>

namespace foundation::storage::conformance::broken {

namespace {

using tests::support::VectorListing;

Listing listingOf(std::vector<FolderEntry> found)
{
    return std::make_unique<VectorListing>(std::move(found));
}

/// A listing that stands on another one, and does otherwise what a derived class says.
class WrappedListing : public IFolderEntryIterator
{
public:
    explicit WrappedListing(Listing sound) : sound_(std::move(sound)) {}

    bool hasEntry() const override { return sound_->hasEntry(); }
    FolderEntry const& entry() const override { return sound_->entry(); }
    void next() override { sound_->next(); }
    void reset() override { sound_->reset(); }

private:
    Listing sound_;
};

class DeafToReset final : public WrappedListing
{
public:
    using WrappedListing::WrappedListing;
    void reset() override {}
};

/// Fails to go on from an entry that is gone.
class Brittle final : public WrappedListing
{
public:
    Brittle(Listing sound, Store store, StorageIRI folder)
        : WrappedListing(std::move(sound)), store_(store), folder_(std::move(folder))
    {}

    void next() override
    {
        if (store_.exists(StorageIRI(folder_, entry().getName())) == ExistenceType::AsNeither)
            throw Exception(ErrorCode::ResourceNotFound, folder_);
        WrappedListing::next();
    }

private:
    Store store_;
    StorageIRI folder_;
};

Listing withoutTheLast(ListingCall const& call)
{
    std::vector<FolderEntry> found = entriesOf(call.answer());
    if (!found.empty())
        found.pop_back();
    return listingOf(std::move(found));
}

Listing withTheFirstTwice(ListingCall const& call)
{
    std::vector<FolderEntry> found = entriesOf(call.answer());
    if (!found.empty())
        found.push_back(found.front());
    return listingOf(std::move(found));
}

Listing withADot(ListingCall const& call)
{
    std::vector<FolderEntry> found = entriesOf(call.answer());
    found.emplace_back(u".", FolderEntry::EntryType::Folder);
    return listingOf(std::move(found));
}

FolderEntry renamed(FolderEntry const& entry, std::u16string const& name)
{
    if (entry.getFileAttributes())
        return FolderEntry(name, *entry.getFileAttributes());
    if (entry.getFolderAttributes())
        return FolderEntry(name, *entry.getFolderAttributes());
    return FolderEntry(name, entry.isFile() ? FolderEntry::EntryType::File : FolderEntry::EntryType::Folder);
}

Listing byLastName(ListingCall const& call)
{
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entriesOf(call.answer()))
        found.push_back(renamed(entry, entry.getName().substr(entry.getName().rfind(u'/') + 1)));
    return listingOf(std::move(found));
}

Listing byPath(ListingCall const& call)
{
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entriesOf(call.answer()))
        found.push_back(renamed(entry, call.folder.getName() + u'/' + entry.getName()));
    return listingOf(std::move(found));
}

Listing nothingWhereNothingIs(ListingCall const& call)
{
    return call.store.folderExists(call.folder) ? call.answer() : listingOf({});
}

Listing withoutAttributes(ListingCall const& call)
{
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entriesOf(call.answer()))
        found.emplace_back(entry.getName(),
                           entry.isFile() ? FolderEntry::EntryType::File : FolderEntry::EntryType::Folder);
    return listingOf(std::move(found));
}

Listing withoutSizes(ListingCall const& call)
{
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entriesOf(call.answer())) {
        if (entry.getFileAttributes())
            found.emplace_back(entry.getName(), FileAttributes(0, entry.getFileAttributes()->getLastModified(), true));
        else
            found.push_back(entry);
    }
    return listingOf(std::move(found));
}

/// Attributes that ask their listing, which may be gone.
Listing withLentAttributes(ListingCall const& call)
{
    auto const listing = std::make_shared<int>();
    std::weak_ptr<int> const asked = listing;
    std::vector<FolderEntry> found;
    for (FolderEntry const& entry : entriesOf(call.answer())) {
        if (entry.getFileAttributes())
            found.emplace_back(entry.getName(), FileAttributes(entry.getFileAttributes()->getSize(),
                                                               entry.getFileAttributes()->getLastModified(),
                                                               [asked] { return !asked.expired(); }));
    }

    class Lender final : public WrappedListing
    {
    public:
        Lender(Listing sound, std::shared_ptr<int> life) : WrappedListing(std::move(sound)), life_(std::move(life)) {}

    private:
        std::shared_ptr<int> life_;
    };
    return std::make_unique<Lender>(listingOf(std::move(found)), listing);
}

Listing ofAllKindsAlike(ListingCall const& call)
{
    return call.name == "listFoldersNamesOnly" ? call.store.listAllNamesOnly(call.folder, call.pattern) : call.answer();
}

Listing withoutBrokenLinks(ListingCall const& call)
{
    std::vector<FolderEntry> found = entriesOf(call.answer());
    std::erase_if(found, [&](FolderEntry const& entry) {
        return call.store.exists(StorageIRI(call.folder, entry.getName())) == ExistenceType::AsNeither;
    });
    return listingOf(std::move(found));
}

Listing throughLinks(ListingCall const& call)
{
    std::vector<FolderEntry> found = entriesOf(call.answer());
    found.emplace_back(u"out/file", FolderEntry::EntryType::File);
    return listingOf(std::move(found));
}

Listing ofOneLevel(ListingCall const& call)
{
    return call.isRecursive() ? call.store.listAll(call.folder) : call.answer();
}

Table listings()
{
    return {"Listings",
            {{"EachOperationListsItsKind", "DropsAnEntry", {.list = withoutTheLast}},
             {"EachOperationListsItsKind", "ListsFilesAmongNamesOfFolders", {.list = ofAllKindsAlike}},
             {"AnEmptyFolderHasNoEntry", "ListsADot", {.list = withADot}},
             {"SubfoldersAreListedByTheirOwnLocation", "ListsPaths", {.list = byPath}},
             {"ListingsNeedAFolder", "FindsNothingWhereNothingIs", {.list = nothingWhereNothingIs}},
             {"ListingsNeedAFolder",
              "SaysInvalidLocation",
              {.list =
                   [](ListingCall const& call) {
                       return miscoded([&] { return call.answer(); }, ErrorCode::InvalidLocation);
                   }}},
             {"FullListingsGiveTheAttributesOfEachEntry", "LeavesThemOut", {.list = withoutAttributes}},
             {"FullListingsGiveTheAttributesOfEachEntry", "KnowsNoSizes", {.list = withoutSizes}},
             {"ResetStartsAgain", "IsDeafToIt", {.list = [](ListingCall const& call) -> Listing {
                  return std::make_unique<DeafToReset>(call.answer());
              }}},
             {"ResetSeesTheFolderAsItIsNow",
              "KeepsWhatItSawFirst",
              {.list = [](ListingCall const& call) { return listingOf(entriesOf(call.answer())); }}},
             {"ManyEntriesAreEachListedOnce", "ListsOneTwice", {.list = withTheFirstTwice}},
             {"ManyEntriesAreEachListedOnce", "DropsAnEntry", {.list = withoutTheLast}},
             {"EntriesMayVanishDuringAListing", "FailsToGoOn", {.list = [](ListingCall const& call) -> Listing {
                  return std::make_unique<Brittle>(call.answer(), call.store, call.folder);
              }}},
             {"AnEntryOutlivesItsListing", "LendsItsAttributes", {.list = withLentAttributes}},
             {"LinksAreListedAsWhatTheyLeadTo", "LeavesBrokenOnesOut", {.list = withoutBrokenLinks}, localHarness},
             {"RecursiveListingsGiveAllBelowByPath", "GivesLastNames", {.list = byLastName}},
             {"RecursiveListingsGiveAllBelowByPath", "ListsOneLevel", {.list = ofOneLevel}},
             {"RecursiveListingsNeedAFolder", "FindsNothingWhereNothingIs", {.list = nothingWhereNothingIs}},
             {"FullRecursiveListingsGiveTheAttributesOfEachEntry", "KnowsNoSizes", {.list = withoutSizes}},
             {"RecursiveListingsLeaveWhatLinksLeadTo", "FollowsThem", {.list = throughLinks}, recursiveHarness},
             {"RecursiveListingsAreRefused", "ListsOneLevel", {.list = ofOneLevel}, plainHarness}}};
}

bool isLiteral(std::u16string const& name, std::u16string const& pattern)
{
    return pattern.empty() || name.substr(name.rfind(u'/') + 1) == pattern;
}

Listing byLiteralPattern(ListingCall const& call)
{
    std::vector<FolderEntry> found = entriesOf(call.answerFor(call.folder, u""));
    std::erase_if(found, [&](FolderEntry const& entry) { return !isLiteral(entry.getName(), call.pattern); });
    return listingOf(std::move(found));
}

Listing withoutPattern(ListingCall const& call)
{
    return call.answerFor(call.folder, u"");
}

Listing byPartOfTheName(ListingCall const& call)
{
    return call.answerFor(call.folder, call.pattern.empty() ? u"" : u'*' + call.pattern + u'*');
}

Listing byWholePath(ListingCall const& call)
{
    if (!call.isRecursive() || call.pattern.empty())
        return call.answer();
    return filtered(call.answer(),
                    [](FolderEntry const& entry) { return entry.getName().find(u'/') == std::u16string::npos; });
}

Listing byCodeUnits(ListingCall const& call)
{
    if (call.pattern != u"??")
        return call.answer();
    return filtered(call.answerFor(call.folder, u""),
                    [](FolderEntry const& entry) { return entry.getName().size() == 2; });
}

Listing withoutCase(ListingCall const& call)
{
    return call.answerFor(call.folder, call.pattern == u"*.txt" ? u"*.[tT][xX][tT]" : call.pattern);
}

Listing withFoldersAsPatterns(ListingCall const& call)
{
    bool const matches = call.folder.hasParent() && call.folder.getName() == u"a[1]";
    return call.answerFor(matches ? sibling(call.folder, u"a1") : call.folder, call.pattern);
}

Table patterns()
{
    return {"Patterns",
            {{"AnIgnoredPatternListsEverything", "TakesItLiterally", {.list = byLiteralPattern}, plainHarness},
             {"AnIgnoredPatternListsEverythingRecursively",
              "TakesItLiterally",
              {.list = byLiteralPattern},
              recursiveHarness},
             {"PatternsMatchWholeNames", "TakesThemLiterally", {.list = byLiteralPattern}},
             {"PatternsMatchWholeNames", "IgnoresThem", {.list = withoutPattern}},
             {"PatternsMatchWholeNames", "MatchesPartsOfNames", {.list = byPartOfTheName}},
             {"PatternsGoByCodePoints", "GoesByCodeUnits", {.list = byCodeUnits}},
             {"PatternsTreatLetterCaseAsTheStoreDoes", "IgnoresCase", {.list = withoutCase}},
             {"AFolderIsNeverAPattern", "TakesFoldersForPatterns", {.list = withFoldersAsPatterns}},
             {"PatternsMatchTheLastNameOfRecursiveEntries", "MatchesWholePaths", {.list = byWholePath}},
             {"PatternsMatchTheLastNameOfRecursiveEntries", "IgnoresThem", {.list = withoutPattern}}}};
}

} // namespace

std::vector<Table> listingDefects()
{
    return {listings(), patterns()};
}

} // namespace foundation::storage::conformance::broken
