#include <storage/provider/ByteStreamOpenOptions.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <ostream>
#include <string>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

template <class Enumeration>
constexpr bool is32BitScoped =
    std::is_same_v<std::underlying_type_t<Enumeration>, std::int32_t> && !std::is_convertible_v<Enumeration, int>;
template <class Value>
using Printer = std::ostream& (*)(std::ostream&, Value const&);

static_assert(is32BitScoped<ByteStreamAccess> && is32BitScoped<ByteStreamAppend>);
static_assert(is32BitScoped<ByteStreamCreate> && is32BitScoped<ByteStreamTruncate>);
static_assert(isDeclared<static_cast<Printer<ByteStreamAccess>>(&operator<<)>);
static_assert(isDeclared<static_cast<Printer<ByteStreamAppend>>(&operator<<)>);
static_assert(isDeclared<static_cast<Printer<ByteStreamCreate>>(&operator<<)>);
static_assert(isDeclared<static_cast<Printer<ByteStreamTruncate>>(&operator<<)>);
static_assert(isDeclared<static_cast<Printer<ByteStreamOpenOptions>>(&operator<<)>);

static_assert(std::is_aggregate_v<ByteStreamOpenOptions>);
static_assert(sizeof(ByteStreamOpenOptions) == 4 * sizeof(std::int32_t));
static_assert(offsetof(ByteStreamOpenOptions, access) == 0);
static_assert(offsetof(ByteStreamOpenOptions, create) == 4);
static_assert(offsetof(ByteStreamOpenOptions, truncate) == 8);
static_assert(offsetof(ByteStreamOpenOptions, append) == 12);

template <class Enumeration>
void expectTwoNames(Enumeration zero, Enumeration one, char const* zeroText, char const* otherText)
{
    EXPECT_EQ(static_cast<int>(zero), 0);
    EXPECT_EQ(static_cast<int>(one), 1);
    EXPECT_EQ(printed(zero), zeroText);
    for (int const value : {1, 2, 7, -1})
        EXPECT_EQ(printed(static_cast<Enumeration>(value)), otherText) << value;
    EXPECT_TRUE(answersItsStream(one));
    EXPECT_EQ(printedInField(zero, static_cast<int>(std::string(zeroText).size()) + 2), std::string("..") + zeroText);
}

TEST(ByteStreamAccess, PrintsTheSecondNameForEveryValueButZero)
{
    expectTwoNames(ByteStreamAccess::WriteOnly, ByteStreamAccess::ReadWrite, "ByteStreamAccess::WriteOnly",
                   "ByteStreamAccess::ReadWrite");
}

TEST(ByteStreamAppend, PrintsTheSecondNameForEveryValueButZero)
{
    expectTwoNames(ByteStreamAppend::Append, ByteStreamAppend::Overwrite, "ByteStreamAppend::Append",
                   "ByteStreamAppend::Overwrite");
}

TEST(ByteStreamCreate, PrintsTheSecondNameForEveryValueButZero)
{
    expectTwoNames(ByteStreamCreate::Create, ByteStreamCreate::NeverCreate, "ByteStreamCreate::Create",
                   "ByteStreamCreate::NeverCreate");
}

TEST(ByteStreamTruncate, PrintsTheSecondNameForEveryValueButZero)
{
    expectTwoNames(ByteStreamTruncate::TruncateExisting, ByteStreamTruncate::PreserveExisting,
                   "ByteStreamTruncate::TruncateExisting", "ByteStreamTruncate::PreserveExisting");
}

TEST(ByteStreamOpenOptions, AllFieldsAreZeroUnlessGiven)
{
    ByteStreamOpenOptions const options;
    EXPECT_EQ(options.access, ByteStreamAccess::WriteOnly);
    EXPECT_EQ(options.create, ByteStreamCreate::Create);
    EXPECT_EQ(options.truncate, ByteStreamTruncate::TruncateExisting);
    EXPECT_EQ(options.append, ByteStreamAppend::Append);
}

TEST(ByteStreamOpenOptions, PrintsItsFieldsInOrder)
{
    EXPECT_EQ(printed(ByteStreamOpenOptions{}),
              "ByteStreamOpenOptions: {ByteStreamAccess::WriteOnly, ByteStreamCreate::Create, "
              "ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Append}");
    EXPECT_EQ(printed(ByteStreamOpenOptions{ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate,
                                            ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite}),
              "ByteStreamOpenOptions: {ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate, "
              "ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite}");
}

TEST(ByteStreamOpenOptions, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(ByteStreamOpenOptions{}));
}

} // namespace
} // namespace foundation::storage::provider
