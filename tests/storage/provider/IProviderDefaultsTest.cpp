// What a provider answers that overrides the pure operations alone.

#include <storage/provider/IProvider.hpp>

#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/VectorListing.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using Listing = std::unique_ptr<IFolderEntryIterator>;

StorageIRI const here(u"s://h/a");
StorageIRI const there(u"s://h/b");

std::string refusal(StorageIRI const& named)
{
    return failure(ErrorCode::UnsupportedOperation, named);
}

TEST(IProviderDefaults, WhatHasNoGenericAlgorithmIsRefusedNamingTheLocation)
{
    MinimalProvider const provider;
    EXPECT_EQ(failureOf([&] { provider.removeFolderRecursively(here); }), refusal(here));
    EXPECT_EQ(failureOf([&] { provider.listAllRecursive(here); }), refusal(here));
    EXPECT_EQ(failureOf([&] { provider.listAllRecursive(here, u"*"); }), refusal(here));
    EXPECT_EQ(failureOf([&] { provider.listAllRecursiveNamesOnly(here); }), refusal(here));
    EXPECT_EQ(failureOf([&] { provider.listAllRecursiveNamesOnly(here, u"*"); }), refusal(here));
    EXPECT_EQ(failureOf([&] { provider.setLastModified(here, boost::posix_time::ptime()); }), refusal(here));
    EXPECT_EQ(failureOf([&] { provider.setWritable(here, true); }), refusal(here));
}

TEST(IProviderDefaults, AtomicCopyIsRefusedNamingTheSource)
{
    MinimalProvider const provider;
    EXPECT_EQ(failureOf([&] { provider.copyFileAtomic(here, there, ReplacementPolicy::Overwrite, {}); }),
              refusal(here));
}

TEST(IProviderDefaults, ChangeEventsAreRefusedNamingTheLocation)
{
    MinimalProvider const provider;
    for (auto const publish : {&IProvider::publishFileEventsFor, &IProvider::publishFolderEventsFor}) {
        try {
            (provider.*publish)(here, {}, {});
            ADD_FAILURE() << "nothing was thrown";
        } catch (ChangeEventsNotSupportedException const& error) {
            EXPECT_EQ(error.getStorageIRI(), here);
        }
    }
}

TEST(IProviderDefaults, StoppingChangeEventsAndShuttingDownDoNothing)
{
    CallLog log;
    RecordingProvider provider(log);
    provider.stopPublishingFileEventsFor(here);
    provider.stopPublishingFolderEventsFor(here);
    provider.shutdown();
    provider.shutdown();
    EXPECT_EQ(log, (CallLog{"doStopPublishingEventsFor(s://h/)", "doStopPublishingEventsFor(s://h/a)", "doShutdown()",
                            "doShutdown()"}));
}

TEST(IProviderDefaults, NoFeatureIsOffered)
{
    MinimalProvider const provider;
    for (int const feature : {0, 1, 2, 3, 4, 5, 6, -1})
        EXPECT_FALSE(provider.hasFeature(static_cast<ExtendedFeature>(feature))) << feature;
}

TEST(IProviderDefaults, CanonicalLocationIsTheResolvedOne)
{
    MinimalProvider const provider;
    EXPECT_EQ(provider.getCanonicalLocation(StorageIRI(u"s://h/a/./b/../c")), StorageIRI(u"s://h/a/c"));
    EXPECT_EQ(provider.getCanonicalLocation(StorageIRI(u"s://h/")), StorageIRI(u"s://h/"));
    EXPECT_EQ(provider.getCanonicalLocation(here), here);
}

TEST(IProviderDefaults, NamesAreCaseSensitiveAndKept)
{
    FilenameSensitivity const sensitivity = MinimalProvider().getFilenameSensitivity(here);
    EXPECT_TRUE(sensitivity.caseSensitive);
    EXPECT_TRUE(sensitivity.casePreserving);
}

TEST(IProviderDefaults, ThereAreNoExtendedAttributes)
{
    ExtendedAttributes const attributes = MinimalProvider().getExtendedAttributes(here);
    EXPECT_TRUE(attributes.begin() == attributes.end());
}

struct ExistenceRow
{
    bool file;
    bool folder;
    ExistenceType type;
    ExistenceTypeExtended extended;
};

TEST(IProviderDefaults, ExistenceAsksForAFileAndOnlyThenForAFolder)
{
    for (ExistenceRow const& row : {
             ExistenceRow{true, false, ExistenceType::AsFile, ExistenceTypeExtended::RegularFile},
             ExistenceRow{true, true, ExistenceType::AsFile, ExistenceTypeExtended::RegularFile},
             ExistenceRow{false, true, ExistenceType::AsFolder, ExistenceTypeExtended::RegularFolder},
             ExistenceRow{false, false, ExistenceType::AsNeither, ExistenceTypeExtended::None},
         })
    {
        CallLog log;
        RecordingProvider provider(log);
        provider.when("doFileExists(s://h/a)", [&row] { return row.file; });
        provider.when("doFolderExists(s://h/a)", [&row] { return row.folder; });
        CallLog questions = {"doFileExists(s://h/a)", "doFolderExists(s://h/a)"};
        questions.resize(row.file ? 1 : 2);

        EXPECT_EQ(provider.exists(here), row.type);
        EXPECT_EQ(log.front(), "doExists(s://h/a)");
        EXPECT_EQ(CallLog(log.begin() + 1, log.end()), questions);
        log.clear();
        EXPECT_EQ(provider.existsExtended(here), row.extended);
        EXPECT_EQ(log.front(), "doExistsExtended(s://h/a)");
        EXPECT_EQ(CallLog(log.begin() + 1, log.end()), questions);
    }
}

