#include <storage/provider/IProvider.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/detail/SafeByteStream.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/PatternKeeper.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/VectorListing.hpp>
#include <tests/support/failureOf.hpp>
#include <tests/support/slotOf.hpp>

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
using Interrupt = std::function<InterruptSignal()>;

StorageIRI const here(u"s://h/a");
StorageIRI const there(u"s://h/b");
ptime const noon(boost::gregorian::date(2024, 2, 29), boost::posix_time::hours(12));
constexpr ReplacementPolicy policy = ReplacementPolicy::NoClobber;
ByteStreamOpenOptions const options{ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate,
                                    ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite};
char const* const optionsText = "ByteStreamOpenOptions: {ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate, "
                                "ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite}";

ChangeEventCallback const ignoreEvents = [](events::Kind const&, StorageIRI const&, StorageIRI const&,
                                            events::EntryType const&, boost::property_tree::ptree const&) {};
Interrupt const goOn = [] { return InterruptSignal::Continue; };

struct Row
{
    std::string call; // as the provider logs it
    std::function<void(IProvider&)> ask;
};

// Every public operation, and the call of a virtual operation that it is.
std::vector<Row> publicOperations()
{
    return {
        {"doCreateFile(s://h/a)", [](IProvider& p) { p.createFile(here); }},
        {"doCreateFolder(s://h/a)", [](IProvider& p) { p.createFolder(here); }},
        {"doCreateFolderRecursive(s://h/a)", [](IProvider& p) { p.createFolderRecursive(here); }},
        {"doFileExists(s://h/a)", [](IProvider& p) { p.fileExists(here); }},
        {"doFolderExists(s://h/a)", [](IProvider& p) { p.folderExists(here); }},
        {"doRemoveFile(s://h/a)", [](IProvider& p) { p.removeFile(here); }},
        {"doMoveFile(s://h/a, s://h/b, ReplacementPolicy::NoClobber)",
         [](IProvider& p) { p.moveFile(here, there, policy); }},
        {"doRemoveFolder(s://h/a)", [](IProvider& p) { p.removeFolder(here); }},
        {"doRemoveFolderRecursively(s://h/a)", [](IProvider& p) { p.removeFolderRecursively(here); }},
        {"doMoveFolder(s://h/a, s://h/b, ReplacementPolicy::NoClobber)",
         [](IProvider& p) { p.moveFolder(here, there, policy); }},
        {"doGetFileAttributes(s://h/a)", [](IProvider& p) { p.getFileAttributes(here); }},
        {"doGetFolderAttributes(s://h/a)", [](IProvider& p) { p.getFolderAttributes(here); }},
        {"doGetExtendedAttributes(s://h/a)", [](IProvider& p) { p.getExtendedAttributes(here); }},
        {std::string("doOpenStream(s://h/a, ") + optionsText + ")", [](IProvider& p) { p.openStream(here, options); }},
        {"doOpenReadOnlyStream(s://h/a)", [](IProvider& p) { p.openReadOnlyStream(here); }},
        {std::string("doOpenTransactionalStream(s://h/a, ") + optionsText + ")",
         [](IProvider& p) { p.openTransactionalStream(here, options); }},
        {"doCopyFile(s://h/a, s://h/b, ReplacementPolicy::NoClobber)",
         [](IProvider& p) { p.copyFile(here, there, policy); }},
        {"doCopyFileAtomic(s://h/a, s://h/b, ReplacementPolicy::NoClobber, function)",
         [](IProvider& p) { p.copyFileAtomic(here, there, policy, goOn); }},
        {"doCopyFileAtomic(s://h/a, s://h/b, ReplacementPolicy::NoClobber, no function)",
         [](IProvider& p) { p.copyFileAtomic(here, there, policy, {}); }},
        {"doSetLastModified(s://h/a, 2024-02-29T12:00:00)", [](IProvider& p) { p.setLastModified(here, noon); }},
        {"doSetWritable(s://h/a, true)", [](IProvider& p) { p.setWritable(here, true); }},
        {"doSetWritable(s://h/a, false)", [](IProvider& p) { p.setWritable(here, false); }},
        {"doPublishFileEventsFor(s://h/a, function, { 0 4 })",
         [](IProvider& p) {
             p.publishFileEventsFor(here, ignoreEvents, {events::Kind::Created, events::Kind::Moved});
         }},
        {"doPublishFolderEventsFor(s://h/a, no function, { })",
         [](IProvider& p) { p.publishFolderEventsFor(here, {}, {}); }},
        {"doStopPublishingEventsFor(s://h/)", [](IProvider& p) { p.stopPublishingFileEventsFor(here); }},
        {"doStopPublishingEventsFor(s://h/a)", [](IProvider& p) { p.stopPublishingFolderEventsFor(here); }},
        {"doHasFeature(ExtendedFeature(0))",
         [](IProvider& p) { p.hasFeature(ExtendedFeature::RecursiveFolderRemoval); }},
        {"doHasFeature(ExtendedFeature(5))", [](IProvider& p) { p.hasFeature(ExtendedFeature::AtomicFileCopy); }},
        {"doGetPathComparator(s://h/a)", [](IProvider& p) { p.getPathComparator(here); }},
        {"doGetCanonicalLocation(s://h/a)", [](IProvider& p) { p.getCanonicalLocation(here); }},
        {"doGetFilenameSensitivity(s://h/a)", [](IProvider& p) { p.getFilenameSensitivity(here); }},
        {"doShutdown()", [](IProvider& p) { p.shutdown(); }},
        {"doExists(s://h/a)", [](IProvider& p) { p.exists(here); }},
        {"doExistsExtended(s://h/a)", [](IProvider& p) { p.existsExtended(here); }},
    };
}

