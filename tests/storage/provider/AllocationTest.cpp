#include <storage/provider/StorageIRI.hpp>

#include <storage/provider/StorageItem.hpp>
#include <tests/support/RecordingByteStream.hpp>
#include <tests/support/RecordingProvider.hpp>
#include <tests/support/allocations.hpp>

#include <gtest/gtest.h>

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::provider {
namespace {

using tests::support::allocationsOf;

/// Names that do not fit into a string object itself.
std::vector<StorageIRI> locations()
{
    return {StorageIRI(u"scheme://host.example/a-folder-with-a-long-name/a-file-with-a-long-name.txt"),
            StorageIRI(StorageIRI(u"scheme://host.example/a-folder-with-a-long-name"), u"a child with a long name.txt"),
            StorageIRI(u"scheme://host.example/a-folder-with-a-long-name/./a-folder/../a-file.txt").getParent(),
            StorageIRI(u"a-scheme", fl::filesystem::upath(u"/a-folder-with-a-long-name/a-file-with-a-long-name.txt")),
            StorageIRI(u"a-scheme", fl::filesystem::upath(u"/a-folder-with-a-long-name/b-file-with-a-long-name.txt")),
            StorageIRI(u"zip:scheme://host.example/a-container.zip!/a-folder-with-a-long-name/a-file.txt"),
            StorageIRI(u"zip", StorageIRI(u"scheme://host.example/a-container.zip"), u"/a folder with a long name/a")};
}

TEST(Allocation, IsCountedInsideTheLibraryToo)
{
    StorageIRI const location(u"scheme://host.example/a-folder-with-a-long-name");
    EXPECT_GT(allocationsOf([&] { static_cast<void>(location.toString()); }), 0u);
    EXPECT_GT(allocationsOf([&] { static_cast<void>(location.getHost()); }), 0u);
}

TEST(Allocation, RepeatedQueryThatAnswersAReferenceNeedsNone)
{
    for (StorageIRI const& location : locations()) {
        auto const askAll = [&] {
            static_cast<void>(location.getPath());
            static_cast<void>(location.getName());
            static_cast<void>(location.toString());
            static_cast<void>(location.getResolvedPath());
        };
        EXPECT_GT(allocationsOf(askAll), 0u) << location;
        EXPECT_EQ(allocationsOf(askAll), 0u) << location;
    }
}

TEST(Allocation, ComparisonAndHashOfComputedTextsNeedNone)
{
    auto const some = locations();
    for (StorageIRI const& location : some)
        static_cast<void>(location.toString());
    StorageIRI const equal(some.front().toString());
    static_cast<void>(equal.toString());
    std::size_t result = 0;
    EXPECT_EQ(allocationsOf([&] {
                  for (StorageIRI const& left : some)
                      for (StorageIRI const& right : some)
                          result += left.hashValue() + (left == right ? 1U : 2U) + (left != right ? 1U : 2U) +
                                    (left < right ? 1U : 2U);
                  result += equal == some.front() ? 1U : 2U;
              }),
              0u)
        << result;
}

TEST(Allocation, CopyAndRepeatedQueryForARelativeNeedNone)
{
    for (StorageIRI const& location : locations()) {
        static_cast<void>(location.getParent());
        EXPECT_EQ(allocationsOf([&] {
                      StorageIRI const copy = location;
                      StorageIRI const parent = copy.getParent();
                      static_cast<void>(parent.isOpaque() || parent.hasInnerIRI());
                  }),
                  0u);
        static_cast<void>(location.getPath());
        EXPECT_EQ(allocationsOf([&] { static_cast<void>(location.hasParent()); }), 0u);
    }
}

std::size_t allocationsOfCopyInChunks(int chunks, TransactionPolicy policy)
{
    tests::support::CallLog log;
    auto const source = std::make_shared<tests::support::RecordingProvider>(log);
    auto const target = std::make_shared<tests::support::RecordingProvider>(log);
    source->when("doOpenReadOnlyStream", [chunks]() -> std::unique_ptr<ByteStream> {
        auto stream = std::make_unique<tests::support::RecordingByteStream>();
        stream->onRead = [left = chunks](char*, long count) mutable { return left-- > 0 ? count : -1L; };
        return stream;
    });
    StorageItem const from(source, locations().front());
    StorageItem const to(target, locations().front());
    CopyFileOptions const options{ReplacementPolicy::Overwrite, policy, [] { return InterruptSignal::Continue; }};
    return allocationsOf([&] { from.copyFile(to, options); });
}

TEST(Allocation, CopyBetweenItemsNeedsOneBufferHoweverManyChunksThereAre)
{
    for (TransactionPolicy const policy : {TransactionPolicy::Atomic, TransactionPolicy::NonAtomic})
        EXPECT_EQ(allocationsOfCopyInChunks(1, policy), allocationsOfCopyInChunks(5, policy));
}

TEST(Allocation, PathViewNeedsNone)
{
    StorageIRI const location = locations().front();
    static_cast<void>(location.getPath());
    std::size_t units = 0;
    EXPECT_EQ(allocationsOf([&] {
                  PathView const view = location.getPathView();
                  for (u16string_view const component : view)
                      units += component.size();
                  units += view.hasParent() ? 1U : 0U;
                  units += view.getParentView().toStringView().size();
                  units += view.getFilenameStringView().size();
              }),
              0u);
    EXPECT_GT(units, 0u);
}

} // namespace
} // namespace foundation::storage::provider
