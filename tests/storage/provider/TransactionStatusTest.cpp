#include <storage/provider/TransactionStatus.hpp>

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

static_assert(std::is_same_v<std::underlying_type_t<TransactionStatus>, std::int32_t>);
static_assert(!std::is_convertible_v<TransactionStatus, int>);
static_assert(static_cast<int>(TransactionStatus::Completed) == 0);
static_assert(static_cast<int>(TransactionStatus::Aborted) == 1);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, TransactionStatus const&)>(&operator<<)>);

TEST(TransactionStatus, PrintsTypeAndEnumerator)
{
    EXPECT_EQ(printed(TransactionStatus::Completed), "TransactionStatus::Completed");
    EXPECT_EQ(printed(TransactionStatus::Aborted), "TransactionStatus::Aborted");
}

TEST(TransactionStatus, PrintsNothingForAnyOtherValueAndTheStreamStaysGood)
{
    for (int const value : {-1, 2, 3, 1000}) {
        std::ostringstream stream;
        stream << static_cast<TransactionStatus>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(TransactionStatus, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(TransactionStatus::Completed));
    EXPECT_TRUE(answersItsStream(static_cast<TransactionStatus>(2)));
}

TEST(TransactionStatus, IsPrintedAsOneString)
{
    std::string const text = "TransactionStatus::Completed";
    EXPECT_EQ(printedInField(TransactionStatus::Completed, static_cast<int>(text.size()) + 2), ".." + text);
}

} // namespace
} // namespace foundation::storage::provider