using ListOperation = Listing (IProvider::*)(StorageIRI const&, std::u16string) const;

struct ListRow
{
    char const* plainSlot;
    ListOperation list;
    std::function<Listing(IProvider const&)> listWithoutPattern;
};

std::vector<ListRow> listOperations()
{
    return {
        {"doListAll", &IProvider::listAll, [](IProvider const& p) { return p.listAll(here); }},
        {"doListFiles", &IProvider::listFiles, [](IProvider const& p) { return p.listFiles(here); }},
        {"doListFolders", &IProvider::listFolders, [](IProvider const& p) { return p.listFolders(here); }},
        {"doListAllNamesOnly", &IProvider::listAllNamesOnly,
         [](IProvider const& p) { return p.listAllNamesOnly(here); }},
        {"doListFilesNamesOnly", &IProvider::listFilesNamesOnly,
         [](IProvider const& p) { return p.listFilesNamesOnly(here); }},
        {"doListFoldersNamesOnly", &IProvider::listFoldersNamesOnly,
         [](IProvider const& p) { return p.listFoldersNamesOnly(here); }},
        {"doListAllRecursive", &IProvider::listAllRecursive,
         [](IProvider const& p) { return p.listAllRecursive(here); }},
        {"doListAllRecursiveNamesOnly", &IProvider::listAllRecursiveNamesOnly,
         [](IProvider const& p) { return p.listAllRecursiveNamesOnly(here); }},
    };
}

class IProviderOperations : public testing::Test
{
protected:
    CallLog log;
    RecordingProvider recording{log, RecordingProvider::Untold::AnswersPlainly};
    IProvider& provider = recording;
};

TEST_F(IProviderOperations, EachReachesItsVirtualOperationWithItsArgumentsAndNothingElse)
{
    for (Row const& row : publicOperations()) {
        log.clear();
        row.ask(provider);
        EXPECT_EQ(log, CallLog{row.call});
    }
}

TEST_F(IProviderOperations, ExceptionsOfTheVirtualOperationPassUnchanged)
{
    for (Row const& row : publicOperations()) {
        recording.fail(row.call, Exception(ErrorCode::ResourceInUse, there));
        EXPECT_EQ(failureOf([&] { row.ask(provider); }), failure(ErrorCode::ResourceInUse, there)) << row.call;
        recording.fail(row.call, std::string("not even an exception"));
        EXPECT_THROW(row.ask(provider), std::string) << row.call;
    }
}

