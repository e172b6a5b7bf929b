#include <storage/provider/IReadOnlyProvider.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/VectorListing.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <type_traits>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

static_assert(std::is_base_of_v<IProvider, IReadOnlyProvider>);
static_assert(std::is_abstract_v<IReadOnlyProvider>);
static_assert(sizeof(IReadOnlyProvider) == sizeof(void*));
static_assert(
    requires(IProvider * base) { static_cast<IReadOnlyProvider*>(base); }, "not a virtual base");

/// Supplies what a read-only provider must, and counts the questions.
class Shelf : public IReadOnlyProvider
{
public:
    mutable int questions = 0;

protected:
    bool doFileExists(StorageIRI const&) const override { return ++questions != 0; }
    bool doFolderExists(StorageIRI const&) const override { return ++questions != 0; }
    FileAttributes doGetFileAttributes(StorageIRI const&) const override { return FileAttributes(7, {}, false); }
    FolderAttributes doGetFolderAttributes(StorageIRI const&) const override { return FolderAttributes({}, false); }
    std::unique_ptr<ByteStream> doOpenReadOnlyStream(StorageIRI const&) const override
    {
        auto stream = std::make_unique<RecordingByteStream>();
        stream->onRead = readsFrom("text");
        return stream;
    }
    Listing doListAll(StorageIRI const&) const override { return list(); }
    Listing doListFiles(StorageIRI const&) const override { return list(); }
    Listing doListFolders(StorageIRI const&) const override { return list(); }

private:
    static Listing list()
    {
        return std::make_unique<VectorListing>(std::vector{FolderEntry(u"one", FolderEntry::EntryType::File)});
    }
};

StorageIRI const from(u"s://h/a/from");
StorageIRI const to(u"s://h/b/to");

struct Refusal
{
    char const* name;
    std::function<void(Shelf&)> call;
};

class IReadOnlyProviderRefusal : public testing::TestWithParam<Refusal>
{};

TEST_P(IReadOnlyProviderRefusal, NamesTheLocationAndAsksNothing)
{
    Shelf shelf;
    try {
        GetParam().call(shelf);
        FAIL() << "not refused";
    } catch (Exception const& error) {
        EXPECT_EQ(error.getErrorCode(), ErrorCode::ReadOnlyProvider);
        EXPECT_EQ(error.getStorageIRI(), from);
    }
    EXPECT_EQ(shelf.questions, 0);
}

ByteStreamOpenOptions withAccess(ByteStreamAccess access)
{
    return {access, ByteStreamCreate::NeverCreate, ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Append};
}

INSTANTIATE_TEST_SUITE_P(
    All, IReadOnlyProviderRefusal,
    testing::Values(
        Refusal{"createFile", [](Shelf& shelf) { shelf.createFile(from); }},
        Refusal{"createFolder", [](Shelf& shelf) { shelf.createFolder(from); }},
        Refusal{"createFolderRecursive", [](Shelf& shelf) { shelf.createFolderRecursive(from); }},
        Refusal{"removeFile", [](Shelf& shelf) { shelf.removeFile(from); }},
        Refusal{"moveFile", [](Shelf& shelf) { shelf.moveFile(from, to, ReplacementPolicy::Overwrite); }},
        Refusal{"removeFolder", [](Shelf& shelf) { shelf.removeFolder(from); }},
        Refusal{"removeFolderRecursively", [](Shelf& shelf) { shelf.removeFolderRecursively(from); }},
        Refusal{"moveFolder", [](Shelf& shelf) { shelf.moveFolder(from, to, ReplacementPolicy::Overwrite); }},
        Refusal{"openStreamWriteOnly",
                [](Shelf& shelf) { (void)shelf.openStream(from, withAccess(ByteStreamAccess::WriteOnly)); }},
        Refusal{"openStreamReadWrite",
                [](Shelf& shelf) { (void)shelf.openStream(from, withAccess(ByteStreamAccess::ReadWrite)); }},
        Refusal{"copyFile", [](Shelf& shelf) { shelf.copyFile(from, to, ReplacementPolicy::Overwrite); }},
        Refusal{"setLastModified", [](Shelf& shelf) { shelf.setLastModified(from, {}); }},
        Refusal{"setWritable", [](Shelf& shelf) { shelf.setWritable(from, true); }}),
    [](auto const& tested) { return std::string(tested.param.name); });

TEST(IReadOnlyProvider, QueriesListingsAndReadingWork)
{
    Shelf const shelf;
    EXPECT_TRUE(shelf.fileExists(from));
    EXPECT_TRUE(shelf.folderExists(from));
    EXPECT_EQ(shelf.getFileAttributes(from).getSize(), 7U);
    EXPECT_FALSE(shelf.getFolderAttributes(from).isWritable());
    EXPECT_EQ(shelf.listAll(from)->entry().getName(), u"one");
    EXPECT_EQ(shelf.listFilesNamesOnly(from, u"*")->entry().getName(), u"one");
    char buffer[8];
    EXPECT_EQ(shelf.openReadOnlyStream(from)->read(buffer, 8), 4);
}

