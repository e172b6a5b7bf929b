// What is computed once is read without a lock from then on.

#include <storage/provider/StorageIRI.hpp>

#include <storage/provider/FileAttributes.hpp>
#include <storage/provider/detail/Lazy.hpp>
#include <storage/provider/detail/LazyField.hpp>
#include <tests/support/locks.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <string>

namespace foundation::storage::provider {
namespace {

using tests::support::locksOf;
using Flag = detail::Lazy<bool>;

TEST(Lock, DeferredFlagTakesOneUntilItsAnswerIsKnown)
{
    Flag flag(Flag::Value(std::function<bool()>([] { return true; })));
    EXPECT_EQ(locksOf([&flag] { EXPECT_TRUE(flag()); }), 1u);
    EXPECT_EQ(locksOf([&flag] { EXPECT_TRUE(flag()); }), 0u);
}

TEST(Lock, CopyOfAKnownFlagNeedsNone)
{
    Flag const original{Flag::Value(true)};
    Flag copy(original);
    EXPECT_EQ(locksOf([&copy] { EXPECT_TRUE(copy()); }), 0u);
}

TEST(Lock, AttributesTakeOneUntilWritabilityIsKnown)
{
    FileAttributes const attributes(0, boost::posix_time::ptime(), [] { return false; });
    EXPECT_EQ(locksOf([&attributes] { EXPECT_FALSE(attributes.isWritable()); }), 1u);
    EXPECT_EQ(locksOf([&attributes] { EXPECT_FALSE(attributes.isWritable()); }), 0u);
}

TEST(Lock, LazyFieldTakesOneUntilItsValueIsPresent)
{
    detail::LazyField<int> const field(std::function<int()>([] { return 1; }));
    EXPECT_EQ(locksOf([&field] { EXPECT_EQ(field.get(), 1); }), 1u);
    EXPECT_EQ(locksOf([&field] { EXPECT_EQ(field.get(), 1); }), 0u);
    EXPECT_EQ(locksOf([&field] { EXPECT_TRUE(field.isPresent()); }), 0u);
}

// Each field that is computed takes its lock: none is computed here.
TEST(Lock, MakingALocationNeedsNone)
{
    StorageIRI const base(u"s://h/a");
    static_cast<void>(base.getParent());
    EXPECT_EQ(locksOf([] { StorageIRI(u"s://h/a/../b/"); }), 0u);
    EXPECT_EQ(locksOf([] { StorageIRI(u"s", fl::filesystem::upath(u"/a")); }), 0u);
    EXPECT_EQ(locksOf([] { StorageIRI(u"z:s://h/a!/b"); }), 0u);
    EXPECT_EQ(locksOf([&base] { StorageIRI(base, u"b"); }), 0u);
    EXPECT_EQ(locksOf([&base] { StorageIRI(u"z", base, u"/b"); }), 0u);
}

TEST(Lock, ChildIsNotParsedBeforeItIsNeeded)
{
    StorageIRI const child(StorageIRI(u"s://h/a"), u"b");
    EXPECT_EQ(locksOf([&child] { StorageIRI(child, u"/c"); }), 0u);
    // The IRI and the text; the record is there from the start.
    EXPECT_EQ(locksOf([&child] { static_cast<void>(child.toString()); }), 2u);
}

TEST(Lock, RepeatedQueryOfALocationNeedsNone)
{
    for (StorageIRI const& location : {StorageIRI(u"s://h/a/../b"), StorageIRI(u"s", fl::filesystem::upath(u"/a/../b")),
                                       StorageIRI(u"z:s://h/a!/b"), StorageIRI(u"z", StorageIRI(u"s://h/a"), u"/b")})
    {
        auto const askAll = [&location] {
            static_cast<void>(location.getPath());
            static_cast<void>(location.getName());
            static_cast<void>(location.toString());
            static_cast<void>(location.getResolvedPath());
            static_cast<void>(location.getParent());
            static_cast<void>(location.hashValue());
            static_cast<void>(location == location);
        };
        EXPECT_GT(locksOf(askAll), 0u) << location;
        EXPECT_EQ(locksOf(askAll), 0u) << location;
    }
}

} // namespace
} // namespace foundation::storage::provider