TEST_F(IProviderOperations, ListingWithoutAPatternReachesThePlainOperation)
{
    for (ListRow const& row : listOperations()) {
        log.clear();
        row.listWithoutPattern(provider);
        (provider.*row.list)(here, u"");
        std::string const call = std::string(row.plainSlot) + "(s://h/a)";
        EXPECT_EQ(log, (CallLog{call, call}));
    }
}

TEST_F(IProviderOperations, ListingWithAnyPatternReachesTheWildcardOperation)
{
    for (ListRow const& row : listOperations()) {
        log.clear();
        (provider.*row.list)(here, u"*");
        (provider.*row.list)(here, u"*.t\u00E9xt");
        (provider.*row.list)(here, std::u16string(1, u'\0'));
        std::string const call = std::string(row.plainSlot) + "Wildcards(s://h/a, \"";
        EXPECT_EQ(log, (CallLog{call + "*\")", call + "*.t\xC3\xA9xt\")", call + '\0' + "\")"}));
    }
}

TEST_F(IProviderOperations, ListingIsWhatTheVirtualOperationAnswers)
{
    for (ListRow const& row : listOperations()) {
        for (char const* const ending : {"", "Wildcards"}) {
            IFolderEntryIterator const* answered = nullptr;
            recording.when(row.plainSlot + std::string(ending), [&answered]() -> Listing {
                auto listing = std::make_unique<VectorListing>(std::vector<FolderEntry>());
                answered = listing.get();
                return listing;
            });
            Listing const listing = (provider.*row.list)(here, *ending == '\0' ? u"" : u"*");
            EXPECT_EQ(listing.get(), answered) << row.plainSlot << ending;
            EXPECT_NE(listing, nullptr) << row.plainSlot << ending;
        }
    }
}

TEST_F(IProviderOperations, ListingsPassTheirExceptionsUnchanged)
{
    for (ListRow const& row : listOperations()) {
        recording.fail(row.plainSlot, std::out_of_range("plain"));
        recording.fail(row.plainSlot + std::string("Wildcards"), std::length_error("wildcards"));
        EXPECT_THROW((provider.*row.list)(here, u""), std::out_of_range) << row.plainSlot;
        EXPECT_THROW((provider.*row.list)(here, u"*"), std::length_error) << row.plainSlot;
    }
}

TEST(IProvider, PatternIsMovedOn)
{
    PatternKeeper const provider;
    for (ListRow const& row : listOperations()) {
        std::u16string pattern(1000, u'*');
        char16_t const* const text = pattern.data();
        (provider.*row.list)(here, std::move(pattern));
        EXPECT_EQ(provider.text, text) << row.plainSlot;
    }
}

TEST_F(IProviderOperations, AnswersArePassedOn)
{
    for (bool const answer : {false, true}) {
        recording.when("doFileExists", [answer] { return answer; });
        recording.when("doFolderExists", [answer] { return answer; });
        recording.when("doHasFeature", [answer] { return answer; });
        EXPECT_EQ(provider.fileExists(here), answer);
        EXPECT_EQ(provider.folderExists(here), answer);
        EXPECT_EQ(provider.hasFeature(ExtendedFeature::AtomicFileCopy), answer);
    }
    recording.when("doExists", [] { return ExistenceType::AsFolder; });
    EXPECT_EQ(provider.exists(here), ExistenceType::AsFolder);
    recording.when("doExistsExtended", [] { return ExistenceTypeExtended::BrokenSymlink; });
    EXPECT_EQ(provider.existsExtended(here), ExistenceTypeExtended::BrokenSymlink);
    recording.when("doCopyFileAtomic", [] { return TransactionStatus::Aborted; });
    EXPECT_EQ(provider.copyFileAtomic(here, there, {}, {}), TransactionStatus::Aborted);
    recording.when("doGetCanonicalLocation", [] { return there; });
    EXPECT_EQ(provider.getCanonicalLocation(here), there);
    recording.when("doGetFilenameSensitivity", [] { return FilenameSensitivity{false, true}; });
    EXPECT_FALSE(provider.getFilenameSensitivity(here).caseSensitive);
    EXPECT_TRUE(provider.getFilenameSensitivity(here).casePreserving);
}