struct Names
{
    std::u16string a;
    std::u16string b;
};

void expectEqualOnlyInsensitively(Names const& names)
{
    PathComparator const equal = MinimalProvider().getPathComparator(here);
    EXPECT_FALSE(equal(names.a, names.b, CaseModifier::None)) << testing::PrintToString(names.a);
    EXPECT_FALSE(equal(names.a, names.b, CaseModifier::Sensitive)) << testing::PrintToString(names.a);
    EXPECT_TRUE(equal(names.a, names.b, CaseModifier::InSensitive)) << testing::PrintToString(names.a);
    EXPECT_TRUE(equal(names.b, names.a, CaseModifier::InSensitive)) << testing::PrintToString(names.a);
}

TEST(IProviderDefaults, ComparatorFoldsCaseOnlyWhenInsensitive)
{
    for (Names const& names : {
             Names{u"/A/Readme.TXT", u"/a/README.txt"}, Names{u"caf\u00C9", u"caf\u00E9"},
             Names{u"\u0391\u03A9", u"\u03B1\u03C9"}, // Greek
             Names{u"\u0416", u"\u0436"},             // Cyrillic
             Names{u"\u13A0", u"\uAB70"},             // Cherokee
             Names{u"\u1E9E", u"\u00DF"},             // sharp s
             Names{u"\u212A", u"k"},                  // Kelvin sign
             Names{u"\U00010400", u"\U00010428"},     // Deseret, beyond U+FFFF
             Names{u"x\U0001E900y", u"X\U0001E922Y"}, // Adlam, beyond U+FFFF
         })
        expectEqualOnlyInsensitively(names);
}

TEST(IProviderDefaults, ComparatorFindsEqualNamesEqualInEveryWay)
{
    PathComparator const equal = MinimalProvider().getPathComparator(here);
    std::u16string const loneSurrogates = {char16_t{0xD800}, u'a', char16_t{0xDC00}};
    for (std::u16string const& name : {std::u16string(), std::u16string(u"/"), std::u16string(u"caf\u00E9"),
                                       std::u16string(u"\U00010400"), std::u16string(u"a\0b", 3), loneSurrogates})
    {
        for (CaseModifier const modifier : {CaseModifier::None, CaseModifier::Sensitive, CaseModifier::InSensitive})
            EXPECT_TRUE(equal(name, name, modifier)) << testing::PrintToString(name) << modifier;
    }
}

TEST(IProviderDefaults, ComparatorTellsDifferentNamesApartInEveryWay)
{
    PathComparator const equal = MinimalProvider().getPathComparator(here);
    std::u16string const high(1, char16_t{0xD801});
    std::u16string const low(1, char16_t{0xDC00});
    for (Names const& names : {
             Names{u"a", u"b"}, Names{u"a", u"a "}, Names{u"a", u""}, Names{u"/a", u"/a/"},
             Names{u"caf\u00E9", u"cafe\u0301"},      // composed and decomposed
             Names{u"\u00DF", u"SS"},                 // more than one letter
             Names{u"\u03C3", u"\u03C2"},             // sigma and final sigma
             Names{high + low, u"\U00010401"},        // other pairs
             Names{high, low},                        // lone surrogates
             Names{std::u16string(u"a\0b", 3), u"a"}, // not cut at NUL
         })
    {
        for (CaseModifier const modifier : {CaseModifier::None, CaseModifier::Sensitive, CaseModifier::InSensitive})
            EXPECT_FALSE(equal(names.a, names.b, modifier)) << testing::PrintToString(names.a) << modifier;
    }
}

TEST(IProviderDefaults, ComparatorOutlivesTheProviderAndIsTheSameForEveryLocation)
{
    auto provider = std::make_unique<MinimalProvider>();
    PathComparator const atHere = provider->getPathComparator(here);
    PathComparator const atThere = provider->getPathComparator(there);
    provider.reset();
    EXPECT_TRUE(atHere(u"A", u"a", CaseModifier::InSensitive));
    EXPECT_TRUE(atHere(u"A", u"a", CaseModifier::InSensitive));
}

using List = std::function<Listing(IProvider const&)>;

struct LayerRow
{
    List list;
    CallLog slots; // from the slot that is asked first to the one at the bottom
};

