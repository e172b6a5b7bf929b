#include <storage/provider/StorageIRI.hpp>

#include <tests/support/allocations.hpp>

#include <gtest/gtest.h>

#include <cstddef>
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
