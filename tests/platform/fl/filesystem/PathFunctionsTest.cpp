#include <fl/filesystem/path_functions.hpp>

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <string>
#include <vector>

#include <fl/filesystem/upath.hpp>

namespace fl::filesystem::detail {
namespace {

std::u16string const longName(100000, u'x');

struct Row
{
    std::u16string path;
    std::u16string root;
    std::u16string parent;
    std::u16string filename;
};

std::vector<Row> const table = {
    {u"", u"", u"", u""},
    {u"/", u"/", u"", u"/"},
    {u"//", u"//", u"", u"/"},
    {u"a", u"", u"", u"a"},
    {u"a/", u"", u"", u"a"},
    {u"a/b", u"", u"a", u"b"},
    {u"a//b", u"", u"a", u"b"},
    {u"/a", u"/", u"/", u"a"},
    {u"/a/", u"/", u"/", u"a"},
    {u"//a", u"//", u"//", u"a"},
    {u"/a/b", u"/", u"/a", u"b"},
    {u"/a/b/", u"/", u"/a", u"b"},
    {u"/a/b//", u"/", u"/a", u"b"},
    {u"/a//b", u"/", u"/a", u"b"},
    {u"/a/b/c", u"/", u"/a/b", u"c"},
    {u".", u"", u"", u"."},
    {u"..", u"", u"", u".."},
    {u"/.", u"/", u"/", u"."},
    {u"/..", u"/", u"/", u".."},
    {u"/a/.", u"/", u"/a", u"."},
    {u"/a/../b", u"/", u"/a/..", u"b"},
    {u"a\\b", u"", u"", u"a\\b"},
    {u"/a b/\u4E2D\U0001F4C1", u"/", u"/a b", u"\u4E2D\U0001F4C1"},
    {u"/" + longName, u"/", u"/", longName},
    {u"/" + longName + u"/" + longName, u"/", u"/" + longName, longName},
};

struct Step
{
    std::u16string path;
    std::u16string first;
    std::u16string rest;
};

TEST(PathFunctions, ExtractsRootParentAndFilename)
{
    for (auto const& [path, root, parent, filename] : table) {
        EXPECT_EQ(extract_root_path(path), root);
        EXPECT_EQ(get_root_path_length(path), root.size());
        EXPECT_EQ(extract_parent_path(path), parent);
        EXPECT_EQ(extract_filename(path), filename);
    }
}

TEST(PathFunctions, AbsolutePathsAreThoseWithARoot)
{
    for (auto const& row : table) {
        EXPECT_EQ(is_absolute(row.path), !row.root.empty());
    }
}

TEST(PathFunctions, NativeAndGenericFormAreTheText)
{
    for (auto const& row : table) {
        EXPECT_EQ(make_native_form(row.path), row.path);
        EXPECT_EQ(make_native_form(row.path, true), row.path);
        EXPECT_EQ(make_native_form(row.path, false), row.path);
        EXPECT_EQ(make_generic_form(row.path), row.path);
    }
}

TEST(PathFunctions, WalksElementByElement)
{
    for (auto const& [path, first, rest] : std::vector<Step>{
             {u"", u"", u""},
             {u"a", u"a", u""},
             {u"a/", u"a", u""},
             {u"a//", u"a", u""},
             {u"a/b", u"a", u"b"},
             {u"a//b", u"a", u"b"},
             {u"a/b/c", u"a", u"b/c"},
             {u"a/b/", u"a", u"b/"},
             {u"./..", u".", u".."},
             {u"/a/b", u"a", u"b"},
             {u"/", u"", u""},
             {longName + u"/" + longName, longName, longName},
         })
    {
        EXPECT_EQ(extract_first_element(path), first);
        EXPECT_EQ(move_down(path), rest);
    }
}

TEST(PathFunctions, SeparatorConstantIsText)
{
    std::u16string const separator = upath_constant::GENERIC_PATHNAME_SEPARATOR;
    EXPECT_EQ(separator, u"/");
}

rc::Gen<std::u16string> anyPath()
{
    return rc::gen::container<std::u16string>(rc::gen::element(u'/', u'.', u'a', u'b'));
}

RC_GTEST_PROP(PathFunctions, ParentAndFilenameMakeUpThePath, ())
{
    upath const path(*anyPath());
    std::u16string const parent = extract_parent_path(path.string());
    std::u16string const filename = extract_filename(path.string());
    RC_ASSERT(upath(parent.empty() ? filename : parent + u"/" + filename) == path);
}

RC_GTEST_PROP(PathFunctions, RootAndElementsMakeUpThePath, ())
{
    upath const path(*anyPath());
    std::u16string built = extract_root_path(path.string());
    std::u16string rest = path.string().substr(get_root_path_length(path.string()));
    for (; !rest.empty(); rest = move_down(rest)) {
        built += extract_first_element(rest) + u"/";
    }
    RC_ASSERT(upath(built) == path);
}

RC_GTEST_PROP(PathFunctions, APathIsItsRootExactlyWhenItHasNoElement, ())
{
    std::u16string const path = *anyPath();
    bool const isRoot = extract_root_path(path) == path;
    RC_ASSERT(isRoot == (path.find_first_not_of(u'/') == std::u16string::npos));
}

} // namespace
} // namespace fl::filesystem::detail
