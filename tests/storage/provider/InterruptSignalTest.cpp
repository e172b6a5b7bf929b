#include <storage/provider/InterruptSignal.hpp>

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

static_assert(std::is_same_v<std::underlying_type_t<InterruptSignal>, std::int32_t>);
static_assert(!std::is_convertible_v<InterruptSignal, int>);
static_assert(static_cast<int>(InterruptSignal::Continue) == 0);
static_assert(static_cast<int>(InterruptSignal::Abort) == 1);
static_assert(isDeclared<static_cast<std::ostream& (*)(std::ostream&, InterruptSignal const&)>(&operator<<)>);

TEST(InterruptSignal, PrintsTypeAndEnumerator)
{
    EXPECT_EQ(printed(InterruptSignal::Continue), "InterruptSignal::Continue");
    EXPECT_EQ(printed(InterruptSignal::Abort), "InterruptSignal::Abort");
}

TEST(InterruptSignal, PrintsNothingForAnyOtherValueAndTheStreamStaysGood)
{
    for (int const value : {-1, 2, 3, 1000}) {
        std::ostringstream stream;
        stream << static_cast<InterruptSignal>(value) << "|";
        EXPECT_EQ(stream.str(), "|") << value;
        EXPECT_TRUE(stream.good()) << value;
    }
}

TEST(InterruptSignal, PrinterAnswersItsStream)
{
    EXPECT_TRUE(answersItsStream(InterruptSignal::Continue));
    EXPECT_TRUE(answersItsStream(static_cast<InterruptSignal>(2)));
}

TEST(InterruptSignal, IsPrintedAsOneString)
{
    std::string const text = "InterruptSignal::Continue";
    EXPECT_EQ(printedInField(InterruptSignal::Continue, static_cast<int>(text.size()) + 2), ".." + text);
}

} // namespace
} // namespace foundation::storage::provider