TEST_F(IProviderOperations, AttributesArePassedOn)
{
    recording.when("doGetFileAttributes", [] { return FileAttributes(42, noon, true); });
    EXPECT_EQ(provider.getFileAttributes(here).getSize(), 42u);
    EXPECT_EQ(provider.getFileAttributes(here).getLastModified(), noon);
    recording.when("doGetFolderAttributes", [] { return FolderAttributes(noon, true); });
    EXPECT_EQ(provider.getFolderAttributes(here).getLastModified(), noon);
    recording.when("doGetExtendedAttributes", [] { return ExtendedAttributes({{"owner", 1}}); });
    EXPECT_TRUE(provider.getExtendedAttributes(here).hasAttribute("owner"));
}

TEST_F(IProviderOperations, ComparatorIsPassedOn)
{
    recording.when("doGetPathComparator", []() -> PathComparator {
        return [](std::u16string const&, std::u16string const&, CaseModifier) { return true; };
    });
    EXPECT_TRUE(provider.getPathComparator(here)(u"a", u"b", CaseModifier::None));
}

TEST_F(IProviderOperations, FunctionsArePassedOn)
{
    std::vector<StorageIRI> seen;
    ChangeEventCallback const callback = [&seen](events::Kind const&, StorageIRI const& first, StorageIRI const& second,
                                                 events::EntryType const&, boost::property_tree::ptree const&) {
        seen = {first, second};
    };
    provider.publishFolderEventsFor(here, callback, {});
    recording.callbackGiven(events::Kind::Moved, here, there, events::EntryType::File, {});
    EXPECT_EQ(seen, (std::vector<StorageIRI>{here, there}));

    provider.publishFileEventsFor(here, callback, {});
    recording.callbackGiven(events::Kind::Moved, there, here, events::EntryType::File, {});
    EXPECT_EQ(seen, (std::vector<StorageIRI>{there, here}));

    provider.copyFileAtomic(here, there, {}, [] { return InterruptSignal::Abort; });
    EXPECT_EQ(recording.interruptGiven(), InterruptSignal::Abort);
}

TEST_F(IProviderOperations, OpenedStreamIsGuardedByTheAccessAskedFor)
{
    for (ByteStreamAccess const access :
         {ByteStreamAccess::WriteOnly, ByteStreamAccess::ReadWrite, static_cast<ByteStreamAccess>(7)})
    {
        recording.when("doOpenStream", [this]() -> std::unique_ptr<ByteStream> {
            auto stream = std::make_unique<RecordingByteStream>(log, "stream");
            stream->onRead = readsFrom("data");
            return stream;
        });
        auto const stream = provider.openStream(here, ByteStreamOpenOptions{access, {}, {}, {}});
        log.clear();
        EXPECT_NE(dynamic_cast<detail::SafeByteStream*>(stream.get()), nullptr);
        char buffer[8] = {};
        EXPECT_EQ(stream->read(buffer, 8), access == ByteStreamAccess::ReadWrite ? 4 : -1);
        EXPECT_EQ(stream->write("xyz", 3), 3);
        EXPECT_EQ(stream->seek(5, std::ios_base::beg), 5);
        stream->close();
        CallLog expected = {"stream.write(3)", "stream.seek(5, beg)", "stream.close()"};
        if (access == ByteStreamAccess::ReadWrite)
            expected.insert(expected.begin(), "stream.read(8)");
        EXPECT_EQ(log, expected);
    }
}

