#include <storage/provider/StorageItem.hpp>

#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/PatternKeeper.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/VectorListing.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using boost::posix_time::ptime;
using Kinds = std::vector<events::Kind>;
using Listing = std::unique_ptr<IFolderEntryIterator>;

StorageIRI const here(u"s://h/a");
StorageIRI const there(u"s://h/b");
constexpr ReplacementPolicy policy = ReplacementPolicy::Clobber;
constexpr ByteStreamOpenOptions options{ByteStreamAccess::ReadWrite, {}, {}, ByteStreamAppend::Overwrite};
char const* const optionsText = "ByteStreamOpenOptions: {ByteStreamAccess::ReadWrite, ByteStreamCreate::Create, "
                                "ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite}";

ChangeEventCallback const ignoreEvents = [](events::Kind const&, StorageIRI const&, StorageIRI const&,
                                            events::EntryType const&, boost::property_tree::ptree const&) {};

struct Row
{
    std::string call; // as the provider logs it
    std::function<void(StorageItem const&)> ask;
};

// Every forward, and the call of the provider's virtual operation that it leads to.
std::vector<Row> forwards()
{
    using I = StorageItem const&;
    return {
        {"doCreateFile(s://h/a)", [](I i) { i.createFile(); }},
        {"doCreateFolder(s://h/a)", [](I i) { i.createFolder(); }},
        {"doCreateFolderRecursive(s://h/a)", [](I i) { i.createFolderRecursive(); }},
        {"doFileExists(s://h/a)", [](I i) { i.fileExists(); }},
        {"doFolderExists(s://h/a)", [](I i) { i.folderExists(); }},
        {"doExists(s://h/a)", [](I i) { i.exists(); }},
        {"doExistsExtended(s://h/a)", [](I i) { i.existsExtended(); }},
        {"doRemoveFile(s://h/a)", [](I i) { i.removeFile(); }},
        {"doRemoveFolder(s://h/a)", [](I i) { i.removeFolder(); }},
        {"doRemoveFolderRecursively(s://h/a)", [](I i) { i.removeFolderRecursively(); }},
        {"doMoveFile(s://h/a, s://h/b, ReplacementPolicy::Clobber)", [](I i) { i.moveFile(there, policy); }},
        {"doMoveFolder(s://h/a, s://h/b, ReplacementPolicy::Clobber)", [](I i) { i.moveFolder(there, policy); }},
        {"doCopyFileAtomic(s://h/a, s://h/b, ReplacementPolicy::Clobber, no function)",
         [](I i) { i.copyFileAtomic(there, policy, {}); }},
        {"doGetFileAttributes(s://h/a)", [](I i) { i.getFileAttributes(); }},
        {"doGetFolderAttributes(s://h/a)", [](I i) { i.getFolderAttributes(); }},
        {"doGetExtendedAttributes(s://h/a)", [](I i) { i.getExtendedAttributes(); }},
        {std::string("doOpenStream(s://h/a, ") + optionsText + ")", [](I i) { i.openStream(options); }},
        {"doOpenReadOnlyStream(s://h/a)", [](I i) { i.openReadOnlyStream(); }},
        {std::string("doOpenTransactionalStream(s://h/a, ") + optionsText + ")",
         [](I i) { i.openTransactionalStream(options); }},
        {"doListAll(s://h/a)", [](I i) { i.listAll(); }},
        {"doListAllWildcards(s://h/a, \"*\")", [](I i) { i.listAll(u"*"); }},
        {"doListFiles(s://h/a)", [](I i) { i.listFiles(); }},
        {"doListFilesWildcards(s://h/a, \"*\")", [](I i) { i.listFiles(u"*"); }},
        {"doListFolders(s://h/a)", [](I i) { i.listFolders(); }},
        {"doListFoldersWildcards(s://h/a, \"*\")", [](I i) { i.listFolders(u"*"); }},
        {"doListAllNamesOnly(s://h/a)", [](I i) { i.listAllNamesOnly(); }},
        {"doListAllNamesOnlyWildcards(s://h/a, \"*\")", [](I i) { i.listAllNamesOnly(u"*"); }},
        {"doListFilesNamesOnly(s://h/a)", [](I i) { i.listFilesNamesOnly(); }},
        {"doListFilesNamesOnlyWildcards(s://h/a, \"*\")", [](I i) { i.listFilesNamesOnly(u"*"); }},
        {"doListFoldersNamesOnly(s://h/a)", [](I i) { i.listFoldersNamesOnly(); }},
        {"doListFoldersNamesOnlyWildcards(s://h/a, \"*\")", [](I i) { i.listFoldersNamesOnly(u"*"); }},
        {"doListAllRecursive(s://h/a)", [](I i) { i.listAllRecursive(); }},
        {"doListAllRecursiveWildcards(s://h/a, \"*\")", [](I i) { i.listAllRecursive(u"*"); }},
        {"doListAllRecursiveNamesOnly(s://h/a)", [](I i) { i.listAllRecursiveNamesOnly(); }},
        {"doListAllRecursiveNamesOnlyWildcards(s://h/a, \"*\")", [](I i) { i.listAllRecursiveNamesOnly(u"*"); }},
        {"doSetLastModified(s://h/a, 2024-02-29T00:00:00)",
         [](I i) { i.setLastModified(ptime(boost::gregorian::date(2024, 2, 29))); }},
        {"doSetWritable(s://h/a, true)", [](I i) { i.setWritable(true); }},
        {"doSetWritable(s://h/a, false)", [](I i) { i.setWritable(false); }},
        {"doPublishFileEventsFor(s://h/a, function, { 1 })",
         [](I i) { i.publishFileEvents(ignoreEvents, {events::Kind::Removed}); }},
        {"doPublishFolderEventsFor(s://h/a, no function, { })", [](I i) { i.publishFolderEvents({}, {}); }},
        {"doStopPublishingEventsFor(s://h/)", [](I i) { i.stopPublishingFileEvents(); }},
        {"doStopPublishingEventsFor(s://h/a)", [](I i) { i.stopPublishingFolderEvents(); }},
        {"doHasFeature(ExtendedFeature(5))", [](I i) { i.hasFeature(ExtendedFeature::AtomicFileCopy); }},
        {"doGetPathComparator(s://h/a)", [](I i) { i.getPathComparator(); }},
        {"doGetCanonicalLocation(s://h/a)", [](I i) { i.getCanonicalLocation(); }},
        {"doGetFilenameSensitivity(s://h/a)", [](I i) { i.getFilenameSensitivity(); }},
    };
}

