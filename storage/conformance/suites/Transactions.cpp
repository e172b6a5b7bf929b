#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/provider/ByteStreamDevice.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/StreamClosePolicy.hpp>

#include <memory>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr ByteStreamOpenOptions replaceContent{ByteStreamAccess::ReadWrite, ByteStreamCreate::Create,
                                               ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite};

using Transaction = std::unique_ptr<TransactionalStream>;

/// A transaction that has written everything and is not closed.
Transaction begin(Scene const& scene, std::u16string const& path, std::string_view content)
{
    Transaction transaction = scene.provider().openTransactionalStream(scene.iri(path), replaceContent);
    writeAll(*transaction->byteStream(), content);
    return transaction;
}

void commitMakesAMissingFile(Harness const& harness)
{
    std::string const content = someContent(1500001);
    Scene const scene(harness, {{u"other", "other"}});
    Transaction const transaction = begin(scene, u"file", content);
    EXPECT_FALSE(scene.provider().fileExists(scene.iri(u"file")));
    transaction->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(scene.holds({{u"file", content}, {u"other", "other"}}));
}

void commitReplacesTheContentWhole(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old, and longer than the new content"}});
    Transaction const transaction = begin(scene, u"file", "new");
    EXPECT_EQ(scene.read(u"file"), "old, and longer than the new content");
    transaction->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(scene.holds({{u"file", "new"}}));
}

void commitOfNothingLeavesAnEmptyFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old"}});
    begin(scene, u"file", "")->close(StreamClosePolicy::Commit);
    begin(scene, u"new", "")->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(scene.holds({{u"file", ""}, {u"new", ""}}));
}

void commitReplacesWhateverTheOptionsSay(Harness const& harness)
{
    Scene const scene(harness);
    for (auto const access : {ByteStreamAccess::WriteOnly, ByteStreamAccess::ReadWrite})
        for (auto const truncate : {ByteStreamTruncate::TruncateExisting, ByteStreamTruncate::PreserveExisting})
            for (auto const append : {ByteStreamAppend::Append, ByteStreamAppend::Overwrite}) {
                ByteStreamOpenOptions const options{access, ByteStreamCreate::Create, truncate, append};
                SCOPED_TRACE(testing::Message() << options);
                scene.write(u"file", "old");
                Transaction const transaction = scene.provider().openTransactionalStream(scene.iri(u"file"), options);
                writeAll(*transaction->byteStream(), "XY");
                transaction->close(StreamClosePolicy::Commit);
                EXPECT_TRUE(scene.holds({{u"file", "XY"}}));
            }
}

void abortChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old"}});
    for (auto const* const path : {u"file", u"new"}) {
        begin(scene, path, "unwanted")->close(StreamClosePolicy::Abort);
        EXPECT_TRUE(scene.holds({{u"file", "old"}}));
    }
}

void droppingChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old"}});
    for (auto const* const path : {u"file", u"new"}) {
        begin(scene, path, "unwanted").reset();
        EXPECT_TRUE(scene.holds({{u"file", "old"}}));
    }
}

void anExceptionChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old"}});
    auto const interrupted = [&] {
        Transaction const transaction = begin(scene, u"file", "unwanted");
        throw std::runtime_error("the writer gives up");
    };
    EXPECT_THROW(interrupted(), std::runtime_error);
    EXPECT_TRUE(scene.holds({{u"file", "old"}}));
}

void theFirstCloseDecides(Harness const& harness)
{
    Scene const scene(harness, {{u"committed", "old"}, {u"aborted", "old"}});
    Transaction const committed = begin(scene, u"committed", "new");
    committed->close(StreamClosePolicy::Commit);
    committed->close(StreamClosePolicy::Abort);
    Transaction const aborted = begin(scene, u"aborted", "new");
    aborted->close(StreamClosePolicy::Abort);
    aborted->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(scene.holds({{u"committed", "new"}, {u"aborted", "old"}}));
}

void whatIsWrittenCanBeReadBack(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old"}});
    Transaction const transaction = begin(scene, u"file", "0123456789");
    EXPECT_EQ(transaction->seek(4, std::ios_base::beg), 4);
    EXPECT_EQ(transaction->write("ab", 2), 2);
    EXPECT_EQ(transaction->seek(0, std::ios_base::beg), 0);
    EXPECT_EQ(readAll(*transaction->byteStream()), "0123ab6789");
    transaction->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(scene.holds({{u"file", "0123ab6789"}}));
}

void theByteStreamIsAlwaysTheSame(Harness const& harness)
{
    Scene const scene(harness);
    Transaction const transaction = begin(scene, u"file", "content");
    ByteStream* const stream = transaction->byteStream();
    EXPECT_EQ(transaction->byteStream(), stream);
    transaction->close(StreamClosePolicy::Abort);
    EXPECT_EQ(transaction->byteStream(), stream);
}

void aDeviceCommitsWhenItIsClosed(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old"}});
    Transaction transaction = begin(scene, u"file", "new");
    TransactionalStreamDevice const device(transaction);
    device.close();
    EXPECT_TRUE(scene.holds({{u"file", "new"}}));
}