TEST_F(IProviderOperations, ReadOnlyStreamReadsAndRefusesToWrite)
{
    recording.when("doOpenReadOnlyStream", [this]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<RecordingByteStream>(log, "stream");
        stream->onRead = readsFrom("data");
        return stream;
    });
    auto const stream = provider.openReadOnlyStream(here);
    log.clear();
    EXPECT_NE(dynamic_cast<detail::SafeByteStream*>(stream.get()), nullptr);
    char buffer[8] = {};
    EXPECT_EQ(stream->read(buffer, 8), 4);
    try {
        stream->write("", 0);
        ADD_FAILURE() << "nothing was thrown";
    } catch (ByteStreamWriteFailure const& failure) {
        EXPECT_EQ(std::string(failure.what()).find("Stream was not opened for writing."), 0u);
        EXPECT_EQ(failure.getErrorCode(), ErrorCode::IOError);
    }
    EXPECT_EQ(log, CallLog{"stream.read(8)"});
}

TEST_F(IProviderOperations, TransactionalStreamIsNotWrapped)
{
    struct Plain : TransactionalStream
    {
        void doClose(StreamClosePolicy const&) override {}
        ByteStream* doByteStream() override { return nullptr; }
    };
    recording.when("doOpenTransactionalStream",
                   []() -> std::unique_ptr<TransactionalStream> { return std::make_unique<Plain>(); });
    EXPECT_NE(dynamic_cast<Plain*>(provider.openTransactionalStream(here, options).get()), nullptr);
}

TEST_F(IProviderOperations, FolderIsNotMovedIntoItsOwnSubtree)
{
    StorageIRI const folder(u"s://h/A");
    for (char16_t const* const text : {u"s://h/A/B", u"s://h/A/B/C", u"s://other/A/B"}) {
        StorageIRI const inside{std::u16string(text)};
        EXPECT_EQ(failureOf([&] { provider.moveFolder(folder, inside, ReplacementPolicy::Overwrite); }),
                  failure(ErrorCode::InvalidLocation, inside));
    }
    EXPECT_TRUE(log.empty()) << "the provider was asked";
}

TEST_F(IProviderOperations, FolderIsMovedOntoItselfUpwardsAndToItsSiblings)
{
    StorageIRI const folder(u"s://h/A/B");
    for (char16_t const* const text :
         {u"s://h/A/B", u"s://h/A", u"s://h/", u"s://h/A/BC", u"s://h/A/C/D", u"t://h/A/B/C"}) {
        log.clear();
        provider.moveFolder(folder, StorageIRI{std::u16string(text)}, ReplacementPolicy::Overwrite);
        EXPECT_EQ(log.size(), 1u);
    }
}

TEST_F(IProviderOperations, StoppingFileEventsOfALocationWithoutAParentFailsAsItsParentDoes)
{
    StorageIRI const root(u"s://h/");
    std::string expected = "the root has a parent";
    try {
        root.getParent();
    } catch (std::logic_error const& error) {
        expected = error.what();
    }
    try {
        provider.stopPublishingFileEventsFor(root);
        ADD_FAILURE() << "nothing was thrown";
    } catch (std::logic_error const& error) {
        EXPECT_EQ(error.what(), expected);
    }
    EXPECT_TRUE(log.empty());
    provider.stopPublishingFolderEventsFor(root);
    EXPECT_EQ(log, CallLog{"doStopPublishingEventsFor(s://h/)"});
}