class StorageItems : public testing::Test
{
protected:
    CallLog log;
    std::shared_ptr<RecordingProvider> const provider =
        std::make_shared<RecordingProvider>(log, RecordingProvider::Untold::AnswersPlainly);
    StorageItem const item{provider, here};
};

TEST_F(StorageItems, EachForwardReachesTheProviderWithTheLocationAndItsArguments)
{
    for (Row const& row : forwards()) {
        log.clear();
        row.ask(item);
        EXPECT_EQ(log, CallLog{row.call});
    }
}

TEST_F(StorageItems, ExceptionsOfTheProviderPassUnchanged)
{
    for (Row const& row : forwards()) {
        provider->fail(row.call, Exception(ErrorCode::ResourceInUse, there));
        EXPECT_EQ(failureOf([&] { row.ask(item); }), failure(ErrorCode::ResourceInUse, there)) << row.call;
    }
}

TEST_F(StorageItems, ResultsAreThoseOfTheProvider)
{
    for (bool const answer : {false, true}) {
        provider->when("doFileExists", [answer] { return answer; });
        provider->when("doFolderExists", [answer] { return answer; });
        provider->when("doHasFeature", [answer] { return answer; });
        EXPECT_EQ(item.fileExists(), answer);
        EXPECT_EQ(item.folderExists(), answer);
        EXPECT_EQ(item.hasFeature(ExtendedFeature::AtomicFileCopy), answer);
    }
    provider->when("doExists", [] { return ExistenceType::AsFolder; });
    EXPECT_EQ(item.exists(), ExistenceType::AsFolder);
    provider->when("doExistsExtended", [] { return ExistenceTypeExtended::SpecialFile; });
    EXPECT_EQ(item.existsExtended(), ExistenceTypeExtended::SpecialFile);
    provider->when("doGetFileAttributes", [] { return FileAttributes(42, ptime(), true); });
    EXPECT_EQ(item.getFileAttributes().getSize(), 42u);
    provider->when("doGetFolderAttributes", [] { return FolderAttributes(ptime(), true); });
    EXPECT_TRUE(item.getFolderAttributes().isWritable());
    provider->when("doGetExtendedAttributes", [] { return ExtendedAttributes({{"owner", 1}}); });
    EXPECT_TRUE(item.getExtendedAttributes().hasAttribute("owner"));
    provider->when("doGetCanonicalLocation", [] { return there; });
    EXPECT_EQ(item.getCanonicalLocation(), there);
    provider->when("doGetFilenameSensitivity", [] { return FilenameSensitivity{true, false}; });
    EXPECT_TRUE(item.getFilenameSensitivity().caseSensitive);
    EXPECT_FALSE(item.getFilenameSensitivity().casePreserving);
    provider->when("doGetPathComparator", []() -> PathComparator {
        return [](std::u16string const&, std::u16string const&, CaseModifier) { return true; };
    });
    EXPECT_TRUE(item.getPathComparator()(u"a", u"b", CaseModifier::None));
}

