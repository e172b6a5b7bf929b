#include <storage/conformance/ForwardingProvider.hpp>

#include <storage/provider/ExtendedFeature.hpp>
#include <tests/support/RecordingProvider.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <utility>
#include <vector>

namespace foundation::storage::conformance {
namespace {

using namespace provider;
using tests::support::CallLog;
using tests::support::RecordingProvider;

StorageIRI const iri(u"s://h/a");
StorageIRI const other(u"s://h/b");

using Use = std::function<void(IProvider&)>;

/// Every public operation, each listing with a pattern and without.
std::vector<Use> const uses{
    [](IProvider& p) { p.createFile(iri); },
    [](IProvider& p) { p.createFolder(iri); },
    [](IProvider& p) { p.createFolderRecursive(iri); },
    [](IProvider& p) { p.fileExists(iri); },
    [](IProvider& p) { p.folderExists(iri); },
    [](IProvider& p) { p.removeFile(iri); },
    [](IProvider& p) { p.moveFile(iri, other, ReplacementPolicy::Clobber); },
    [](IProvider& p) { p.removeFolder(iri); },
    [](IProvider& p) { p.removeFolderRecursively(iri); },
    [](IProvider& p) { p.moveFolder(iri, other, ReplacementPolicy::NoClobber); },
    [](IProvider& p) { p.getFileAttributes(iri); },
    [](IProvider& p) { p.getFolderAttributes(iri); },
    [](IProvider& p) { p.getExtendedAttributes(iri); },
    [](IProvider& p) {
        p.openStream(iri, {ByteStreamAccess::ReadWrite, {}, ByteStreamTruncate::PreserveExisting, {}});
    },
    [](IProvider& p) { p.openReadOnlyStream(iri); },
    [](IProvider& p) {
        p.openTransactionalStream(iri, {ByteStreamAccess::ReadWrite, {}, {}, {}});
    },
    [](IProvider& p) { p.listAll(iri); },
    [](IProvider& p) { p.listAll(iri, u"*"); },
    [](IProvider& p) { p.listFiles(iri); },
    [](IProvider& p) { p.listFiles(iri, u"*"); },
    [](IProvider& p) { p.listFolders(iri); },
    [](IProvider& p) { p.listFolders(iri, u"*"); },
    [](IProvider& p) { p.listAllNamesOnly(iri); },
    [](IProvider& p) { p.listAllNamesOnly(iri, u"*"); },
    [](IProvider& p) { p.listFilesNamesOnly(iri); },
    [](IProvider& p) { p.listFilesNamesOnly(iri, u"*"); },
    [](IProvider& p) { p.listFoldersNamesOnly(iri); },
    [](IProvider& p) { p.listFoldersNamesOnly(iri, u"*"); },
    [](IProvider& p) { p.listAllRecursive(iri); },
    [](IProvider& p) { p.listAllRecursive(iri, u"*"); },
    [](IProvider& p) { p.listAllRecursiveNamesOnly(iri); },
    [](IProvider& p) { p.listAllRecursiveNamesOnly(iri, u"*"); },
    [](IProvider& p) { p.copyFile(iri, other, ReplacementPolicy::Overwrite); },
    [](IProvider& p) { p.copyFileAtomic(iri, other, ReplacementPolicy::Overwrite, {}); },
    [](IProvider& p) { p.setLastModified(iri, boost::posix_time::ptime(boost::gregorian::date(2020, 1, 2))); },
    [](IProvider& p) { p.setWritable(iri, true); },
    [](IProvider& p) { p.publishFileEventsFor(iri, {}, {events::Kind::Removed}); },
    [](IProvider& p) { p.publishFolderEventsFor(iri, {}, {events::Kind::Created}); },
    [](IProvider& p) { p.stopPublishingFileEventsFor(iri); },
    [](IProvider& p) { p.stopPublishingFolderEventsFor(iri); },
    [](IProvider& p) { p.hasFeature(ExtendedFeature::AtomicFileCopy); },
    [](IProvider& p) { p.getPathComparator(iri); },
    [](IProvider& p) { p.getCanonicalLocation(iri); },
    [](IProvider& p) { p.getFilenameSensitivity(iri); },
    [](IProvider& p) { p.shutdown(); },
    [](IProvider& p) { p.exists(iri); },
    [](IProvider& p) { p.existsExtended(iri); },
};

TEST(ForwardingProvider, ReachesTheSameOperationWithTheSameArguments)
{
    for (Use const& use : uses) {
        CallLog direct;
        RecordingProvider recording(direct, RecordingProvider::Untold::AnswersPlainly);
        use(recording);
        CallLog forwarded;
        ForwardingProvider forwarding(
            std::make_shared<RecordingProvider>(forwarded, RecordingProvider::Untold::AnswersPlainly));
        use(forwarding);
        ASSERT_EQ(direct.size(), 1u);
        EXPECT_EQ(forwarded, direct);
    }
}

TEST(ForwardingProvider, AnswersWhatItsTargetAnswers)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    target->when("doFileExists", [] { return true; });
    target->when("doExistsExtended", [] { return ExistenceTypeExtended::SpecialFile; });
    target->when("doCopyFileAtomic", [] { return TransactionStatus::Aborted; });
    target->when("doGetCanonicalLocation", [] { return other; });
    target->when("doGetFilenameSensitivity", [] { return FilenameSensitivity{true, false}; });
    ForwardingProvider const forwarding(target);
    EXPECT_TRUE(forwarding.fileExists(iri));
    EXPECT_EQ(forwarding.existsExtended(iri), ExistenceTypeExtended::SpecialFile);
    EXPECT_EQ(forwarding.copyFileAtomic(iri, other, {}, {}), TransactionStatus::Aborted);
    EXPECT_EQ(forwarding.getCanonicalLocation(iri), other);
    EXPECT_FALSE(forwarding.getFilenameSensitivity(iri).casePreserving);
}

class Announcing : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;
    mutable std::vector<std::pair<std::string, StorageIRI>> announced;

protected:
    void before(char const* operation, StorageIRI const& location) const override
    {
        announced.emplace_back(operation, location);
    }
};