// Makes the virtual operations nameable.
struct Opened : IProvider
{
    using IProvider::doCopyFile;
    using IProvider::doCopyFileAtomic;
    using IProvider::doCreateFile;
    using IProvider::doCreateFolder;
    using IProvider::doCreateFolderRecursive;
    using IProvider::doExists;
    using IProvider::doExistsExtended;
    using IProvider::doFileExists;
    using IProvider::doFolderExists;
    using IProvider::doGetCanonicalLocation;
    using IProvider::doGetExtendedAttributes;
    using IProvider::doGetFileAttributes;
    using IProvider::doGetFilenameSensitivity;
    using IProvider::doGetFolderAttributes;
    using IProvider::doGetPathComparator;
    using IProvider::doHasFeature;
    using IProvider::doListAll;
    using IProvider::doListAllNamesOnly;
    using IProvider::doListAllNamesOnlyWildcards;
    using IProvider::doListAllRecursive;
    using IProvider::doListAllRecursiveNamesOnly;
    using IProvider::doListAllRecursiveNamesOnlyWildcards;
    using IProvider::doListAllRecursiveWildcards;
    using IProvider::doListAllWildcards;
    using IProvider::doListFiles;
    using IProvider::doListFilesNamesOnly;
    using IProvider::doListFilesNamesOnlyWildcards;
    using IProvider::doListFilesWildcards;
    using IProvider::doListFolders;
    using IProvider::doListFoldersNamesOnly;
    using IProvider::doListFoldersNamesOnlyWildcards;
    using IProvider::doListFoldersWildcards;
    using IProvider::doMoveFile;
    using IProvider::doMoveFolder;
    using IProvider::doOpenReadOnlyStream;
    using IProvider::doOpenStream;
    using IProvider::doOpenTransactionalStream;
    using IProvider::doOpenTransactionalStreamAtScratchLocation;
    using IProvider::doPublishFileEventsFor;
    using IProvider::doPublishFolderEventsFor;
    using IProvider::doRemoveFile;
    using IProvider::doRemoveFolder;
    using IProvider::doRemoveFolderRecursively;
    using IProvider::doSetLastModified;
    using IProvider::doSetWritable;
    using IProvider::doShutdown;
    using IProvider::doStopPublishingEventsFor;
};

TEST(IProvider, VirtualOperationsStandAfterTheDestructorInOrder)
{
    std::vector<std::size_t> const slots = {
        slotOf(&Opened::doCreateFile),
        slotOf(&Opened::doCreateFolder),
        slotOf(&Opened::doCreateFolderRecursive),
        slotOf(&Opened::doFileExists),
        slotOf(&Opened::doFolderExists),
        slotOf(&Opened::doRemoveFile),
        slotOf(&Opened::doMoveFile),
        slotOf(&Opened::doRemoveFolder),
        slotOf(&Opened::doRemoveFolderRecursively),
        slotOf(&Opened::doMoveFolder),
        slotOf(&Opened::doGetFileAttributes),
        slotOf(&Opened::doGetFolderAttributes),
        slotOf(&Opened::doOpenStream),
        slotOf(&Opened::doOpenReadOnlyStream),
        slotOf(&Opened::doOpenTransactionalStream),
        slotOf(&Opened::doOpenTransactionalStreamAtScratchLocation),
        slotOf(&Opened::doListAll),
        slotOf(&Opened::doListAllWildcards),
        slotOf(&Opened::doListFiles),
        slotOf(&Opened::doListFilesWildcards),
        slotOf(&Opened::doListFolders),
        slotOf(&Opened::doListFoldersWildcards),
        slotOf(&Opened::doListAllNamesOnly),
        slotOf(&Opened::doListAllNamesOnlyWildcards),
        slotOf(&Opened::doListFoldersNamesOnly),
        slotOf(&Opened::doListFoldersNamesOnlyWildcards),
        slotOf(&Opened::doListFilesNamesOnly),
        slotOf(&Opened::doListFilesNamesOnlyWildcards),
        slotOf(&Opened::doListAllRecursive),
        slotOf(&Opened::doListAllRecursiveWildcards),
        slotOf(&Opened::doListAllRecursiveNamesOnly),
        slotOf(&Opened::doListAllRecursiveNamesOnlyWildcards),
        slotOf(&Opened::doCopyFile),
        slotOf(&Opened::doCopyFileAtomic),
        slotOf(&Opened::doSetLastModified),
        slotOf(&Opened::doSetWritable),
        slotOf(&Opened::doPublishFolderEventsFor),
        slotOf(&Opened::doPublishFileEventsFor),
        slotOf(&Opened::doStopPublishingEventsFor),
        slotOf(&Opened::doHasFeature),
        slotOf(&Opened::doGetPathComparator),
        slotOf(&Opened::doGetCanonicalLocation),
        slotOf(&Opened::doGetFilenameSensitivity),
        slotOf(&Opened::doShutdown),
        slotOf(&Opened::doExists),
        slotOf(&Opened::doExistsExtended),
        slotOf(&Opened::doGetExtendedAttributes),
    };
    ASSERT_EQ(slots.size(), 47u);
    for (std::size_t i = 0; i < slots.size(); ++i)
        EXPECT_EQ(slots[i], i + 2) << "virtual operation " << i + 1;
}