void twoAtOnceDoNotMix(Harness const& harness)
{
    for (bool const inOrder : {true, false}) {
        Scene const scene(harness, {{u"file", "old"}});
        Transaction first = begin(scene, u"file", "first");
        Transaction second = begin(scene, u"file", "second");
        writeAll(*first->byteStream(), " more");
        (inOrder ? first : second)->close(StreamClosePolicy::Commit);
        EXPECT_EQ(scene.read(u"file"), inOrder ? "first more" : "second");
        (inOrder ? second : first)->close(StreamClosePolicy::Commit);
        EXPECT_TRUE(scene.holds({{u"file", inOrder ? "second" : "first more"}}));
    }
}

void oneAbortsWhileAnotherCommits(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "old"}});
    Transaction const first = begin(scene, u"file", "first");
    Transaction const second = begin(scene, u"file", "second");
    second->close(StreamClosePolicy::Commit);
    first->close(StreamClosePolicy::Abort);
    EXPECT_TRUE(scene.holds({{u"file", "second"}}));
}

void aReaderKeepsTheContentThatItOpened(Harness const& harness)
{
    std::string const old = someContent(300000, 2);
    Scene const scene(harness, {{u"file", old}});
    auto const reader = scene.provider().openReadOnlyStream(scene.iri(u"file"));
    std::string read(1000, '\0');
    ASSERT_EQ(reader->read(read.data(), 1000), 1000);
    begin(scene, u"file", someContent(300000, 3))->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(read + readAll(*reader) == old) << "content of two states was mixed";
}

void aFailedCommitCanBeTriedAgain(Harness const& harness)
{
    Scene const scene(harness);
    StorageIRI const file = scene.iri(u"file");
    Transaction const transaction = begin(scene, u"file", "content");
    scene.provider().createFolder(file);
    EXPECT_TRUE(fails([&] { transaction->close(StreamClosePolicy::Commit); }, ErrorCode::ResourceAlreadyExists, file));
    EXPECT_TRUE(scene.provider().folderExists(file));
    scene.provider().removeFolder(file);
    transaction->close(StreamClosePolicy::Commit);
    EXPECT_TRUE(scene.holds({{u"file", "content"}}));
}

void aFailedCommitCanBeAborted(Harness const& harness)
{
    for (bool const drop : {false, true}) {
        Scene const scene(harness);
        Transaction transaction = begin(scene, u"file", "content");
        scene.provider().createFolder(scene.iri(u"file"));
        EXPECT_TRUE(fails([&] { transaction->close(StreamClosePolicy::Commit); }, ErrorCode::ResourceAlreadyExists,
                          scene.iri(u"file")));
        if (!drop)
            transaction->close(StreamClosePolicy::Abort);
        transaction.reset();
        EXPECT_TRUE(scene.holds({{u"file/", ""}}));
    }
}

/// It fails where the scratch file would have to stand, beside the target, or at the target itself.
void theTargetNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"other", "other"}});
    for (auto const* const path : {u"missing/file", u"other/file"}) {
        try {
            scene.provider().openTransactionalStream(scene.iri(path), replaceContent);
            ADD_FAILURE() << "opened below what is no folder";
        } catch (Exception const& error) {
            EXPECT_EQ(error.getErrorCode(), ErrorCode::ResourceNotFound);
            EXPECT_EQ(error.getStorageIRI().getParent(), scene.iri(path).getParent());
        }
        EXPECT_TRUE(scene.holds({{u"other", "other"}}));
    }
}

} // namespace

std::vector<Check> transactionChecks()
{
    return Family("Transactions")
        .forWritable({
            CHECK_FUNCTION(commitMakesAMissingFile),
            CHECK_FUNCTION(commitReplacesTheContentWhole),
            CHECK_FUNCTION(commitOfNothingLeavesAnEmptyFile),
            CHECK_FUNCTION(commitReplacesWhateverTheOptionsSay),
            CHECK_FUNCTION(abortChangesNothing),
            CHECK_FUNCTION(droppingChangesNothing),
            CHECK_FUNCTION(anExceptionChangesNothing),
            CHECK_FUNCTION(theFirstCloseDecides),
            CHECK_FUNCTION(whatIsWrittenCanBeReadBack),
            CHECK_FUNCTION(theByteStreamIsAlwaysTheSame),
            CHECK_FUNCTION(aDeviceCommitsWhenItIsClosed),
            CHECK_FUNCTION(twoAtOnceDoNotMix),
            CHECK_FUNCTION(oneAbortsWhileAnotherCommits),
            CHECK_FUNCTION(aReaderKeepsTheContentThatItOpened),
            CHECK_FUNCTION(aFailedCommitCanBeTriedAgain),
            CHECK_FUNCTION(aFailedCommitCanBeAborted),
            CHECK_FUNCTION(theTargetNeedsAFolderToStandIn),
        })
        .checks();
}

} // namespace foundation::storage::conformance::detail