TEST_F(StorageItems, StreamsAreThoseOfTheProvider)
{
    auto const open = [this]() -> std::unique_ptr<ByteStream> {
        return std::make_unique<RecordingByteStream>(log, "stream");
    };
    provider->when("doOpenStream", open);
    provider->when("doOpenReadOnlyStream", open);
    char buffer[1];
    item.openStream(options)->write("x", 1);
    item.openReadOnlyStream()->read(buffer, 1);
    EXPECT_EQ(log, (CallLog{std::string("doOpenStream(s://h/a, ") + optionsText + ")", "stream.write(1)",
                            "doOpenReadOnlyStream(s://h/a)", "stream.read(1)"}));
    EXPECT_NE(item.openTransactionalStream(options), nullptr);
}

TEST_F(StorageItems, ListingsAreThoseOfTheProvider)
{
    provider->when("doListFiles", []() -> Listing {
        return std::make_unique<VectorListing>(
            std::vector<FolderEntry>{FolderEntry(u"1.txt", FolderEntry::EntryType::File)});
    });
    Listing const listing = item.listFiles();
    ASSERT_TRUE(listing->hasEntry());
    EXPECT_EQ(listing->entry().getName(), u"1.txt");
}

TEST_F(StorageItems, MovingAFolderIntoItselfIsRefusedBeforeTheProviderIsAsked)
{
    StorageIRI const inside(u"s://h/a/b");
    EXPECT_EQ(failureOf([&] { item.moveFolder(inside, policy); }), failure(ErrorCode::InvalidLocation, inside));
    EXPECT_TRUE(log.empty());
}

TEST_F(StorageItems, AddressQueriesDoNotAskTheProvider)
{
    EXPECT_EQ(item.getLocation(), here);
    EXPECT_EQ(item.getName(), u"a");
    EXPECT_EQ(item.getScheme(), u"s");
    EXPECT_TRUE(item.hasParent());
    EXPECT_EQ(item.getParent().getLocation(), StorageIRI(u"s://h/"));
    EXPECT_FALSE(item.getParent().hasParent());
    EXPECT_EQ(StorageItem(item, u"child").getLocation(), StorageIRI(u"s://h/a/child"));
    EXPECT_TRUE(item == item);
    EXPECT_TRUE(log.empty());
}

TEST_F(StorageItems, ChildIsJoinedAsTheLocationJoinsIt)
{
    for (std::u16string const& name : {std::u16string(u"b"), std::u16string(u"a b%20#?"), std::u16string(u"sub/"),
                                       std::u16string(u"/x"), std::u16string(u"..")})
    {
        EXPECT_EQ(StorageItem(item, name).getLocation(), StorageIRI(here, name));
    }
    EXPECT_EQ(StorageItem(item, u"a b%20#?").getName(), u"a b%20#?");
}

TEST_F(StorageItems, ChildSharesTheProvider)
{
    StorageItem const child(item, u"b");
    EXPECT_TRUE(child.hasSameProviderInstance(item));
    child.createFile();
    EXPECT_EQ(log, CallLog{"doCreateFile(s://h/a/b)"});
}

