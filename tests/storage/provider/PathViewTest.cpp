#include <storage/provider/PathView.hpp>

#include <gtest/gtest.h>

#include <boost/iterator/iterator_categories.hpp>

#include <iterator>
#include <string>
#include <type_traits>
#include <vector>

namespace foundation::storage::provider {
namespace {

std::u16string copyOf(u16string_view view)
{
    return std::u16string(view.data(), view.size());
}

std::vector<std::u16string> componentsOf(std::u16string const& path)
{
    std::vector<std::u16string> components;
    for (u16string_view const component : PathView(path))
        components.push_back(copyOf(component));
    return components;
}

TEST(PathView, IsEmptyByDefault)
{
    PathView const view;
    EXPECT_EQ(view.toStringView().data(), nullptr);
    EXPECT_EQ(view.toStringView().size(), 0u);
    EXPECT_EQ(view.toStringCopy(), u"");
    EXPECT_FALSE(view.hasParent());
    EXPECT_EQ(view.getParentCopy(), u"");
    EXPECT_EQ(view.getFilenameCopy(), u"");
    EXPECT_TRUE(view.begin() == view.end());
}

TEST(PathView, ViewsAreThoseOfBoost)
{
    EXPECT_TRUE((std::is_same_v<u16string_view, boost::basic_string_view<char16_t>>));
}

TEST(PathView, IsMadeFromTextExplicitly)
{
    EXPECT_FALSE((std::is_convertible_v<u16string_view, PathView>));
    EXPECT_FALSE((std::is_convertible_v<u16string_view, PathViewIterator>));
}

TEST(PathView, IsASmallValue)
{
    EXPECT_EQ(sizeof(PathView), 2 * sizeof(void*));
    EXPECT_EQ(sizeof(PathViewIterator), 5 * sizeof(void*));
    EXPECT_TRUE(std::is_trivially_copyable_v<PathView>);
    EXPECT_TRUE(std::is_trivially_copyable_v<PathViewIterator>);
}

TEST(PathView, LooksAtTheTextItWasGiven)
{
    std::u16string const path = u"/a/b";
    EXPECT_EQ(PathView(path).toStringView().data(), path.data());
    EXPECT_EQ(PathView(path).getParentView().toStringView().data(), path.data());
    EXPECT_EQ(PathView(path).getFilenameStringView().data(), path.data() + 3);
    EXPECT_EQ((*PathView(path).begin()).data(), path.data() + 1);
}

TEST(PathView, DropsTwoCodeUnitsAtATrailingSlash)
{
    struct Row
    {
        std::u16string path;
        std::u16string viewed;
    };
    for (auto const& [path, viewed] : std::vector<Row>{
             {u"", u""},
             {u"/", u"/"},
             {u"a", u"a"},
             {u"/a/b", u"/a/b"},
             {u"/a/b/", u"/a/"},
             {u"//a//", u"//a"},
             {u"a/", u""},
             {u"//", u""},
             {u"/ab/", u"/a"},
             {u"/a%2F", u"/a%2F"},
             {u"/a\\", u"/a\\"},
         })
    {
        EXPECT_EQ(PathView(path).toStringCopy(), viewed);
        EXPECT_EQ(copyOf(PathView(path).toStringView()), viewed);
    }
}

TEST(PathView, HasAParentWhenItHoldsASlashAndIsNotTheRoot)
{
    for (std::u16string const path : {u"/a", u"/a/b", u"a/b", u"//a", u"/a/b/"})
        EXPECT_TRUE(PathView(path).hasParent());
    for (std::u16string const path : {u"", u"/", u"a", u"a\\b", u"a%2Fb"})
        EXPECT_FALSE(PathView(path).hasParent());
}

TEST(PathView, ParentIsWhatStandsBeforeTheLastSlash)
{
    struct Row
    {
        std::u16string path;
        std::u16string parent;
    };
    for (auto const& [path, parent] : std::vector<Row>{
             {u"", u""},
             {u"/", u""},
             {u"a", u""},
             {u"/a", u"/"},
             {u"/a/b", u"/a"},
             {u"/a/b/c", u"/a/b"},
             {u"a/b", u"a"},
             {u"a//b", u""},
             {u"/a//b", u"/"},
             {u"/ab//c", u"/a"},
             {u"//a", u"/"},
             {u"/a/b/", u"/a"},
         })
    {
        EXPECT_EQ(PathView(path).getParentView().toStringCopy(), parent);
        EXPECT_EQ(PathView(path).getParentCopy(), parent);
    }
}

TEST(PathView, FileNameFollowsTheLastSlash)
{
    struct Row
    {
        std::u16string path;
        std::u16string name;
    };
    for (auto const& [path, name] : std::vector<Row>{
             {u"", u""},
             {u"/", u"/"},
             {u"a", u"a"},
             {u"b", u"b"},
             {u"/a", u"a"},
             {u"/a/b", u"b"},
             {u"a/b c", u"b c"},
             {u"/a//b", u"b"},
         })
    {
        EXPECT_EQ(copyOf(PathView(path).getFilenameStringView()), name);
        EXPECT_EQ(PathView(path).getFilenameCopy(), name);
    }
}

TEST(PathView, FileNameRunsToTheNulBeyondTheView)
{
    std::u16string const shortened = u"/a/b/";
    EXPECT_EQ(copyOf(PathView(shortened).getFilenameStringView()), u"b/");
    EXPECT_EQ(PathView(shortened).getFilenameCopy(), u"b/");

    std::u16string const longer = u"/a/bcd/e";
    EXPECT_EQ(PathView(u16string_view(longer).substr(0, 4)).getFilenameCopy(), u"bcd/e");
    EXPECT_EQ(PathView(longer).getParentView().getFilenameCopy(), u"bcd/e");
}

TEST(PathView, FileNameEndsAtANulInsideTheView)
{
    std::u16string const path(u"/a/b\0c", 6);
    EXPECT_EQ(PathView(path).getFilenameCopy(), u"b");
}

TEST(PathView, FileNameWithoutASlashIsTheWholeView)
{
    std::u16string const path(u"b\0c", 3);
    EXPECT_EQ(PathView(path).getFilenameCopy(), path);
}

TEST(PathView, WalksItsComponents)
{
    using Components = std::vector<std::u16string>;
    EXPECT_EQ(componentsOf(u"/a/b"), (Components{u"a", u"b"}));
    EXPECT_EQ(componentsOf(u"a/b"), (Components{u"a", u"b"}));
    EXPECT_EQ(componentsOf(u"/a b/%2F/\u00E9"), (Components{u"a b", u"%2F", u"\u00E9"}));
    EXPECT_EQ(componentsOf(u"/"), Components());
    EXPECT_EQ(componentsOf(u""), Components());
}

TEST(PathView, WalkStopsAtAnEmptyComponent)
{
    using Components = std::vector<std::u16string>;
    EXPECT_EQ(componentsOf(u"a//b"), Components{u"a"});
    EXPECT_EQ(componentsOf(u"/a//b/c"), Components{u"a"});
    EXPECT_EQ(componentsOf(u"//a"), Components());
}

TEST(PathView, ConstantIteratorsAreTheSame)
{
    std::u16string const path = u"/a/b";
    PathView const view(path);
    EXPECT_TRUE(view.cbegin() == view.begin());
    EXPECT_TRUE(view.cend() == view.end());
    EXPECT_EQ(std::distance(view.cbegin(), view.cend()), 2);
}

TEST(PathViewIterator, IsAForwardIterator)
{
    using Traits = std::iterator_traits<PathViewIterator>;
    EXPECT_TRUE((std::is_same_v<Traits::value_type, u16string_view>));
    EXPECT_TRUE((std::is_same_v<Traits::reference, u16string_view>));
    using Traversal = boost::iterator_traversal<PathViewIterator>::type;
    EXPECT_TRUE((std::is_convertible_v<Traversal, boost::forward_traversal_tag>));
    EXPECT_FALSE((std::is_convertible_v<Traversal, boost::bidirectional_traversal_tag>));
    std::u16string const path = u"/a/b";
    PathViewIterator first{u16string_view(path)};
    PathViewIterator const before = first++;
    EXPECT_EQ(copyOf(*before), u"a");
    EXPECT_EQ(copyOf(*first), u"b");
    EXPECT_EQ(first->size(), 1u);
}

TEST(PathViewIterator, ByDefaultIsTheEnd)
{
    std::u16string const path = u"/a";
    EXPECT_TRUE(PathViewIterator() == PathView(path).end());
    EXPECT_EQ((*PathViewIterator()).data(), nullptr);
}

TEST(PathViewIterator, StandsOnNothingAfterTheLastComponent)
{
    std::u16string const path = u"/a";
    PathViewIterator iterator{u16string_view(path)};
    ++iterator;
    EXPECT_TRUE(iterator == PathViewIterator());
    EXPECT_EQ((*iterator).data(), nullptr);
    ++iterator;
    EXPECT_TRUE(iterator == PathViewIterator());
}

TEST(PathViewIterator, GoesOnBehindAnEmptyComponentWhenAskedTo)
{
    std::u16string const path = u"a//b";
    PathViewIterator iterator{u16string_view(path)};
    ++iterator;
    EXPECT_TRUE(iterator == PathViewIterator());
    ++iterator;
    EXPECT_EQ(copyOf(*iterator), u"b");
}

TEST(PathViewIterator, TrailingSlashBeginsNoComponent)
{
    std::u16string const path = u"/ab/";
    PathViewIterator iterator{u16string_view(path)};
    EXPECT_EQ(copyOf(*iterator), u"ab");
    ++iterator;
    EXPECT_TRUE(iterator == PathViewIterator());
}

TEST(PathViewIterator, ComparesTheTextOfComponentsAndNotTheirPlace)
{
    std::u16string const path = u"/a/b/a";
    PathViewIterator const first{u16string_view(path)};
    PathViewIterator const second = std::next(first);
    PathViewIterator const third = std::next(second);
    EXPECT_TRUE(first == first);
    EXPECT_FALSE(first == second);
    EXPECT_TRUE(first != second);
    EXPECT_TRUE(first == third);
    std::u16string const other = u"a/z";
    EXPECT_TRUE(first == PathViewIterator(u16string_view(other)));
    std::u16string const longer = u"ab";
    EXPECT_FALSE(first == PathViewIterator(u16string_view(longer)));
}

} // namespace
} // namespace foundation::storage::provider
