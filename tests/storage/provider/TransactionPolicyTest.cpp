#include <storage/provider/TransactionPolicy.hpp>

#include <tests/support/printed.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <ostream>
#include <sstream>
#include <string>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

static_assert(std::is_same_v<std::underlying_type_t<TransactionPolicy>, std::int32_t>);
static_assert(!std::is_convertible_v<TransactionPolicy, int>);
static_assert(static_cast<int>(TransactionPolicy::NonAtomic) == 0);
static_assert(static_cast<int>(TransactionPolicy::Atomic) == 1);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, TransactionPolicy const&)>(&operator<<)>);

TEST(TransactionPolicy, PrintsTypeAndEnumerator)
{
    EXPECT_EQ(printed(TransactionPolicy::NonAtomic), "TransactionPolicy::NonAtomic");
    EXPECT_EQ(printed(TransactionPolicy::Atomic), "TransactionPolicy::Atomic");
}

TEST(TransactionPolicy, PrintsNothingForAnyOtherValueAndTheStreamStaysGood)
{
    for (int const value : {-1, 2, 3, 1000}) {
        std::ostringstream stream;
        stream << static_cast<TransactionPolicy>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(TransactionPolicy, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(TransactionPolicy::NonAtomic));
    EXPECT_TRUE(answersItsStream(static_cast<TransactionPolicy>(2)));
}

TEST(TransactionPolicy, IsPrintedAsOneString)
{
    std::string const text = "TransactionPolicy::NonAtomic";
    EXPECT_EQ(printedInField(TransactionPolicy::NonAtomic, static_cast<int>(text.size()) + 2), ".." + text);
}

} // namespace
} // namespace foundation::storage::provider