TEST_F(StorageItems, ParentOfAChildIsTheFolder)
{
    for (std::u16string const& name :
         {std::u16string(u"b"), std::u16string(u"a b%20#?"), std::u16string(u"\U0001F4C1")})
        EXPECT_EQ(StorageItem(item, name).getParent(), item);
    StorageItem const root(provider, StorageIRI(u"s://h/"));
    EXPECT_EQ(StorageItem(root, u"a").getParent(), root);
    EXPECT_EQ(StorageItem(root, u"a"), item);
}

TEST_F(StorageItems, ParentOfARootFailsAsThatOfItsLocation)
{
    StorageItem const root(provider, StorageIRI(u"s://h/"));
    std::string expected = "the root has a parent";
    try {
        root.getLocation().getParent();
    } catch (std::logic_error const& error) {
        expected = error.what();
    }
    try {
        root.getParent();
        FAIL() << "nothing was thrown";
    } catch (std::logic_error const& error) {
        EXPECT_EQ(error.what(), expected);
    }
}

TEST_F(StorageItems, ChildNameThatTheLocationRejectsIsRejected)
{
    std::u16string const loneSurrogate(1, char16_t{0xD800});
    EXPECT_THROW(StorageIRI(here, loneSurrogate).toString(), std::out_of_range);
    EXPECT_THROW(StorageItem(item, loneSurrogate).getLocation().toString(), std::out_of_range);
}

TEST_F(StorageItems, EqualItemsHaveTheVerySameProviderAndEqualLocations)
{
    auto const twin = std::make_shared<RecordingProvider>(log);
    EXPECT_TRUE(item == StorageItem(provider, StorageIRI(u"s://h/a")));
    EXPECT_FALSE(item != StorageItem(provider, StorageIRI(u"s://h/a")));
    EXPECT_FALSE(item == StorageItem(provider, there));
    EXPECT_TRUE(item != StorageItem(provider, there));
    EXPECT_FALSE(item == StorageItem(twin, here));
    EXPECT_TRUE(item != StorageItem(twin, here));
    EXPECT_EQ(StorageItem(twin, here).getLocation(), item.getLocation());
}

TEST_F(StorageItems, SameProviderInstanceLooksAtTheProviderAlone)
{
    auto const twin = std::make_shared<RecordingProvider>(log);
    EXPECT_TRUE(item.hasSameProviderInstance(StorageItem(provider, there)));
    EXPECT_FALSE(item.hasSameProviderInstance(StorageItem(twin, here)));
}

TEST_F(StorageItems, CopiesShareProviderAndLocation)
{
    StorageItem copy = item;
    EXPECT_EQ(copy, item);
    StorageItem other(std::make_shared<MinimalProvider>(), there);
    other = copy;
    EXPECT_EQ(other, item);
    StorageItem const moved = std::move(copy);
    EXPECT_EQ(moved, item);
}

TEST(StorageItem, LastItemReleasesTheProvider)
{
    auto provider = std::make_shared<MinimalProvider>();
    std::weak_ptr<MinimalProvider> const watch = provider;
    auto item = std::make_unique<StorageItem>(std::move(provider), here);
    auto child = std::make_unique<StorageItem>(*item, u"b");
    auto parent = std::make_unique<StorageItem>(item->getParent());
    item.reset();
    child.reset();
    EXPECT_FALSE(watch.expired());
    parent.reset();
    EXPECT_TRUE(watch.expired());
}

TEST(StorageItem, ProviderIsMovedIn)
{
    std::shared_ptr<IProvider> provider = std::make_shared<MinimalProvider>();
    IProvider const* const object = provider.get();
    StorageItem const item(std::move(provider), here);
    EXPECT_EQ(provider, nullptr); // NOLINT(bugprone-use-after-move)
    EXPECT_NE(object, nullptr);
}