TEST(IReadOnlyProvider, TransactionalStreamIsRefusedForItsScratchLocation)
{
    try {
        (void)Shelf().openTransactionalStream(from, {});
        FAIL() << "not refused";
    } catch (Exception const& error) {
        EXPECT_EQ(error.getErrorCode(), ErrorCode::ReadOnlyProvider);
        EXPECT_EQ(error.getStorageIRI().getParent(), from.getParent());
        EXPECT_TRUE(error.getStorageIRI().getName().ends_with(u".tmp.bak"));
    }
}

TEST(IReadOnlyProvider, AtomicCopyAndRecursiveListingAreUnsupported)
{
    auto const codeOf = [](auto const& call) {
        try {
            call();
        } catch (Exception const& error) {
            EXPECT_EQ(error.getStorageIRI(), from);
            return error.getErrorCode();
        }
        return ErrorCode::Unknown;
    };
    Shelf const shelf;
    EXPECT_EQ(codeOf([&] { (void)shelf.copyFileAtomic(from, to, ReplacementPolicy::Overwrite, {}); }),
              ErrorCode::UnsupportedOperation);
    EXPECT_EQ(codeOf([&] { (void)shelf.listAllRecursive(from); }), ErrorCode::UnsupportedOperation);
}

template <typename Class, typename Result, typename... Arguments>
constexpr bool isOwn(Result (Class::*)(Arguments...) const)
{
    return std::is_same_v<Class, IReadOnlyProvider>;
}

template <typename Class>
constexpr bool isOwn(void (Class::*)())
{
    return std::is_same_v<Class, IReadOnlyProvider>;
}

// Twelve operations are refused, and no other is touched.
struct Opened : IReadOnlyProvider
{
    static_assert(isOwn(&Opened::doCreateFile) && isOwn(&Opened::doCreateFolder) &&
                  isOwn(&Opened::doCreateFolderRecursive) && isOwn(&Opened::doRemoveFile) &&
                  isOwn(&Opened::doMoveFile) && isOwn(&Opened::doRemoveFolder) &&
                  isOwn(&Opened::doRemoveFolderRecursively) && isOwn(&Opened::doMoveFolder) &&
                  isOwn(&Opened::doOpenStream) && isOwn(&Opened::doCopyFile) && isOwn(&Opened::doSetLastModified) &&
                  isOwn(&Opened::doSetWritable));
    static_assert(!isOwn(&Opened::doFileExists) && !isOwn(&Opened::doFolderExists) &&
                  !isOwn(&Opened::doGetFileAttributes) && !isOwn(&Opened::doGetFolderAttributes) &&
                  !isOwn(&Opened::doOpenReadOnlyStream) && !isOwn(&Opened::doOpenTransactionalStream) &&
                  !isOwn(&Opened::doOpenTransactionalStreamAtScratchLocation) && !isOwn(&Opened::doListAll) &&
                  !isOwn(&Opened::doListAllWildcards) && !isOwn(&Opened::doListFiles) &&
                  !isOwn(&Opened::doListFilesWildcards) && !isOwn(&Opened::doListFolders) &&
                  !isOwn(&Opened::doListFoldersWildcards) && !isOwn(&Opened::doListAllNamesOnly) &&
                  !isOwn(&Opened::doListAllNamesOnlyWildcards) && !isOwn(&Opened::doListFoldersNamesOnly) &&
                  !isOwn(&Opened::doListFoldersNamesOnlyWildcards) && !isOwn(&Opened::doListFilesNamesOnly) &&
                  !isOwn(&Opened::doListFilesNamesOnlyWildcards) && !isOwn(&Opened::doListAllRecursive) &&
                  !isOwn(&Opened::doListAllRecursiveWildcards) && !isOwn(&Opened::doListAllRecursiveNamesOnly) &&
                  !isOwn(&Opened::doListAllRecursiveNamesOnlyWildcards) && !isOwn(&Opened::doCopyFileAtomic) &&
                  !isOwn(&Opened::doPublishFolderEventsFor) && !isOwn(&Opened::doPublishFileEventsFor) &&
                  !isOwn(&Opened::doStopPublishingEventsFor) && !isOwn(&Opened::doHasFeature) &&
                  !isOwn(&Opened::doGetPathComparator) && !isOwn(&Opened::doGetCanonicalLocation) &&
                  !isOwn(&Opened::doGetFilenameSensitivity) && !isOwn(&Opened::doShutdown) &&
                  !isOwn(&Opened::doExists) && !isOwn(&Opened::doExistsExtended) &&
                  !isOwn(&Opened::doGetExtendedAttributes));
    using IReadOnlyProvider::doGetExtendedAttributes;
    virtual void next() const;
};

TEST(IReadOnlyProvider, AddsNoVirtualOperation)
{
    EXPECT_EQ(slotOf(&Opened::next), slotOf(&Opened::doGetExtendedAttributes) + 1);
}

} // namespace
} // namespace foundation::storage::provider