static_assert(std::is_abstract_v<IProvider>);
static_assert(std::has_virtual_destructor_v<IProvider>);
static_assert(sizeof(IProvider) == sizeof(void*), "the interface has no data");
static_assert(!std::is_copy_constructible_v<MinimalProvider> && !std::is_copy_assignable_v<MinimalProvider>);

static_assert(
    std::is_same_v<ChangeEventCallback, std::function<void(events::Kind const&, StorageIRI const&, StorageIRI const&,
                                                           events::EntryType const&, boost::property_tree::ptree)>>);
static_assert(
    std::is_same_v<PathComparator, std::function<bool(std::u16string const&, std::u16string const&, CaseModifier)>>);
static_assert(std::is_aggregate_v<FilenameSensitivity> && sizeof(FilenameSensitivity) == 2);
static_assert(std::is_same_v<decltype(FilenameSensitivity::caseSensitive), bool>);
static_assert(std::is_same_v<decltype(FilenameSensitivity::casePreserving), bool>);

// The exact signatures, public and virtual alike, of operations that share one.
template <class Result, class... Arguments>
using Operation = Result (IProvider::*)(Arguments...) const;

template <class Type, class... Members>
constexpr bool allAre(Members...)
{
    return (std::is_same_v<Type, Members> && ...);
}

static_assert(allAre<Operation<void, StorageIRI const&>>(
    &IProvider::createFile, &IProvider::createFolder, &IProvider::createFolderRecursive, &IProvider::removeFile,
    &IProvider::removeFolder, &IProvider::removeFolderRecursively, &IProvider::stopPublishingFileEventsFor,
    &IProvider::stopPublishingFolderEventsFor, &Opened::doCreateFile, &Opened::doCreateFolder,
    &Opened::doCreateFolderRecursive, &Opened::doRemoveFile, &Opened::doRemoveFolder,
    &Opened::doRemoveFolderRecursively, &Opened::doStopPublishingEventsFor));
static_assert(allAre<Operation<bool, StorageIRI const&>>(&IProvider::fileExists, &IProvider::folderExists,
                                                         &Opened::doFileExists, &Opened::doFolderExists));
static_assert(allAre<Operation<void, StorageIRI const&, StorageIRI const&, ReplacementPolicy const&>>(
    &IProvider::moveFile, &IProvider::moveFolder, &IProvider::copyFile, &Opened::doMoveFile, &Opened::doMoveFolder,
    &Opened::doCopyFile));
static_assert(allAre<Operation<FileAttributes, StorageIRI const&>>(&IProvider::getFileAttributes,
                                                                   &Opened::doGetFileAttributes));
static_assert(allAre<Operation<FolderAttributes, StorageIRI const&>>(&IProvider::getFolderAttributes,
                                                                     &Opened::doGetFolderAttributes));
static_assert(allAre<Operation<ExtendedAttributes, StorageIRI const&>>(&IProvider::getExtendedAttributes,
                                                                       &Opened::doGetExtendedAttributes));
static_assert(allAre<Operation<std::unique_ptr<ByteStream>, StorageIRI const&, ByteStreamOpenOptions const&>>(
    &IProvider::openStream, &Opened::doOpenStream));
static_assert(allAre<Operation<std::unique_ptr<ByteStream>, StorageIRI const&>>(&IProvider::openReadOnlyStream,
                                                                                &Opened::doOpenReadOnlyStream));
static_assert(allAre<Operation<std::unique_ptr<TransactionalStream>, StorageIRI const&, ByteStreamOpenOptions const&>>(
    &IProvider::openTransactionalStream, &Opened::doOpenTransactionalStream));
static_assert(allAre<Operation<std::unique_ptr<TransactionalStream>, StorageIRI const&, StorageIRI const&,
                               ByteStreamOpenOptions const&>>(&Opened::doOpenTransactionalStreamAtScratchLocation));