TEST(StorageItem, PatternIsMovedOn)
{
    auto const provider = std::make_shared<PatternKeeper>();
    StorageItem const item(provider, here);
    for (auto const list :
         {&StorageItem::listAll, &StorageItem::listFiles, &StorageItem::listFolders, &StorageItem::listAllNamesOnly,
          &StorageItem::listFilesNamesOnly, &StorageItem::listFoldersNamesOnly, &StorageItem::listAllRecursive,
          &StorageItem::listAllRecursiveNamesOnly})
    {
        std::u16string pattern(1000, u'*');
        char16_t const* const text = pattern.data();
        (item.*list)(std::move(pattern));
        EXPECT_EQ(provider->text, text);
    }
}

template <class Result, class... Arguments>
using Operation = Result (StorageItem::*)(Arguments...) const;

template <class Type, class... Members>
constexpr bool allAre(Members...)
{
    return (std::is_same_v<Type, Members> && ...);
}

using S = StorageItem;
static_assert(std::is_constructible_v<S, std::shared_ptr<IProvider>, StorageIRI>);
static_assert(std::is_constructible_v<S, S const&, std::u16string>);
static_assert(!std::is_default_constructible_v<S>);
static_assert(!std::is_constructible_v<S, std::shared_ptr<IProvider>, std::u16string>);
static_assert(std::is_copy_constructible_v<S> && std::is_copy_assignable_v<S>);
static_assert(std::is_move_constructible_v<S> && std::is_move_assignable_v<S>);
static_assert(allAre<Operation<void>>(&S::createFile, &S::createFolder, &S::createFolderRecursive, &S::removeFile,
                                      &S::removeFolder, &S::removeFolderRecursively, &S::stopPublishingFileEvents,
                                      &S::stopPublishingFolderEvents));
static_assert(allAre<Operation<bool>>(&S::hasParent, &S::fileExists, &S::folderExists));
static_assert(allAre<Operation<ExistenceType>>(&S::exists));
static_assert(allAre<Operation<ExistenceTypeExtended>>(&S::existsExtended));
static_assert(allAre<Operation<StorageIRI>>(&S::getLocation, &S::getCanonicalLocation));
static_assert(allAre<Operation<std::u16string>>(&S::getName, &S::getScheme));
static_assert(allAre<Operation<S>>(&S::getParent));
static_assert(allAre<Operation<bool, S const&>>(&S::operator==, &S::operator!=, &S::hasSameProviderInstance));
static_assert(allAre<Operation<void, StorageIRI const&, ReplacementPolicy const&>>(&S::moveFile, &S::moveFolder));
static_assert(
    allAre<Operation<TransactionStatus, StorageIRI const&, ReplacementPolicy const&, IProvider::Interrupt const&>>(
        &S::copyFileAtomic));
static_assert(allAre<Operation<FileAttributes>>(&S::getFileAttributes));
static_assert(allAre<Operation<FolderAttributes>>(&S::getFolderAttributes));
static_assert(allAre<Operation<ExtendedAttributes>>(&S::getExtendedAttributes));
static_assert(allAre<Operation<std::unique_ptr<ByteStream>, ByteStreamOpenOptions const&>>(&S::openStream));
static_assert(allAre<Operation<std::unique_ptr<ByteStream>>>(&S::openReadOnlyStream));
static_assert(allAre<Operation<std::unique_ptr<TransactionalStream>, ByteStreamOpenOptions const&>>( //
    &S::openTransactionalStream));
static_assert(allAre<Operation<Listing, std::u16string>>(&S::listAll, &S::listFiles, &S::listFolders,
                                                         &S::listAllNamesOnly, &S::listFilesNamesOnly,
                                                         &S::listFoldersNamesOnly, &S::listAllRecursive,
                                                         &S::listAllRecursiveNamesOnly));
static_assert(allAre<Operation<void, ptime const&>>(&S::setLastModified));
static_assert(allAre<Operation<void, bool>>(&S::setWritable));
static_assert(allAre<Operation<void, ChangeEventCallback const&, Kinds const&>>(&S::publishFileEvents,
                                                                                &S::publishFolderEvents));
static_assert(allAre<Operation<bool, ExtendedFeature const&>>(&S::hasFeature));
static_assert(allAre<Operation<PathComparator>>(&S::getPathComparator));
static_assert(allAre<Operation<FilenameSensitivity>>(&S::getFilenameSensitivity));

} // namespace
} // namespace foundation::storage::provider
