#include <storage/provider/detail/StorageIRIImpl.hpp>

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <type_traits>
#include <utility>

#include <tests/support/slotOf.hpp>

namespace foundation::storage::provider::detail {
namespace {

using tests::support::slotOf;

/// Has a text and a path, and nothing else.
class Bare : public StorageIRIImpl
{
public:
    Bare(std::u16string text, std::u16string path) : text_(std::move(text)), path_(std::move(path)) {}

    std::u16string getScheme() const override { return {}; }
    std::shared_ptr<StorageIRIImpl> const& getParent() const override { return parent_; }
    bool hasParent() const override { return false; }
    std::shared_ptr<StorageIRIImpl> getRoot() const override { return nullptr; }
    bool hasPath() const override { return false; }
    std::u16string const& getPath() const override
    {
        ++pathsAsked;
        return path_;
    }
    std::u16string const& getName() const override { return path_; }
    std::u16string const& toString() const override { return text_; }
    std::u16string getHost() const override { return {}; }
    bool hasHost() const override { return false; }
    bool isOpaque() const override { return false; }
    network::IRI toIRI() const override { return network::IRI(text_); }
    bool hasInnerIRI() const override { return false; }
    std::shared_ptr<StorageIRIImpl> getInnerIRI() const override { return nullptr; }
    fl::filesystem::upath toUPath() const override { return {}; }
    std::shared_ptr<StorageIRIImpl> withPath(std::u16string const&) const override { return nullptr; }

    mutable int pathsAsked = 0;

private:
    std::u16string text_;
    std::u16string path_;
    std::shared_ptr<StorageIRIImpl> parent_;
};

std::u16string resolved(std::u16string const& path)
{
    return Bare(u"", path).getResolvedPath();
}

TEST(StorageIRIImpl, VirtualFunctionsStandInTheOrderOfTheContract)
{
    EXPECT_EQ(slotOf(&StorageIRIImpl::equals), 0u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::less), 1u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::getScheme), 2u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::getParent), 3u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::hasParent), 4u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::getRoot), 5u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::hasPath), 6u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::getPath), 7u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::getName), 8u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::toString), 9u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::getHost), 10u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::hasHost), 11u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::isOpaque), 12u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::toIRI), 13u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::hasInnerIRI), 14u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::getInnerIRI), 15u);
    EXPECT_EQ(slotOf(&StorageIRIImpl::toUPath), 16u);
    // The complete and the deleting destructor take slots 17 and 18.
    EXPECT_EQ(slotOf(&StorageIRIImpl::withPath), 19u);
}

TEST(StorageIRIImpl, IsNeitherCopiedNorMoved)
{
    EXPECT_FALSE(std::is_copy_constructible_v<Bare>);
    EXPECT_FALSE(std::is_move_constructible_v<Bare>);
    EXPECT_FALSE(std::is_copy_assignable_v<Bare>);
}

TEST(StorageIRIImpl, IsEqualByTheCodeUnitsOfTheText)
{
    Bare const one(u"s:/a", u"/x");
    EXPECT_TRUE(one.equals(one));
    EXPECT_TRUE(one.equals(Bare(u"s:/a", u"/y")));
    EXPECT_FALSE(one.equals(Bare(u"s:/A", u"/x")));
    EXPECT_FALSE(one.equals(Bare(u"s:/a ", u"/x")));
    EXPECT_FALSE(one.equals(Bare(u"s:/", u"/x")));
    EXPECT_FALSE(Bare(u"\u00E9", u"").equals(Bare(u"e\u0301", u"")));
}

TEST(StorageIRIImpl, IsOrderedByTheCodeUnitsOfTheText)
{
    Bare const one(u"s:/a", u"/x");
    EXPECT_FALSE(one.less(one));
    EXPECT_FALSE(one.less(Bare(u"s:/a", u"/z")));
    EXPECT_TRUE(one.less(Bare(u"s:/b", u"/a")));
    EXPECT_TRUE(one.less(Bare(u"s:/aa", u"/a")));
    EXPECT_FALSE(Bare(u"s:/aa", u"").less(one));
    EXPECT_TRUE(Bare(u"s:/Z", u"").less(one));
    // By code unit a surrogate comes before U+FFFF.
    EXPECT_TRUE(Bare(u"\U0001F600", u"").less(Bare(u"\uFFFF", u"")));
}

TEST(StorageIRIImpl, ResolvedPathHasNoDotSegments)
{
    EXPECT_EQ(resolved(u"/a/./b/../c"), u"/a/c");
    EXPECT_EQ(resolved(u"/a/b/"), u"/a/b");
    EXPECT_EQ(resolved(u"/a/b//"), u"/a/b/");
    EXPECT_EQ(resolved(u"/a/.."), u"/");
    EXPECT_EQ(resolved(u"/../../a"), u"/a");
    EXPECT_EQ(resolved(u"/a/."), u"/a");
    EXPECT_EQ(resolved(u"/a b/%2E%2E/:c?#"), u"/a b/%2E%2E/:c?#");
    EXPECT_EQ(resolved(u"//a/b"), u"//a/b");
    EXPECT_EQ(resolved(u"/..."), u"/...");
}

TEST(StorageIRIImpl, ResolvedPathOfALeadingDoubleSlashHasNoDotSegmentsEither)
{
    EXPECT_EQ(resolved(u"//../a"), u"/a");
    EXPECT_EQ(resolved(u"//./a"), u"//a");
    EXPECT_EQ(resolved(u"//a/../b"), u"//b");
    EXPECT_EQ(resolved(u"//a/.."), u"/");
    EXPECT_EQ(resolved(u"/a/..//b"), u"//b");
}

TEST(StorageIRIImpl, ResolvedPathOfTheShortestPathsIsThePath)
{
    EXPECT_EQ(resolved(u"/"), u"/");
    EXPECT_EQ(resolved(u""), u"");
    EXPECT_EQ(resolved(u"a"), u"a");
}

TEST(StorageIRIImpl, ResolvedPathOfARelativePathStandsBelowTheRoot)
{
    EXPECT_EQ(resolved(u"ab"), u"/ab");
    EXPECT_EQ(resolved(u".."), u"/");
    EXPECT_EQ(resolved(u"a/../b:c"), u"/b:c");
}

TEST(StorageIRIImpl, ResolvedPathIsComputedOnce)
{
    Bare const one(u"", u"/a/..");
    std::u16string const* const first = &one.getResolvedPath();
    int const asked = one.pathsAsked;
    EXPECT_EQ(&one.getResolvedPath(), first);
    EXPECT_EQ(one.pathsAsked, asked);
}

} // namespace
} // namespace foundation::storage::provider::detail