TEST(ForwardingProvider, AnnouncesAnOperationByNameAndFirstLocation)
{
    CallLog log;
    Announcing const announcing(std::make_shared<RecordingProvider>(log));
    announcing.moveFile(iri, other, {});
    announcing.listFilesNamesOnly(other, u"*");
    EXPECT_EQ(announcing.announced,
              (std::vector<std::pair<std::string, StorageIRI>>{{"moveFile", iri}, {"listFilesNamesOnly", other}}));
}

class Elsewhere : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;

protected:
    StorageIRI translated(StorageIRI const& location) const override { return StorageIRI(location, u"inner"); }
};

TEST(ForwardingProvider, TranslatesEveryLocation)
{
    CallLog translated;
    Elsewhere const elsewhere(std::make_shared<RecordingProvider>(translated));
    elsewhere.removeFile(iri);
    elsewhere.moveFile(iri, other, {});
    CallLog expected;
    RecordingProvider const recording(expected);
    recording.removeFile(StorageIRI(iri, u"inner"));
    recording.moveFile(StorageIRI(iri, u"inner"), StorageIRI(other, u"inner"), {});
    EXPECT_EQ(translated, expected);
}

class Withholding : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;
    mutable std::vector<StorageIRI> withheld;

protected:
    std::unique_ptr<ByteStream> handOutStream(std::unique_ptr<ByteStream>, StorageIRI const& file) const override
    {
        withheld.push_back(file);
        throw std::runtime_error("withheld");
    }

    std::unique_ptr<TransactionalStream> handOutTransaction(std::unique_ptr<TransactionalStream>,
                                                            StorageIRI const& file) const override
    {
        withheld.push_back(file);
        return nullptr;
    }

    Listing list(char const*, ListingOperation, StorageIRI const& folder, std::u16string) const override
    {
        withheld.push_back(folder);
        return nullptr;
    }
};

TEST(ForwardingProvider, LetsADerivedClassHandOutOtherStreamsAndListings)
{
    CallLog log;
    Withholding const withholding(std::make_shared<RecordingProvider>(log, RecordingProvider::Untold::AnswersPlainly));
    EXPECT_THROW(withholding.openStream(iri, {}), std::runtime_error);
    EXPECT_THROW(withholding.openReadOnlyStream(other), std::runtime_error);
    EXPECT_EQ(withholding.openTransactionalStream(iri, {}), nullptr);
    EXPECT_EQ(withholding.listAll(iri), nullptr);
    EXPECT_EQ(withholding.listFilesNamesOnly(other, u"*"), nullptr);
    EXPECT_EQ(withholding.withheld, (std::vector<StorageIRI>{iri, other, iri, iri, other}));
}

TEST(ForwardingProvider, PassesTheFailuresOfItsTarget)
{
    CallLog log;
    auto const target = std::make_shared<RecordingProvider>(log);
    target->fail("doRemoveFile", std::runtime_error("broken"));
    EXPECT_THROW(ForwardingProvider(target).removeFile(iri), std::runtime_error);
}

} // namespace
} // namespace foundation::storage::conformance