std::vector<LayerRow> layers()
{
    std::u16string const all = u"*";
    return {
        {[](auto& p) { return p.listAll(here); }, {"doListAll"}},
        {[=](auto& p) { return p.listAll(here, all); }, {"doListAllWildcards", "doListAll"}},
        {[](auto& p) { return p.listFiles(here); }, {"doListFiles"}},
        {[=](auto& p) { return p.listFiles(here, all); }, {"doListFilesWildcards", "doListFiles"}},
        {[](auto& p) { return p.listFolders(here); }, {"doListFolders"}},
        {[=](auto& p) { return p.listFolders(here, all); }, {"doListFoldersWildcards", "doListFolders"}},
        {[](auto& p) { return p.listAllNamesOnly(here); }, {"doListAllNamesOnly", "doListAll"}},
        {[=](auto& p) { return p.listAllNamesOnly(here, all); },
         {"doListAllNamesOnlyWildcards", "doListAllNamesOnly", "doListAll"}},
        {[](auto& p) { return p.listFilesNamesOnly(here); }, {"doListFilesNamesOnly", "doListFiles"}},
        {[=](auto& p) { return p.listFilesNamesOnly(here, all); },
         {"doListFilesNamesOnlyWildcards", "doListFilesNamesOnly", "doListFiles"}},
        {[](auto& p) { return p.listFoldersNamesOnly(here); }, {"doListFoldersNamesOnly", "doListFolders"}},
        {[=](auto& p) { return p.listFoldersNamesOnly(here, all); },
         {"doListFoldersNamesOnlyWildcards", "doListFoldersNamesOnly", "doListFolders"}},
        {[](auto& p) { return p.listAllRecursive(here); }, {"doListAllRecursive"}},
        {[=](auto& p) { return p.listAllRecursive(here, all); }, {"doListAllRecursiveWildcards", "doListAllRecursive"}},
        {[](auto& p) { return p.listAllRecursiveNamesOnly(here); },
         {"doListAllRecursiveNamesOnly", "doListAllRecursive"}},
        {[=](auto& p) { return p.listAllRecursiveNamesOnly(here, all); },
         {"doListAllRecursiveNamesOnlyWildcards", "doListAllRecursiveNamesOnly", "doListAllRecursive"}},
    };
}

Listing emptyListing()
{
    return std::make_unique<VectorListing>(std::vector<FolderEntry>());
}

// The calls that a provider logs when it is asked through `slots`.
CallLog callsOf(CallLog const& slots)
{
    CallLog calls;
    for (std::string const& slot : slots)
        calls.push_back(slot + (slot.ends_with("Wildcards") ? "(s://h/a, \"*\")" : "(s://h/a)"));
    return calls;
}

TEST(IProviderDefaults, EachListingGoesDownThroughEveryLayer)
{
    for (LayerRow const& row : layers()) {
        CallLog log;
        RecordingProvider provider(log);
        provider.when("doListAllRecursive", &emptyListing);
        EXPECT_NE(row.list(provider), nullptr);
        EXPECT_EQ(log, callsOf(row.slots));
    }
}

TEST(IProviderDefaults, OverridingOneLayerShowsInAllAboveItAndInNoOther)
{
    for (LayerRow const& overridden : layers()) {
        std::string const& slot = overridden.slots.front();
        for (LayerRow const& row : layers()) {
            CallLog log;
            RecordingProvider provider(log);
            provider.when("doListAllRecursive", &emptyListing);
            IFolderEntryIterator const* own = nullptr;
            provider.when(slot, [&own] {
                Listing listing = emptyListing();
                own = listing.get();
                return listing;
            });
            Listing const listing = row.list(provider);
            bool const layered = std::find(row.slots.begin(), row.slots.end(), slot) != row.slots.end();
            EXPECT_EQ(listing.get() == own, layered) << slot << " and " << row.slots.front();
        }
    }
}

using NameList = std::vector<std::u16string>;

NameList namesIn(Listing const& listing)
{
    NameList names;
    for (FolderEntry const& entry : entries(*listing))
        names.push_back(entry.getName());
    return names;
}

TEST(IProviderDefaults, PatternsAreDropped)
{
    MinimalProvider provider;
    provider.folders = {here, StorageIRI(u"s://h/a/docs"), StorageIRI(u"s://h/a/img")};
    provider.put(StorageIRI(u"s://h/a/1.txt"), "");
    provider.put(StorageIRI(u"s://h/a/2.png"), "");
    EXPECT_EQ(namesIn(provider.listFiles(here, u"*.txt")), (NameList{u"1.txt", u"2.png"}));
    EXPECT_EQ(namesIn(provider.listFilesNamesOnly(here, u"*.txt")), (NameList{u"1.txt", u"2.png"}));
    EXPECT_EQ(namesIn(provider.listFolders(here, u"d*")), (NameList{u"docs", u"img"}));
    EXPECT_EQ(namesIn(provider.listFoldersNamesOnly(here, u"d*")), (NameList{u"docs", u"img"}));
    EXPECT_EQ(namesIn(provider.listAll(here, u"d*")), (NameList{u"docs", u"img", u"1.txt", u"2.png"}));
    EXPECT_EQ(namesIn(provider.listAllNamesOnly(here, u"d*")), (NameList{u"docs", u"img", u"1.txt", u"2.png"}));
}

} // namespace
} // namespace foundation::storage::provider