static_assert(allAre<Operation<Listing, StorageIRI const&, std::u16string>>(
    &IProvider::listAll, &IProvider::listFiles, &IProvider::listFolders, &IProvider::listAllNamesOnly,
    &IProvider::listFilesNamesOnly, &IProvider::listFoldersNamesOnly, &IProvider::listAllRecursive,
    &IProvider::listAllRecursiveNamesOnly, &Opened::doListAllWildcards, &Opened::doListFilesWildcards,
    &Opened::doListFoldersWildcards, &Opened::doListAllNamesOnlyWildcards, &Opened::doListFilesNamesOnlyWildcards,
    &Opened::doListFoldersNamesOnlyWildcards, &Opened::doListAllRecursiveWildcards,
    &Opened::doListAllRecursiveNamesOnlyWildcards));
static_assert(allAre<Operation<Listing, StorageIRI const&>>(
    &Opened::doListAll, &Opened::doListFiles, &Opened::doListFolders, &Opened::doListAllNamesOnly,
    &Opened::doListFilesNamesOnly, &Opened::doListFoldersNamesOnly, &Opened::doListAllRecursive,
    &Opened::doListAllRecursiveNamesOnly));
static_assert(allAre<Operation<TransactionStatus, StorageIRI const&, StorageIRI const&, ReplacementPolicy const&,
                               std::function<InterruptSignal()> const&>>(&IProvider::copyFileAtomic,
                                                                         &Opened::doCopyFileAtomic));
static_assert(allAre<Operation<void, StorageIRI const&, ptime const&>>(&IProvider::setLastModified,
                                                                       &Opened::doSetLastModified));
static_assert(allAre<Operation<void, StorageIRI const&, bool>>(&IProvider::setWritable, &Opened::doSetWritable));
static_assert(allAre<Operation<void, StorageIRI const&, ChangeEventCallback const&, Kinds const&>>(
    &IProvider::publishFileEventsFor, &IProvider::publishFolderEventsFor, &Opened::doPublishFileEventsFor,
    &Opened::doPublishFolderEventsFor));
static_assert(allAre<Operation<bool, ExtendedFeature const&>>(&IProvider::hasFeature, &Opened::doHasFeature));
static_assert(allAre<Operation<PathComparator, StorageIRI const&>>(&IProvider::getPathComparator,
                                                                   &Opened::doGetPathComparator));
static_assert(allAre<Operation<StorageIRI, StorageIRI const&>>(&IProvider::getCanonicalLocation,
                                                               &Opened::doGetCanonicalLocation));
static_assert(allAre<Operation<FilenameSensitivity, StorageIRI const&>>(&IProvider::getFilenameSensitivity,
                                                                        &Opened::doGetFilenameSensitivity));
static_assert(allAre<Operation<ExistenceType, StorageIRI const&>>(&IProvider::exists, &Opened::doExists));
static_assert(allAre<Operation<ExistenceTypeExtended, StorageIRI const&>>(&IProvider::existsExtended,
                                                                          &Opened::doExistsExtended));
static_assert(allAre<void (IProvider::*)()>(&IProvider::shutdown, &Opened::doShutdown));

// Text does not become a location by itself.
static_assert(!std::is_convertible_v<std::u16string, StorageIRI>);
static_assert(!std::is_invocable_v<decltype(&IProvider::createFile), IProvider const&, std::u16string>);
static_assert(!std::is_invocable_v<decltype(&IProvider::shutdown), IProvider const&>);

TEST(IProvider, PublicOperationsAreNotVirtual)
{
    EXPECT_FALSE(isVirtual(&IProvider::createFile));
    EXPECT_FALSE(isVirtual(&IProvider::exists));
    EXPECT_FALSE(isVirtual(&IProvider::openTransactionalStream));
    EXPECT_FALSE(isVirtual(&IProvider::shutdown));
    for (ListRow const& row : listOperations())
        EXPECT_FALSE(isVirtual(row.list)) << row.plainSlot;
}

} // namespace
} // namespace foundation::storage::provider
