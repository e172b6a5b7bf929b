// What a location computes itself is the same for every kind of implementation.

#include <storage/provider/StorageIRI.hpp>

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>

#include <tests/support/locationWithText.hpp>
#include <tests/support/thrown.hpp>

namespace foundation::storage::provider {
namespace {

using fl::filesystem::upath;
using tests::support::textOf;

StorageIRI filePath(std::u16string const& path)
{
    return StorageIRI(u"s", upath(path));
}

StorageIRI inContainer(std::u16string const& path)
{
    return StorageIRI(u"zip", StorageIRI(u"s:/x.zip"), path);
}

/// Equal to everything, and before everything.
class Overbearing : public tests::support::TextOnlyImpl
{
public:
    using TextOnlyImpl::TextOnlyImpl;

    bool equals(StorageIRIImpl const&) const override { return true; }
    bool less(StorageIRIImpl const&) const override { return true; }
};

TEST(StorageIRIKinds, ParsedTextIsInAContainerExactlyWhenItIsOpaque)
{
    for (std::u16string const text : {u"zip:s:/x.zip!/d", u"zip:zip:s:/x.zip!/y.zip!/d"}) {
        EXPECT_TRUE(StorageIRI(text).isOpaque());
        EXPECT_TRUE(StorageIRI(network::IRI(text)).hasInnerIRI());
    }
    for (std::u16string const text : {u"s:/x.zip!/d", u"s://h/x.zip!/d", u"zip:///s:/x.zip!/d"}) {
        EXPECT_FALSE(StorageIRI(text).isOpaque());
        EXPECT_FALSE(StorageIRI(network::IRI(text)).hasInnerIRI());
    }
}

TEST(StorageIRIKinds, TheLeftOperandCompares)
{
    StorageIRI const left{std::shared_ptr<detail::StorageIRIImpl>(std::make_shared<Overbearing>(u"z"))};
    StorageIRI const right = tests::support::locationWithText(u"a");
    EXPECT_TRUE(left == right);
    EXPECT_FALSE(left != right);
    EXPECT_TRUE(left < right);
    EXPECT_FALSE(right == left);
    EXPECT_TRUE(right != left);
    EXPECT_TRUE(right < left);
    EXPECT_FALSE(tests::support::locationWithText(u"zz") < left);
}

TEST(StorageIRIKinds, ChildIsOfTheKindOfItsBase)
{
    EXPECT_EQ(StorageIRI(filePath(u"/a"), u"b c/").toString(), u"s:///a/b%20c");
    EXPECT_EQ(StorageIRI(filePath(u"/a"), u"///x").toUPath(), upath(u"/x"));
    EXPECT_EQ(StorageIRI(filePath(u"/a"), u"/").toString(), u"s:///");
    EXPECT_EQ(StorageIRI(inContainer(u"/a"), u"b c/").toString(), u"zip:s:/x.zip!/a/b%20c");
    EXPECT_EQ(StorageIRI(inContainer(u"/a"), u"///x").toString(), u"zip:s:/x.zip!/x");
    EXPECT_EQ(StorageIRI(inContainer(u"/a"), u"/").toString(), u"zip:s:/x.zip!/");
    EXPECT_EQ(StorageIRI(inContainer(u"/a"), u"").getPath(), u"/a");
}

TEST(StorageIRIKinds, ResolvedFormIsOfTheSameKind)
{
    EXPECT_EQ(filePath(u"/a/./b/../c").getResolvedIRI().toUPath(), upath(u"/a/c"));
    EXPECT_EQ(filePath(u"/").getResolvedIRI(), filePath(u"/"));
    EXPECT_EQ(inContainer(u"/a/./b/../c").getResolvedIRI().toString(), u"zip:s:/x.zip!/a/c");
    EXPECT_EQ(inContainer(u"/").getResolvedIRI(), inContainer(u"/"));
}

TEST(StorageIRIKinds, AncestryLooksAtNoInnerLocationAndNoKind)
{
    StorageIRI const elsewhere(u"zip", StorageIRI(u"t://h/y.zip"), u"/a/b/c");
    EXPECT_TRUE(inContainer(u"/a").isAncestorOf(elsewhere));
    EXPECT_TRUE(inContainer(u"/").isAncestorOf(elsewhere));
    EXPECT_FALSE(elsewhere.isAncestorOf(elsewhere));
    EXPECT_FALSE(StorageIRI(u"s:/x.zip").isAncestorOf(inContainer(u"/x.zip/a")));
    EXPECT_TRUE(filePath(u"/a").isAncestorOf(StorageIRI(u"s://h/a/b")));
    EXPECT_TRUE(StorageIRI(u"s://h/a").isAncestorOf(filePath(u"/a/b")));
}

TEST(StorageIRIKinds, RelativePathLeadsFromTheFolder)
{
    EXPECT_EQ(filePath(u"/a/b c").makePathRelativeTo(filePath(u"/a")), u"b c");
    EXPECT_EQ(inContainer(u"/a!/%41").makePathRelativeTo(inContainer(u"/")), u"a!/%41");
    EXPECT_EQ(inContainer(u"/a").makePathRelativeTo(inContainer(u"/b/c")), u"../../a");
}

TEST(StorageIRIKinds, RelativePathNeedsOneInnerLocation)
{
    StorageIRI const base(u"zip:s:/y.zip!/b");
    EXPECT_EQ(textOf<std::runtime_error>([&] { static_cast<void>(inContainer(u"/a").makePathRelativeTo(base)); }),
              "Can not make relative path between zip:s:/x.zip!/a and zip:s:/y.zip!/b as they don't have a common "
              "root.");
}

} // namespace
} // namespace foundation::storage::provider
