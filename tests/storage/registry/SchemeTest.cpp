#include <storage/registry/Scheme.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::registry {
namespace {

using namespace tests::support;

TEST(Scheme, KindsArePrintedByName)
{
    EXPECT_EQ(printed(SchemeKind::Physical), "SchemeKind::Physical");
    EXPECT_EQ(printed(SchemeKind::Container), "SchemeKind::Container");
    EXPECT_EQ(printed(static_cast<SchemeKind>(2)), "Unhandled SchemeKind");
    EXPECT_TRUE(answersItsStream(SchemeKind::Physical));
}

TEST(Scheme, EqualOnesHaveOneNameAndKind)
{
    Scheme const file{u"file", SchemeKind::Physical};
    EXPECT_EQ(file, (Scheme{u"file", SchemeKind::Physical}));
    EXPECT_NE(file, (Scheme{u"file", SchemeKind::Container}));
    EXPECT_NE(file, (Scheme{u"mem", SchemeKind::Physical}));
}

} // namespace
} // namespace foundation::storage::registry
